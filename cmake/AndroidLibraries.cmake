# The platform's logging libraries as Debian packages them: android::base (<android-base/...>) and
# android::log (<android/log.h>, <log/log.h>). They live beside the multiarch directory, outside the
# loader's default path, hence the run path.

function(qvx_import_android_library target name)
    find_library(QVX_${name}_LIBRARY ${name}
                 PATHS /usr/lib/${CMAKE_LIBRARY_ARCHITECTURE}/android NO_DEFAULT_PATH REQUIRED)
    get_filename_component(directory ${QVX_${name}_LIBRARY} DIRECTORY)
    add_library(${target} SHARED IMPORTED GLOBAL)
    set_target_properties(${target} PROPERTIES
        IMPORTED_LOCATION ${QVX_${name}_LIBRARY}
        INTERFACE_INCLUDE_DIRECTORIES /usr/include/android
        INTERFACE_LINK_OPTIONS "-Wl,-rpath,${directory};-Wl,-rpath-link,${directory}")
endfunction()

qvx_import_android_library(android::log log)
qvx_import_android_library(android::base base)
set_target_properties(android::base PROPERTIES INTERFACE_LINK_LIBRARIES android::log)
