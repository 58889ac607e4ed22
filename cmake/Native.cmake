# Native (Linux) build: the portable core against fakes, the Linux platform pieces, benchmarks.
find_package(GTest REQUIRED)
find_package(Threads REQUIRED)
include(GoogleTest)

add_library(vantorel_native STATIC
    src/platform/std/files_std.cpp
    src/platform/linux/connection_table_linux.cpp
)
target_link_libraries(vantorel_native PUBLIC vantorel_core)

add_executable(vantorel_tests
    tests/definitions_test.cpp
    tests/frm_options_test.cpp
    tests/registry_routines_test.cpp
    tests/xpbutton_render_test.cpp
    tests/file_downloader_test.cpp
    tests/http_header_test.cpp
    tests/leading_number_test.cpp
    tests/frm_main_test.cpp
)
target_link_libraries(vantorel_tests PRIVATE vantorel_fakes vantorel_native GTest::gtest_main)
gtest_discover_tests(vantorel_tests DISCOVERY_TIMEOUT 60)

# Real teardown of real loopback connections through the Linux table; needs root, skips without.
add_executable(teardown_linux_tests
    tests/linux/loopback.cpp
    tests/linux/teardown_test.cpp
)
target_link_libraries(teardown_linux_tests PRIVATE vantorel_fakes vantorel_native GTest::gtest_main)
gtest_discover_tests(teardown_linux_tests DISCOVERY_TIMEOUT 60)

# Benchmarks are not run by the tests; the sanitizer build leaves them out.
if(NOT VANTOREL_SANITIZE)
    find_package(benchmark REQUIRED)
    add_executable(definitions_bench bench/definitions_bench.cpp)
    target_link_libraries(definitions_bench PRIVATE vantorel_native benchmark::benchmark)
    add_executable(xpbutton_bench bench/xpbutton_bench.cpp)
    target_link_libraries(xpbutton_bench PRIVATE vantorel_fakes benchmark::benchmark)
    add_executable(download_bench bench/download_bench.cpp)
    target_link_libraries(download_bench PRIVATE vantorel_core benchmark::benchmark)
    add_executable(sweep_bench bench/sweep_bench.cpp tests/linux/loopback.cpp)
    target_link_libraries(sweep_bench PRIVATE vantorel_fakes vantorel_native benchmark::benchmark Threads::Threads)
endif()
