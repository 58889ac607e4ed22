# libFuzzer targets (clang, AddressSanitizer and UBSan) of everything that reads outside input. As
# tests, each replays its committed seed corpus (tests/fuzz/corpus/<target>/) and then fuzzes for a
# few seconds from it, so a regression fails the suite; scripts/fuzz runs them for longer.
set(VANTOREL_FUZZ_SECONDS 4 CACHE STRING "Seconds each fuzz target runs as a test")

foreach(target definitions_bytes definitions_sorted registry_values downloader xpbutton_paint)
    add_executable(fuzz_${target} tests/fuzz/${target}.cpp)
    target_link_libraries(fuzz_${target} PRIVATE vantorel_fakes)
    target_link_options(fuzz_${target} PRIVATE -fsanitize=fuzzer)
    # New inputs go to a scratch folder in the build tree; the committed corpus is only read.
    set(work ${CMAKE_BINARY_DIR}/fuzz-work/${target})
    file(MAKE_DIRECTORY ${work})
    add_test(NAME fuzz_${target}
             COMMAND fuzz_${target} -max_total_time=${VANTOREL_FUZZ_SECONDS} -timeout=10 -rss_limit_mb=1024
                     -print_final_stats=1 -artifact_prefix=${CMAKE_BINARY_DIR}/fuzz-work/${target}-
                     ${work} ${CMAKE_SOURCE_DIR}/tests/fuzz/corpus/${target})
endforeach()
