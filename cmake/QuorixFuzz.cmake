# quorix_add_fuzz(NAME SOURCES... [LIBRARIES ...] [OPTIONS ...])
#
# A fuzz target with LLVMFuzzerTestOneInput. Under the preset "fuzz" it is linked with libFuzzer;
# under every other it becomes a program that replays files, and CTest replays the seed corpus
# fuzz/corpus/NAME with it. A finding is mended and its input added to the corpus.
function(quorix_add_fuzz name)
    cmake_parse_arguments(arg "" "" "SOURCES;LIBRARIES;OPTIONS" ${ARGN})

    add_executable(fuzz_${name} ${arg_SOURCES})
    target_link_libraries(fuzz_${name} PRIVATE ${arg_LIBRARIES} Quorix::options)
    if(QUORIX_FUZZ)
        target_link_options(fuzz_${name} PRIVATE -fsanitize=fuzzer)
        # One line for each target, which ./check --soak reads: its name and its libFuzzer options.
        list(JOIN arg_OPTIONS " " options)
        file(APPEND ${PROJECT_BINARY_DIR}/fuzz-targets.txt "fuzz_${name} ${name} ${options}\n")
    else()
        target_sources(fuzz_${name} PRIVATE ${PROJECT_SOURCE_DIR}/fuzz/ReplayMain.cpp)
        add_test(NAME fuzz_${name}_corpus
            COMMAND fuzz_${name} ${PROJECT_SOURCE_DIR}/fuzz/corpus/${name})
        set_tests_properties(fuzz_${name}_corpus PROPERTIES TIMEOUT 120
            ENVIRONMENT "${QUORIX_TEST_ENVIRONMENT}")
    endif()
endfunction()
