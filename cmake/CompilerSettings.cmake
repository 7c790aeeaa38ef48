# Warnings as errors for every target of the project, and the sanitizers a preset asks for.

set(QVX_SANITIZE "" CACHE STRING "Sanitizers, as for -fsanitize= (address,undefined or thread)")

add_compile_options(
    -Wall -Wextra -Werror
    -Wcast-align -Wconversion -Wno-sign-conversion -Wformat=2 -Wimplicit-fallthrough -Wshadow
    # GCC cannot follow std::variant and std::optional; Clang has no such warning.
    $<$<CXX_COMPILER_ID:GNU>:-Wno-maybe-uninitialized>
    $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>
    $<$<COMPILE_LANGUAGE:CXX>:-Wold-style-cast>
    $<$<COMPILE_LANGUAGE:CXX>:-Woverloaded-virtual>)

if(QVX_SANITIZE)
    add_compile_options(-fsanitize=${QVX_SANITIZE} -fno-sanitize-recover=all
                        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${QVX_SANITIZE})
endif()
