# Windows build (mingw-w64, static): vantorel.exe and the tests that need the real system, run
# under Wine through CTest.
set(VANTOREL_WINEPREFIX ${CMAKE_BINARY_DIR}/wineprefix)
set(CMAKE_CROSSCOMPILING_EMULATOR
    env WINEPREFIX=${VANTOREL_WINEPREFIX} WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml= /usr/bin/wine)

add_library(vantorel_win32 STATIC
    src/platform/win32/files_win32.cpp
    src/platform/win32/registry_win32.cpp
)
target_link_libraries(vantorel_win32 PUBLIC vantorel_core advapi32 shlwapi)
target_compile_definitions(vantorel_win32 PUBLIC WIN32_LEAN_AND_MEAN NOMINMAX)

add_executable(vantorel WIN32 src/platform/win32/main_win32.cpp)
target_link_libraries(vantorel PRIVATE vantorel_win32)

# GoogleTest built for the target.
set(BUILD_GMOCK OFF CACHE BOOL "" FORCE)
set(INSTALL_GTEST OFF CACHE BOOL "" FORCE)
add_subdirectory(/usr/src/googletest ${CMAKE_BINARY_DIR}/_gtest EXCLUDE_FROM_ALL)

# Wine services inherit ctest's output pipe and stall it: a fixture starts a persistent wineserver
# (and the prefix) once, quietly, and stops it at the end.
# One shell word list (a CMake list would put ";" between the words and split the sh -c command,
# leaving wineserver on the default prefix).
set(WINE_ENV "WINEPREFIX=${VANTOREL_WINEPREFIX} WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml=")
# Wine's desktop process belongs to the wineserver, so the wineserver starts on a private Xvfb
# for the tests that need real windows.
set(VANTOREL_XVFB_STATE ${CMAKE_BINARY_DIR}/xvfb.state)
add_test(NAME xvfb_start COMMAND ${CMAKE_SOURCE_DIR}/scripts/xvfb-fixture start ${VANTOREL_XVFB_STATE})
set_tests_properties(xvfb_start PROPERTIES FIXTURES_SETUP xvfb)
add_test(NAME xvfb_stop COMMAND ${CMAKE_SOURCE_DIR}/scripts/xvfb-fixture stop ${VANTOREL_XVFB_STATE})
set_tests_properties(xvfb_stop PROPERTIES FIXTURES_CLEANUP xvfb DEPENDS wine_stop)
set(WINE_DISPLAY "DISPLAY=$(cut -d' ' -f1 '${VANTOREL_XVFB_STATE}')")
add_test(NAME wine_start COMMAND sh -c
    "mkdir -p '${VANTOREL_WINEPREFIX}' && export ${WINE_DISPLAY} && env ${WINE_ENV} wineserver -p </dev/null >/dev/null 2>&1 && env ${WINE_ENV} wine wineboot </dev/null >/dev/null 2>&1")
set_tests_properties(wine_start PROPERTIES FIXTURES_SETUP wine FIXTURES_REQUIRED xvfb)
add_test(NAME wine_stop COMMAND sh -c "env ${WINE_ENV} wineserver -k </dev/null >/dev/null 2>&1; exit 0")
set_tests_properties(wine_stop PROPERTIES FIXTURES_CLEANUP wine)

function(vantorel_wine_test name)
    add_executable(${name} ${ARGN})
    target_link_libraries(${name} PRIVATE vantorel_win32 vantorel_fakes gtest_main)
    add_test(NAME ${name} COMMAND ${name} --gtest_brief=1)
    set_tests_properties(${name} PROPERTIES FIXTURES_REQUIRED wine TIMEOUT 300)
endfunction()

vantorel_wine_test(registry_win32_tests
    tests/contract/registry_contract.cpp
    tests/win32/registry_win32_test.cpp
)

# The push button: the GDI canvas and window class.
target_sources(vantorel_win32 PRIVATE
    src/platform/win32/gdi_canvas.cpp
    src/platform/win32/gdi_picture.cpp
    src/platform/win32/xpbutton_window.cpp
)
target_link_libraries(vantorel_win32 PUBLIC gdi32 user32)

add_executable(xpbutton_win32_tests tests/win32/xpbutton_win32_test.cpp)
target_link_libraries(xpbutton_win32_tests PRIVATE vantorel_win32 vantorel_fakes gtest_main)
add_test(NAME xpbutton_win32_tests COMMAND sh -c
    "export ${WINE_DISPLAY} && exec env ${WINE_ENV} wine '$<TARGET_FILE:xpbutton_win32_tests>' --gtest_brief=1")
set_tests_properties(xpbutton_win32_tests PROPERTIES FIXTURES_REQUIRED "wine;xvfb" TIMEOUT 300)

# The push button's visual test bench. A test runs it on the private Xvfb, saves the gallery as an
# image and a screenshot of the display under build/ (CI artifacts).
add_executable(xpbutton-gallery src/platform/win32/xpbutton_gallery_main.cpp)
target_link_libraries(xpbutton-gallery PRIVATE vantorel_win32)
set(VANTOREL_ARTIFACTS ${CMAKE_SOURCE_DIR}/build)
add_test(NAME xpbutton_gallery COMMAND sh -c
    "export ${WINE_DISPLAY} ${WINE_ENV} && '${CMAKE_SOURCE_DIR}/scripts/xpbutton-gallery-shot' '$<TARGET_FILE:xpbutton-gallery>' '${VANTOREL_ARTIFACTS}'")
set_tests_properties(xpbutton_gallery PROPERTIES FIXTURES_REQUIRED "wine;xvfb" TIMEOUT 300)
