# Tests, fuzz targets and benchmark programs.

# orbek_test(<name> LINKS <subsystem> [LIBRARIES <target>...])
#
# One GoogleTest executable test_<name> from the sources of the calling folder (not of folders below it). Its tests
# get a CTest label by the end of the suite's name: "...WithModels" needs the trained models of this repository,
# "...OnPhotos" the labelled images beside it; everything else is "unit" and needs nothing but the repository.
function(orbek_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "LINKS" "LIBRARIES")
    find_package(GTest REQUIRED)
    include(GoogleTest)
    file(GLOB sources CONFIGURE_DEPENDS *.cpp)
    add_executable(test_${name} ${sources})
    orbek_link(test_${name} ${arg_LINKS})
    target_include_directories(test_${name} PRIVATE ${CMAKE_SOURCE_DIR}/tests)
    target_link_libraries(test_${name} PRIVATE ${arg_LIBRARIES} GTest::gmock GTest::gtest_main)
    if(ORBEK_SANITIZE)
        # Tests take longer to build than to run.
        target_compile_options(test_${name} PRIVATE -O0)
    endif()
    target_compile_definitions(test_${name} PRIVATE
        ORBEK_SOURCE_DIR="${CMAKE_SOURCE_DIR}" ORBEK_BINARY_DIR="${CMAKE_BINARY_DIR}")
    set(unit "*-*WithModels.*:*OnPhotos.*")
    set(model "*WithModels.*")
    set(data "*OnPhotos.*")
    foreach(label unit model data)
        gtest_discover_tests(test_${name}
            TEST_PREFIX "${name}."
            TEST_FILTER "${${label}}"
            TEST_LIST ${name}_${label}_tests
            PROPERTIES LABELS ${label} SKIP_REGULAR_EXPRESSION "\\[  SKIPPED \\]"
            DISCOVERY_MODE PRE_TEST)
    endforeach()
endfunction()

# orbek_fuzz(<name> LINKS <subsystem>)
#
# fuzz/<name>.cpp defines LLVMFuzzerTestOneInput; fuzz/corpus/<name>/ holds its seeds. With ORBEK_LIBFUZZER it becomes
# a libFuzzer program; otherwise a program that replays files, and a test that replays the seeds and their mutations.
function(orbek_fuzz name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "LINKS" "LIBRARIES")
    if(ORBEK_LIBFUZZER)
        add_executable(fuzz_${name} ${name}.cpp)
        target_link_options(fuzz_${name} PRIVATE -fsanitize=fuzzer)
    else()
        add_executable(fuzz_${name} ${name}.cpp replay.cpp)
        add_test(NAME fuzz.${name} COMMAND fuzz_${name} ${CMAKE_CURRENT_SOURCE_DIR}/corpus/${name})
        set_tests_properties(fuzz.${name} PROPERTIES LABELS unit)
    endif()
    orbek_link(fuzz_${name} ${arg_LINKS})
    target_link_libraries(fuzz_${name} PRIVATE ${arg_LIBRARIES})
endfunction()

# orbek_bench(<name> LINKS <subsystem>): a Google Benchmark program bench_<name> from bench/<name>.cpp.
function(orbek_bench name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "LINKS" "LIBRARIES")
    find_package(benchmark REQUIRED)
    add_executable(bench_${name} ${name}.cpp)
    orbek_link(bench_${name} ${arg_LINKS})
    target_link_libraries(bench_${name} PRIVATE ${arg_LIBRARIES} benchmark::benchmark benchmark::benchmark_main)
endfunction()
