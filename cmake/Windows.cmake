# Windows build (mingw-w64, static): vantorel.exe and the tests that need the real system, run
# under Wine through CTest.
set(VANTOREL_WINEPREFIX ${CMAKE_BINARY_DIR}/wineprefix)
# Test programs run in the build's scratch prefix, on the build's virtual display.
set(CMAKE_CROSSCOMPILING_EMULATOR sh ${CMAKE_SOURCE_DIR}/tests/win32/wine-exec ${CMAKE_BINARY_DIR})

add_library(vantorel_win32 STATIC
    src/platform/win32/connection_table_win32.cpp
    src/platform/win32/controls_win32.cpp
    src/platform/win32/file_system_win32.cpp
    src/platform/win32/files_win32.cpp
    src/platform/win32/http_transfer_win32.cpp
    src/platform/win32/picture_box_win32.cpp
    src/platform/win32/registry_win32.cpp
    src/platform/win32/shell_win32.cpp
    src/platform/win32/task_scheduler_win32.cpp
)
target_link_libraries(vantorel_win32 PUBLIC vantorel_core advapi32 shlwapi wininet iphlpapi shell32 user32 gdi32
    taskschd ole32 oleaut32)
target_compile_definitions(vantorel_win32 PUBLIC WIN32_LEAN_AND_MEAN NOMINMAX)

# Icons drawn at build time, the manifest and the version resource.
enable_language(RC)
set(VANTOREL_ICONS ${CMAKE_BINARY_DIR}/icons/padlock.ico ${CMAKE_BINARY_DIR}/icons/bulb-dark.ico
    ${CMAKE_BINARY_DIR}/icons/bulb-lit.ico)
add_custom_command(OUTPUT ${VANTOREL_ICONS}
    COMMAND /usr/bin/python3 ${CMAKE_SOURCE_DIR}/scripts/make-icons ${CMAKE_BINARY_DIR}/icons
    DEPENDS ${CMAKE_SOURCE_DIR}/scripts/make-icons
    COMMENT "Drawing the icons")
configure_file(resources/vantorel.rc.in ${CMAKE_BINARY_DIR}/vantorel.rc @ONLY)
set_source_files_properties(${CMAKE_BINARY_DIR}/vantorel.rc PROPERTIES
    OBJECT_DEPENDS "${VANTOREL_ICONS};${CMAKE_SOURCE_DIR}/resources/vantorel.manifest")
set(CMAKE_RC_FLAGS "${CMAKE_RC_FLAGS} -I${CMAKE_BINARY_DIR}/icons -I${CMAKE_SOURCE_DIR}/src")

# The top floor: the Win32 classes of the two windows; WinMain builds the object graph on them.
add_library(vantorel_app STATIC
    src/app/main_window.cpp
    src/app/options_window.cpp
)
target_link_libraries(vantorel_app PUBLIC vantorel_win32)

add_executable(vantorel WIN32 src/app/main.cpp ${CMAKE_BINARY_DIR}/vantorel.rc)
target_link_libraries(vantorel PRIVATE vantorel_app)

# Reads windows from inside a Wine desktop for the end-to-end tests.
add_executable(vtprobe tests/e2e/vtprobe.cpp)
target_link_libraries(vtprobe PRIVATE user32)

# GoogleTest built for the target.
set(BUILD_GMOCK OFF CACHE BOOL "" FORCE)
set(INSTALL_GTEST OFF CACHE BOOL "" FORCE)
add_subdirectory(/usr/src/googletest ${CMAKE_BINARY_DIR}/_gtest EXCLUDE_FROM_ALL)

# Wine services inherit ctest's output pipe and stall it: a fixture starts a virtual display and a
# persistent wineserver (and the prefix) once, quietly, and stops both at the end. A server left
# running for the prefix (an interrupted run) is simply used.
# One text for `sh -c`: a CMake list would reach the shell joined with ";", which ends the `env`
# command at the first variable and leaves wineserver on the default prefix.
set(WINE_ENV "WINEPREFIX='${VANTOREL_WINEPREFIX}' WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml=")
add_test(NAME wine_start COMMAND sh -c
    "sh '${CMAKE_SOURCE_DIR}/tests/win32/xvfb-fixture' start '${CMAKE_BINARY_DIR}' && . '${CMAKE_BINARY_DIR}/xvfb.env' && mkdir -p '${VANTOREL_WINEPREFIX}' && { env ${WINE_ENV} wineserver -p </dev/null >/dev/null 2>&1 || true; } && env ${WINE_ENV} wine wineboot </dev/null >/dev/null 2>&1")
set_tests_properties(wine_start PROPERTIES FIXTURES_SETUP wine)
add_test(NAME wine_stop COMMAND sh -c
    "env ${WINE_ENV} wineserver -k </dev/null >/dev/null 2>&1; sh '${CMAKE_SOURCE_DIR}/tests/win32/xvfb-fixture' stop '${CMAKE_BINARY_DIR}'")
set_tests_properties(wine_stop PROPERTIES FIXTURES_CLEANUP wine)

function(vantorel_wine_test name)
    add_executable(${name} ${ARGN})
    target_link_libraries(${name} PRIVATE vantorel_app vantorel_fakes gtest_main)
    add_test(NAME ${name} COMMAND ${name} --gtest_brief=1)
    set_tests_properties(${name} PROPERTIES FIXTURES_REQUIRED wine TIMEOUT 300)
endfunction()

vantorel_wine_test(registry_win32_tests tests/win32/registry_win32_test.cpp)

# The push button: the GDI canvas and window class.
target_sources(vantorel_win32 PRIVATE
    src/platform/win32/gdi_canvas.cpp
    src/platform/win32/gdi_picture.cpp
    src/controls/xpbutton/xpbutton_window_win32.cpp
)

vantorel_wine_test(xpbutton_win32_tests tests/win32/xpbutton_win32_test.cpp)

# The push button's visual test bench. A test runs it on the private Xvfb, saves the gallery as an
# image and a screenshot of the display under build/ (CI artifacts).
add_executable(xpbutton-gallery tools/xpbutton_gallery.cpp)
target_link_libraries(xpbutton-gallery PRIVATE vantorel_win32)
set(VANTOREL_ARTIFACTS ${CMAKE_SOURCE_DIR}/build)
add_test(NAME xpbutton_gallery COMMAND sh -c
    ". '${CMAKE_BINARY_DIR}/xvfb.env' && export ${WINE_ENV} && '${CMAKE_SOURCE_DIR}/scripts/xpbutton-gallery-shot' '$<TARGET_FILE:xpbutton-gallery>' '${VANTOREL_ARTIFACTS}'")
set_tests_properties(xpbutton_gallery PROPERTIES FIXTURES_REQUIRED wine TIMEOUT 300)

# The downloader with the real WinINet transfer against the scriptable HTTP server on 127.0.0.1, which
# a fixture starts in the background (its port chosen by the system) and stops by its PID.
set(VANTOREL_HTTP_DIR ${CMAKE_BINARY_DIR}/http-server)
add_test(NAME http_server_start COMMAND ${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh start ${VANTOREL_HTTP_DIR}
    /usr/bin/python3 ${CMAKE_SOURCE_DIR}/tests/servers/http_test_server.py)
set_tests_properties(http_server_start PROPERTIES FIXTURES_SETUP http_server)
add_test(NAME http_server_stop COMMAND ${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh stop ${VANTOREL_HTTP_DIR})
set_tests_properties(http_server_stop PROPERTIES FIXTURES_CLEANUP http_server)

# End-to-end: the real vantorel.exe driven under Wine on a virtual display of its own.
add_test(NAME e2e COMMAND /usr/bin/python3 ${CMAKE_SOURCE_DIR}/tests/e2e/e2e_tests.py ${CMAKE_BINARY_DIR})
set_tests_properties(e2e PROPERTIES TIMEOUT 1200 FIXTURES_REQUIRED http_server
    ENVIRONMENT "VANTOREL_HTTP_PORT_FILE=${VANTOREL_HTTP_DIR}/server.port;http_proxy=;https_proxy=;no_proxy=127.0.0.1")

# Two https servers: one with a certificate from a test authority, one self-signed.
set(VANTOREL_HTTPS_DIR ${CMAKE_BINARY_DIR}/https-servers)
add_test(NAME https_servers_start COMMAND sh -c "\
    '${CMAKE_SOURCE_DIR}/tests/servers/make_test_certificates.sh' '${VANTOREL_HTTPS_DIR}/certs' && \
    '${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh' start '${VANTOREL_HTTPS_DIR}/trusted' /usr/bin/python3 \
        '${CMAKE_SOURCE_DIR}/tests/servers/http_test_server.py' \
        --tls '${VANTOREL_HTTPS_DIR}/certs/server.pem' '${VANTOREL_HTTPS_DIR}/certs/server.key' && \
    '${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh' start '${VANTOREL_HTTPS_DIR}/untrusted' /usr/bin/python3 \
        '${CMAKE_SOURCE_DIR}/tests/servers/http_test_server.py' \
        --tls '${VANTOREL_HTTPS_DIR}/certs/untrusted.pem' '${VANTOREL_HTTPS_DIR}/certs/untrusted.key'")
set_tests_properties(https_servers_start PROPERTIES FIXTURES_SETUP https_servers)
add_test(NAME https_servers_stop COMMAND sh -c "\
    '${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh' stop '${VANTOREL_HTTPS_DIR}/trusted'; \
    '${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh' stop '${VANTOREL_HTTPS_DIR}/untrusted'")
set_tests_properties(https_servers_stop PROPERTIES FIXTURES_CLEANUP https_servers)

vantorel_wine_test(download_win32_tests tests/win32/download_win32_test.cpp)
target_link_libraries(download_win32_tests PRIVATE ws2_32 crypt32)
set_tests_properties(download_win32_tests PROPERTIES FIXTURES_REQUIRED "wine;http_server;https_servers"
    ENVIRONMENT "VANTOREL_HTTP_PORT_FILE=${VANTOREL_HTTP_DIR}/server.port;VANTOREL_HTTPS_DIR=${VANTOREL_HTTPS_DIR};http_proxy=;https_proxy=;no_proxy=127.0.0.1")

# The download benchmark (bench/run-download-bench runs it against the loopback server); not a test.
add_executable(download_bench_win32 bench/download_bench_win32.cpp)
target_link_libraries(download_bench_win32 PRIVATE vantorel_win32)

# The update check against nginx serving the update files with the configuration in deploy/.
set(VANTOREL_NGINX_DIR ${CMAKE_BINARY_DIR}/nginx)
add_test(NAME nginx_start COMMAND ${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh start ${VANTOREL_NGINX_DIR} nginx)
set_tests_properties(nginx_start PROPERTIES FIXTURES_SETUP nginx)
add_test(NAME nginx_stop COMMAND ${CMAKE_SOURCE_DIR}/tests/servers/server_fixture.sh stop ${VANTOREL_NGINX_DIR})
set_tests_properties(nginx_stop PROPERTIES FIXTURES_CLEANUP nginx)

# The real options window, and its updates panel against nginx.
vantorel_wine_test(options_updates_win32_tests tests/win32/options_updates_win32_test.cpp)
set_tests_properties(options_updates_win32_tests PROPERTIES FIXTURES_REQUIRED "wine;nginx"
    ENVIRONMENT "VANTOREL_NGINX_DIR=${VANTOREL_NGINX_DIR};http_proxy=;https_proxy=;no_proxy=127.0.0.1"
    RESOURCE_LOCK nginx_www)

# The per-row yield's cost, run by hand under Wine (not a test).
add_executable(pump_bench bench/win32/pump_bench.cpp)
target_link_libraries(pump_bench PRIVATE vantorel_win32)

# The main window with the program's own resources (icons, manifest, version) linked in.
vantorel_wine_test(main_window_win32_tests tests/win32/main_window_win32_test.cpp ${CMAKE_BINARY_DIR}/vantorel.rc)
target_link_libraries(main_window_win32_tests PRIVATE version)

# The setup program VTSetup.exe (NSIS) and the release files beside it in release/: what
# deploy/publish-release puts on the update server ("mainver" from the project version, which also
# makes the program's version resource; the shipped definitions and their "defver").
find_program(MAKENSIS makensis)
if(MAKENSIS)
    set(VANTOREL_RELEASE ${CMAKE_BINARY_DIR}/release)
    configure_file(data/sw2.def ${VANTOREL_RELEASE}/sw2.def COPYONLY)
    configure_file(data/defver ${VANTOREL_RELEASE}/defver COPYONLY)
    file(CONFIGURE OUTPUT ${VANTOREL_RELEASE}/mainver CONTENT "${PROJECT_VERSION_MAJOR}.${PROJECT_VERSION_MINOR}\n")
    add_custom_command(OUTPUT ${VANTOREL_RELEASE}/VTSetup.exe
        COMMAND ${MAKENSIS} -V2 -DVERSION_MAJOR=${PROJECT_VERSION_MAJOR} -DVERSION_MINOR=${PROJECT_VERSION_MINOR}
            -DEXE=$<TARGET_FILE:vantorel> -DDEFINITIONS=${VANTOREL_RELEASE}/sw2.def -DDEFVER=${VANTOREL_RELEASE}/defver
            -DICON=${CMAKE_BINARY_DIR}/icons/padlock.ico -DOUTFILE=${VANTOREL_RELEASE}/VTSetup.exe
            ${CMAKE_SOURCE_DIR}/installer/vantorel.nsi
        DEPENDS vantorel ${CMAKE_SOURCE_DIR}/installer/vantorel.nsi ${VANTOREL_RELEASE}/sw2.def ${VANTOREL_RELEASE}/defver
            ${CMAKE_BINARY_DIR}/icons/padlock.ico
        COMMENT "Making the setup program VTSetup.exe")
    add_custom_target(VTSetup ALL DEPENDS ${VANTOREL_RELEASE}/VTSetup.exe)

    # Install, upgrade and uninstall in a fresh Wine prefix; publishing a release.
    add_test(NAME installer COMMAND /usr/bin/python3 ${CMAKE_SOURCE_DIR}/tests/e2e/installer_tests.py ${CMAKE_BINARY_DIR})
    set_tests_properties(installer PROPERTIES TIMEOUT 600)
else()
    message(WARNING "makensis not found (Debian package nsis): VTSetup.exe and its test are left out")
endif()
