# Fuzzers. Each is a harness NAME_fuzzer.cpp with a directory NAME_corpus of inputs to start from.
#
# The preset "fuzz" (clang, address and undefined-behaviour sanitizers) builds them against libFuzzer;
# fuzz/run NAME [EXECUTIONS] runs one. Every other build with tests replays the kept inputs. Harnesses
# NAME_fuzzer.py in Python, over fuzz/damage.py, lie in the directory fuzz/ of the one that adds them.

function(qvx_add_fuzzer name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "LIBRARIES")
    if(QVX_FUZZ)
        add_executable(${name}_fuzzer ${name}_fuzzer.cpp)
        target_link_libraries(${name}_fuzzer PRIVATE ${arg_LIBRARIES})
        target_link_options(${name}_fuzzer PRIVATE -fsanitize=fuzzer)
    else()
        add_executable(${name}_replay ${name}_fuzzer.cpp ${CMAKE_SOURCE_DIR}/fuzz/replay.cpp)
        target_link_libraries(${name}_replay PRIVATE ${arg_LIBRARIES})
        add_test(NAME ${QVX_TEST_PREFIX}${name}_replay
                 COMMAND ${name}_replay ${CMAKE_CURRENT_SOURCE_DIR}/${name}_corpus)
        set_tests_properties(${QVX_TEST_PREFIX}${name}_replay PROPERTIES LABELS unit TIMEOUT 120)
    endif()
endfunction()

function(qvx_add_python_fuzzer name)
    # The same for every build: once is enough.
    if(QVX_FUZZ OR QVX_SANITIZE OR CMAKE_CROSSCOMPILING)
        return()
    endif()
    add_test(NAME ${QVX_TEST_PREFIX}${name}_replay
             COMMAND /usr/bin/python3 -B ${CMAKE_CURRENT_SOURCE_DIR}/fuzz/${name}_fuzzer.py --replay)
    set_tests_properties(${QVX_TEST_PREFIX}${name}_replay PROPERTIES LABELS unit TIMEOUT 120)
endfunction()
