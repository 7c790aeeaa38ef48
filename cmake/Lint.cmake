# The target "lint": clang-format on all C++ files at once, which is quicker than one by one, and
# clang-tidy on every source that is neither a test nor a fuzzer, each again only when it, a header or
# the configuration has changed.

find_program(CLANG_FORMAT clang-format)
find_program(CLANG_TIDY clang-tidy)
if(NOT CLANG_FORMAT OR NOT CLANG_TIDY)
    return()  # which ./check --all installs
endif()

set(lint_sources "")
set(lint_headers "")
foreach(component IN LISTS QVX_COMPONENTS)
    file(GLOB_RECURSE found CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/${component}/*.cpp)
    list(APPEND lint_sources ${found})
    file(GLOB_RECURSE found CONFIGURE_DEPENDS ${CMAKE_SOURCE_DIR}/${component}/*.h)
    list(APPEND lint_headers ${found})
endforeach()
list(REMOVE_DUPLICATES lint_sources)
list(REMOVE_DUPLICATES lint_headers)

set(lint_stamps ${CMAKE_BINARY_DIR}/lint/format)
add_custom_command(OUTPUT ${CMAKE_BINARY_DIR}/lint/format
    COMMAND ${CLANG_FORMAT} --dry-run --Werror ${lint_sources} ${lint_headers}
    COMMAND ${CMAKE_COMMAND} -E touch ${CMAKE_BINARY_DIR}/lint/format
    DEPENDS ${lint_sources} ${lint_headers} ${CMAKE_SOURCE_DIR}/.clang-format
    COMMENT "clang-format" VERBATIM)
list(FILTER lint_sources EXCLUDE REGEX "/(tests|fuzz)/")

# The analyzer does not step into templates, nearly all of them the standard library's, and follows a
# third of the steps that it would by itself: the rest is most of its time.
set(analyzer_options --extra-arg=-Xclang --extra-arg=-analyzer-config --extra-arg=-Xclang
                     --extra-arg=c++-template-inlining=false,max-nodes=75000)
# It looks at a header's functions where they are called, but a batch's sources are headers to it.
set(batch_options --extra-arg=-Xclang --extra-arg=-analyzer-opt-analyze-headers)
# What a mutex guards is checked with the C++ library whose mutexes Clang can follow; a lock that is
# released and taken again (std::unique_lock) is taken at its word: ScopedLockAssertion.
set(thread_options --extra-arg=-stdlib=libc++
                   --extra-arg=-D_LIBCPP_ENABLE_THREAD_SAFETY_ANNOTATIONS
                   --extra-arg=-Wthread-safety)

# The targets of a directory and of those below it, but for tests and fuzzers.
function(qvx_find_targets directory result)
    get_property(found DIRECTORY ${directory} PROPERTY BUILDSYSTEM_TARGETS)
    get_property(below DIRECTORY ${directory} PROPERTY SUBDIRECTORIES)
    list(FILTER below EXCLUDE REGEX "/(tests|fuzz)$")
    foreach(subdirectory IN LISTS below)
        qvx_find_targets(${subdirectory} more)
        list(APPEND found ${more})
    endforeach()
    set(${result} ${found} PARENT_SCOPE)
endfunction()

# Clang reads as many sources of a target at a time as the compiler does, with the include paths and
# definitions of the target: GCC's own commands name headers that it has precompiled in its own way.
qvx_find_targets(${CMAKE_SOURCE_DIR} lint_targets)
foreach(target IN LISTS lint_targets)
    get_target_property(sources ${target} SOURCES)
    get_target_property(directory ${target} SOURCE_DIR)
    get_target_property(standard ${target} CXX_STANDARD)
    get_target_property(is_compiled_together ${target} UNITY_BUILD)
    set(at_a_time 1)
    set(options ${analyzer_options})
    if(is_compiled_together)
        get_target_property(at_a_time ${target} UNITY_BUILD_BATCH_SIZE)
        list(APPEND options ${batch_options})
    endif()
    file(RELATIVE_PATH component ${CMAKE_SOURCE_DIR} ${directory})
    if(component MATCHES "^(platform|handset)/")
        list(APPEND options ${thread_options})
    endif()
    set(all_includes $<TARGET_PROPERTY:${target},INCLUDE_DIRECTORIES>)
    set(includes $<FILTER:${all_includes},EXCLUDE,^/usr/>)
    set(system_includes $<FILTER:${all_includes},INCLUDE,^/usr/include/.>)
    set(definitions $<TARGET_PROPERTY:${target},COMPILE_DEFINITIONS>)
    set(left "")
    foreach(source IN LISTS sources)
        get_filename_component(source ${source} ABSOLUTE BASE_DIR ${directory})
        if(source IN_LIST lint_sources)
            list(REMOVE_ITEM lint_sources ${source})
            list(APPEND left ${source})
        endif()
    endforeach()
    while(left)
        list(SUBLIST left 0 ${at_a_time} batch)
        list(REMOVE_ITEM left ${batch})
        list(GET batch 0 first)
        file(RELATIVE_PATH first ${CMAKE_SOURCE_DIR} ${first})
        string(REPLACE "/" "_" name ${first})
        set(file ${CMAKE_BINARY_DIR}/lint/${name})
        list(TRANSFORM batch REPLACE "(.+)" "#include \"\\1\"  // NOLINT\n" OUTPUT_VARIABLE text)
        string(CONCAT text ${text})
        file(CONFIGURE OUTPUT ${file} CONTENT "${text}" @ONLY)
        # Findings go to standard output; standard error only counts suppressed ones.
        add_custom_command(OUTPUT ${file}.tidy
            COMMAND sh -c "exec \"$@\" 2>/dev/null" sh ${CLANG_TIDY} --quiet ${options} ${file} --
                    -std=c++${standard}
                    "$<$<BOOL:${includes}>:-I$<JOIN:${includes},;-I>>"
                    "$<$<BOOL:${system_includes}>:-isystem$<JOIN:${system_includes},;-isystem>>"
                    "$<$<BOOL:${definitions}>:-D$<JOIN:${definitions},;-D>>"
            COMMAND ${CMAKE_COMMAND} -E touch ${file}.tidy
            DEPENDS ${file} ${batch} ${lint_headers} ${CMAKE_SOURCE_DIR}/.clang-tidy
            COMMENT "clang-tidy ${first} and those behind it" VERBATIM COMMAND_EXPAND_LISTS)
        list(APPEND lint_stamps ${file}.tidy)
    endwhile()
endforeach()
if(lint_sources)
    message(FATAL_ERROR "lint: no target compiles ${lint_sources}")
endif()
file(MAKE_DIRECTORY ${CMAKE_BINARY_DIR}/lint)
add_custom_target(lint DEPENDS ${lint_stamps})
