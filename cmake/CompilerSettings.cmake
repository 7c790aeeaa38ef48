# Warnings as errors for every target of the project, the hardening of release programs, and the
# sanitizers a preset asks for.

set(QVX_SANITIZE "" CACHE STRING "Sanitizers, as for -fsanitize= (address,undefined or thread)")

add_compile_options(
    -Wall -Wextra -Werror
    -Wcast-align -Wconversion -Wno-sign-conversion -Wformat=2 -Wimplicit-fallthrough -Wshadow
    # GCC cannot follow std::variant and std::optional; Clang has no such warning.
    $<$<CXX_COMPILER_ID:GNU>:-Wno-maybe-uninitialized>
    # GCC does not know what a mutex guards; lint checks it with Clang.
    $<$<CXX_COMPILER_ID:GNU>:-Wno-attributes>
    $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>
    $<$<COMPILE_LANGUAGE:CXX>:-Wold-style-cast>
    $<$<COMPILE_LANGUAGE:CXX>:-Woverloaded-virtual>)

# What Debian asks of a program that others talk to; the checks in fortified functions need the
# optimiser.
set(QVX_HARDENING "")
if(CMAKE_BUILD_TYPE STREQUAL "Release")
    set(QVX_HARDENING -fstack-protector-strong -fstack-clash-protection -D_FORTIFY_SOURCE=2)
    add_link_options(-Wl,-z,relro -Wl,-z,now)
endif()
add_compile_options(${QVX_HARDENING})
include(CheckPIESupported)
check_pie_supported()

# Takes the hardening back for the directory this stands in: of tests, and of what is not installed.
macro(qvx_without_hardening)
    if(QVX_HARDENING)
        get_directory_property(options COMPILE_OPTIONS)
        list(REMOVE_ITEM options ${QVX_HARDENING})
        set_directory_properties(PROPERTIES COMPILE_OPTIONS "${options}")
    endif()
endmacro()

if(QVX_SANITIZE)
    add_compile_options(-fsanitize=${QVX_SANITIZE} -fno-sanitize-recover=all
                        -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${QVX_SANITIZE})
endif()

# A target's sources are compiled six at a time, in half the time: most of it goes into what they
# share, so their unnamed namespaces must not declare the same name.
function(qvx_compile_together name)
    set_target_properties(${name} PROPERTIES UNITY_BUILD ON UNITY_BUILD_BATCH_SIZE 6)
endfunction()
