# Windows build (mingw-w64, static): vantorel.exe and the tests that need the real system, run
# under Wine through CTest.
set(VANTOREL_WINEPREFIX ${CMAKE_BINARY_DIR}/wineprefix)
set(CMAKE_CROSSCOMPILING_EMULATOR
    env WINEPREFIX=${VANTOREL_WINEPREFIX} WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml= /usr/bin/wine)

add_library(vantorel_win32 STATIC
    src/platform/win32/connection_table_win32.cpp
    src/platform/win32/files_win32.cpp
    src/platform/win32/main_window_win32.cpp
    src/platform/win32/registry_win32.cpp
    src/platform/win32/shell_win32.cpp
)
target_link_libraries(vantorel_win32 PUBLIC vantorel_core advapi32 shlwapi iphlpapi shell32 user32 gdi32)
target_compile_definitions(vantorel_win32 PUBLIC WIN32_LEAN_AND_MEAN NOMINMAX)

add_executable(vantorel WIN32 src/platform/win32/main_win32.cpp)
target_link_libraries(vantorel PRIVATE vantorel_win32)

# GoogleTest built for the target.
set(BUILD_GMOCK OFF CACHE BOOL "" FORCE)
set(INSTALL_GTEST OFF CACHE BOOL "" FORCE)
add_subdirectory(/usr/src/googletest ${CMAKE_BINARY_DIR}/_gtest EXCLUDE_FROM_ALL)

# Wine services inherit ctest's output pipe and stall it: a fixture starts a persistent wineserver
# (and the prefix) once, quietly, and stops it at the end.
set(WINE_ENV WINEPREFIX=${VANTOREL_WINEPREFIX} WINEDEBUG=-all WINEDLLOVERRIDES=mscoree,mshtml=)
add_test(NAME wine_start COMMAND sh -c
    "mkdir -p '${VANTOREL_WINEPREFIX}' && env ${WINE_ENV} wineserver -p </dev/null >/dev/null 2>&1 && env ${WINE_ENV} wine wineboot </dev/null >/dev/null 2>&1")
set_tests_properties(wine_start PROPERTIES FIXTURES_SETUP wine)
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

# The per-row yield's cost, run by hand under Wine (not a test).
add_executable(pump_bench bench/win32/pump_bench.cpp)
target_link_libraries(pump_bench PRIVATE vantorel_win32)

vantorel_wine_test(connection_table_win32_tests tests/win32/connection_table_win32_test.cpp)
target_link_libraries(connection_table_win32_tests PRIVATE ws2_32)

# Tests that open windows run on a virtual display of their own, started and stopped by a fixture.
set(VANTOREL_TEST_DISPLAY ":200" CACHE STRING "Virtual X display for the Wine tests that open windows")
set(VANTOREL_XVFB_PID ${CMAKE_BINARY_DIR}/xvfb.pid)
add_test(NAME xvfb_start COMMAND sh -c
    "Xvfb ${VANTOREL_TEST_DISPLAY} -screen 0 1024x768x24 -nolisten tcp </dev/null >/dev/null 2>&1 & echo $! > '${VANTOREL_XVFB_PID}'; sleep 1; kill -0 $(cat '${VANTOREL_XVFB_PID}')")
set_tests_properties(xvfb_start PROPERTIES FIXTURES_SETUP display)
add_test(NAME xvfb_stop COMMAND sh -c "[ -f '${VANTOREL_XVFB_PID}' ] && kill $(cat '${VANTOREL_XVFB_PID}'); rm -f '${VANTOREL_XVFB_PID}'; exit 0")
set_tests_properties(xvfb_stop PROPERTIES FIXTURES_CLEANUP display)

vantorel_wine_test(guard_win32_tests tests/win32/guard_win32_test.cpp)
set_tests_properties(guard_win32_tests PROPERTIES FIXTURES_REQUIRED "wine;display" ENVIRONMENT DISPLAY=${VANTOREL_TEST_DISPLAY})

# Black-box tests of vantorel.exe itself.
vantorel_wine_test(program_e2e_tests tests/e2e/program_test.cpp)
add_dependencies(program_e2e_tests vantorel)
target_link_libraries(program_e2e_tests PRIVATE ws2_32)
set_tests_properties(program_e2e_tests PROPERTIES FIXTURES_REQUIRED "wine;display" ENVIRONMENT DISPLAY=${VANTOREL_TEST_DISPLAY})
