# C++ from AIDL files.
#
#   aidl_interface_library(<target>
#       SOURCES <file.aidl>...         # relative to the current source directory
#       [ROOT <directory>]             # where the package path starts; default: the current one
#       [VERSION <number> HASH <hash>] # what the served interfaces report; default: not versioned
#       [STABILITY vintf]              # every type of the library is @VintfStability
#       [VENDOR]                       # the library is part of the vendor image: so its objects and
#                                      # calls are marked
#       [IMPORTS <target>...])         # earlier libraries of this kind whose types are used
#
# Makes the STATIC library <target>, whose users may include <aidl/package/Type.h>. It is generated
# again when an .aidl file of it or its imports, or the compiler, changes.
#
#   aidl_generate(<name> ...)          # the same arguments but VENDOR
#
# Only generates, for code that becomes part of a library itself: sets <name>_SOURCES, headers
# included, and <name>_INCLUDE, the directory they are included from.
set(AIDL_COMPILER_DIRECTORY ${CMAKE_CURRENT_LIST_DIR})

find_program(AIDL_PYTHON python3 PATHS /usr/bin NO_DEFAULT_PATH REQUIRED)

function(aidl_generate target)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "ROOT;VERSION;HASH;STABILITY" "SOURCES;IMPORTS")
    if(arg_UNPARSED_ARGUMENTS OR arg_KEYWORDS_MISSING_VALUES OR NOT arg_SOURCES)
        message(FATAL_ERROR "${target}: SOURCES <file.aidl>... is needed, see AidlInterface.cmake; "
                            "wrong here: ${arg_UNPARSED_ARGUMENTS} ${arg_KEYWORDS_MISSING_VALUES}")
    endif()
    if(NOT arg_ROOT)
        set(arg_ROOT .)
    endif()
    get_filename_component(root ${arg_ROOT} ABSOLUTE)

    set(options --lang=ndk --structured)
    foreach(option IN ITEMS VERSION HASH STABILITY)
        if(arg_${option})
            string(TOLOWER ${option} name)
            list(APPEND options --${name} ${arg_${option}})
        endif()
    endforeach()

    set(roots ${root})
    set(depends "")
    foreach(import IN LISTS arg_IMPORTS)
        get_target_property(import_roots ${import} AIDL_ROOTS)
        get_target_property(import_files ${import} AIDL_FILES)
        list(APPEND roots ${import_roots})
        list(APPEND depends ${import_files})
    endforeach()
    list(REMOVE_DUPLICATES roots)
    list(TRANSFORM roots PREPEND --include= OUTPUT_VARIABLE includes)

    set(directory ${CMAKE_CURRENT_BINARY_DIR}/${target})
    set(files "")
    set(headers "")
    set(sources "")
    foreach(source IN LISTS arg_SOURCES)
        get_filename_component(file ${source} ABSOLUTE)
        file(RELATIVE_PATH type ${root} ${file})
        if(type MATCHES "^\\.\\./" OR NOT type MATCHES "\\.aidl$")
            message(FATAL_ERROR "${target}: ${source} is no .aidl file "
                                "below ${root}")
        endif()
        get_filename_component(package ${type} DIRECTORY)
        get_filename_component(name ${type} NAME_WE)
        # IFoo has BnFoo and BpFoo; Iris would have BnIris.
        string(REGEX REPLACE "^I([A-Z])" "\\1" base ${name})
        list(APPEND files ${file})
        foreach(header IN ITEMS ${name} Bn${base} Bp${base})
            list(APPEND headers ${directory}/include/aidl/${package}/${header}.h)
        endforeach()
        list(APPEND sources ${directory}/src/${package}/${name}.cpp)
    endforeach()

    file(GLOB compiler CONFIGURE_DEPENDS
         ${AIDL_COMPILER_DIRECTORY}/aidl
         ${AIDL_COMPILER_DIRECTORY}/aidl_compiler/*.py
         ${AIDL_COMPILER_DIRECTORY}/aidl_compiler/*.lark
         ${AIDL_COMPILER_DIRECTORY}/aidl_compiler/templates/*.j2)
    add_custom_command(
        OUTPUT ${headers} ${sources}
        COMMAND ${CMAKE_COMMAND} -E env PYTHONDONTWRITEBYTECODE=1
                ${AIDL_PYTHON} ${AIDL_COMPILER_DIRECTORY}/aidl ${options} ${includes}
                --out-headers=${directory}/include --out-sources=${directory}/src ${files}
        DEPENDS ${files} ${depends} ${compiler}
        COMMENT "AIDL ${target}"
        VERBATIM)

    set(${target}_SOURCES ${sources} ${headers} PARENT_SCOPE)
    set(${target}_INCLUDE ${directory}/include PARENT_SCOPE)
    set(${target}_ROOTS ${roots} PARENT_SCOPE)
    set(${target}_FILES ${files} ${depends} PARENT_SCOPE)
endfunction()

function(aidl_interface_library target)
    cmake_parse_arguments(PARSE_ARGV 1 arg VENDOR "" IMPORTS)
    list(REMOVE_ITEM ARGN VENDOR)
    aidl_generate(${target} ${ARGN})

    add_library(${target} STATIC ${${target}_SOURCES})
    target_include_directories(${target} PUBLIC ${${target}_INCLUDE})
    target_compile_definitions(${target} PUBLIC BINDER_STABILITY_SUPPORT)
    if(arg_VENDOR)
        target_compile_definitions(${target} PRIVATE __ANDROID_VENDOR__)
    endif()
    target_link_libraries(${target} PUBLIC binder_ndk ${arg_IMPORTS})
    set_target_properties(${target} PROPERTIES AIDL_ROOTS "${${target}_ROOTS}"
                                               AIDL_FILES "${${target}_FILES}")
endfunction()
