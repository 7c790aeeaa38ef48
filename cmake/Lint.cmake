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

# The analyzer does not step into templates, nearly all of them the standard library's: that is most
# of its time.
set(analyzer_options --extra-arg=-Xclang --extra-arg=-analyzer-config
                     --extra-arg=-Xclang --extra-arg=c++-template-inlining=false)
# What a mutex guards is checked with the C++ library whose mutexes Clang can follow; a lock that is
# released and taken again (std::unique_lock) is taken at its word: ScopedLockAssertion.
set(thread_options --extra-arg=-stdlib=libc++
                   --extra-arg=-D_LIBCPP_ENABLE_THREAD_SAFETY_ANNOTATIONS
                   --extra-arg=-Wthread-safety)
# Clang reads headers as they stand, not as another compiler has precompiled them.
set(lint_commands ${CMAKE_BINARY_DIR}/lint/compile_commands.json)
add_custom_command(OUTPUT ${lint_commands}
    COMMAND sed "s| -Winvalid-pch -include .*/cmake_pch.hxx||" ${CMAKE_BINARY_DIR}/compile_commands.json
            > ${lint_commands}
    DEPENDS ${CMAKE_BINARY_DIR}/compile_commands.json VERBATIM)
foreach(file IN LISTS lint_sources)
    file(RELATIVE_PATH name ${CMAKE_SOURCE_DIR} ${file})
    string(REPLACE "/" "_" stamp ${name})
    set(stamp ${CMAKE_BINARY_DIR}/lint/${stamp})
    set(options ${analyzer_options})
    if(name MATCHES "^(platform|handset)/")
        list(APPEND options ${thread_options})
    endif()
    # Findings go to standard output; standard error only counts suppressed ones.
    add_custom_command(OUTPUT ${stamp}.tidy
        COMMAND sh -c "exec \"$@\" 2>/dev/null" sh ${CLANG_TIDY} --quiet -p ${CMAKE_BINARY_DIR}/lint
                --extra-arg=-Wno-unknown-warning-option ${options} ${file}
        COMMAND ${CMAKE_COMMAND} -E touch ${stamp}.tidy
        DEPENDS ${file} ${lint_headers} ${lint_commands} ${CMAKE_SOURCE_DIR}/.clang-tidy
        COMMENT "clang-tidy ${name}" VERBATIM)
    list(APPEND lint_stamps ${stamp}.tidy)
endforeach()
file(MAKE_DIRECTORY ${CMAKE_BINARY_DIR}/lint)
add_custom_target(lint DEPENDS ${lint_stamps})
