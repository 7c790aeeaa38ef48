# SPDX-License-Identifier: Apache-2.0
#
# cpack runs this on the package it has made: the programs name the libraries that lie outside the
# loader's path by their whole paths, in place of a run path, which Debian does not take. It comes last
# because the package's dependencies are found by the libraries' bare names.
foreach(package IN LISTS CPACK_PACKAGE_FILES)
    set(tree ${package}.tree)
    set(patch patchelf --remove-rpath)
    foreach(library IN LISTS CPACK_QVX_LIBRARIES)
        get_filename_component(name ${library} NAME)
        list(APPEND patch --replace-needed ${name} ${library})
    endforeach()
    execute_process(COMMAND dpkg-deb --raw-extract ${package} ${tree} COMMAND_ERROR_IS_FATAL ANY)
    file(GLOB programs ${tree}/usr/bin/* ${tree}/usr/lib*/qvx-vibrator/*
         ${tree}/usr/lib/*/qvx-vibrator/*)
    execute_process(COMMAND ${patch} ${programs} COMMAND_ERROR_IS_FATAL ANY)
    execute_process(COMMAND sh -c "find usr -type f -exec md5sum {} + >DEBIAN/md5sums"
                    WORKING_DIRECTORY ${tree} COMMAND_ERROR_IS_FATAL ANY)
    execute_process(COMMAND dpkg-deb --root-owner-group --build ${tree} ${package}
                    OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
    file(REMOVE_RECURSE ${tree})
endforeach()
