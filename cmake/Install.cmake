# What `cmake --install` puts where, and the Debian package of the same (`cpack -G DEB`): the service
# and the platform it needs on a Linux handset whose kernel has binder, and vibctl.
#
#   bin/vibctl                        the client
#   libexec/qvx-vibrator/             service manager and vibrator service
#   lib/qvx-vibrator/                 the binder library, known to these programs alone
#   share/qvx-vibrator/               who may register what; vendor/... the VINTF fragment, where the
#                                     service manager's unit looks
#   lib/systemd, lib/udev, ...        units, users, rules, modules
if(NOT TARGET vibctl OR NOT TARGET servicemanager)
    return()
endif()
include(GNUInstallDirs)

set(service android.hardware.vibrator-service.quorvan)
set(programs ${CMAKE_INSTALL_LIBEXECDIR}/qvx-vibrator)
set(libraries ${CMAKE_INSTALL_LIBDIR}/qvx-vibrator)
set(linux ${CMAKE_SOURCE_DIR}/packaging/linux)

install(TARGETS vibctl RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
install(TARGETS servicemanager ${service} RUNTIME DESTINATION ${programs})
install(TARGETS binder_ndk LIBRARY DESTINATION ${libraries})
# From each program's directory to the libraries', so that an installation may stand anywhere. The
# same words serve the build directory, where the library lies in ../lib: room for others would be
# filled with an empty one, which is the directory that the program is started in.
file(RELATIVE_PATH from_bin /${CMAKE_INSTALL_BINDIR} /${libraries})
file(RELATIVE_PATH from_programs /${programs} /${libraries})
set_target_properties(vibctl PROPERTIES INSTALL_RPATH "$ORIGIN/${from_bin};$ORIGIN/../lib")
set_target_properties(servicemanager ${service} PROPERTIES
    INSTALL_RPATH "$ORIGIN/${from_programs};$ORIGIN/../lib")
set_target_properties(vibctl servicemanager ${service} binder_ndk PROPERTIES
    BUILD_WITH_INSTALL_RPATH ON)

install(FILES ${CMAKE_SOURCE_DIR}/hal-server/vibrator/aidl/default/${service}.xml
        DESTINATION ${CMAKE_INSTALL_DATADIR}/qvx-vibrator/vendor/etc/vintf/manifest)
install(FILES ${linux}/services.rules DESTINATION ${CMAKE_INSTALL_DATADIR}/qvx-vibrator)

# install_compressed(FILE DESTINATION NAME): installs FILE as NAME.gz.
function(install_compressed file destination name)
    set(compressed ${CMAKE_BINARY_DIR}/install/${name}.gz)
    install(CODE "
        file(MAKE_DIRECTORY ${CMAKE_BINARY_DIR}/install)
        execute_process(COMMAND gzip --best --no-name --stdout ${file}
                        OUTPUT_FILE ${compressed} COMMAND_ERROR_IS_FATAL ANY)")
    install(FILES ${compressed} DESTINATION ${destination})
endfunction()

install_compressed(${CMAKE_SOURCE_DIR}/docs/man/vibctl.1 ${CMAKE_INSTALL_MANDIR}/man1 vibctl.1)
install_compressed(${CMAKE_SOURCE_DIR}/docs/man/servicemanager.8 ${CMAKE_INSTALL_MANDIR}/man8
                   servicemanager.8)
install_compressed(${linux}/changelog ${CMAKE_INSTALL_DATADIR}/doc/qvx-vibrator changelog)
install(FILES ${CMAKE_SOURCE_DIR}/vibctl/completion/vibctl.bash
        DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions RENAME vibctl)
install(FILES ${linux}/copyright ${CMAKE_SOURCE_DIR}/docs/bring-up.md
              ${CMAKE_SOURCE_DIR}/docs/interfaces.md
        DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/qvx-vibrator)

# systemd and udev look below lib/ whatever the libraries' directory is called. The units name whole
# paths, and the prefix is known only when things are installed.
foreach(unit IN ITEMS qvx-servicemanager.service qvx-vibrator.service
                      qvx-vibrator-watchdog.service qvx-vibrator-watchdog.timer)
    install(CODE "
        set(programs ${programs})
        set(data ${CMAKE_INSTALL_DATADIR}/qvx-vibrator)
        set(CMAKE_INSTALL_BINDIR ${CMAKE_INSTALL_BINDIR})
        configure_file(${linux}/${unit} ${CMAKE_BINARY_DIR}/install/${unit} @ONLY)")
    install(FILES ${CMAKE_BINARY_DIR}/install/${unit} DESTINATION lib/systemd/system)
endforeach()
install(FILES ${linux}/qvx-vibrator.sysusers DESTINATION lib/sysusers.d RENAME qvx-vibrator.conf)
install(FILES ${linux}/qvx-vibrator.rules DESTINATION lib/udev/rules.d
        RENAME 60-qvx-vibrator.rules)
install(FILES ${linux}/qvx-vibrator.modules DESTINATION lib/modules-load.d
        RENAME qvx-vibrator.conf)
install(FILES ${linux}/qvx-vibrator.modprobe DESTINATION lib/modprobe.d RENAME qvx-vibrator.conf)

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME qvx-vibrator)
set(CPACK_PACKAGE_CONTACT "The authors of the vibrator service <authors@qvx-vibrator.invalid>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "vibrator service, service manager and vibctl for Linux")
set(CPACK_PACKAGE_DESCRIPTION
"The vibrator hardware service of a phone, on a Linux handset whose kernel has
binder: the service, a binder service manager to register it with, and vibctl,
which calls it and finds out what keeps a phone from vibrating.")
# The prefix as the units have to see it, with the package's own directory in front.
set(CPACK_SET_DESTDIR ON)
set(CPACK_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})
set(CPACK_DEBIAN_PACKAGE_RECOMMENDS systemd)
set(CPACK_DEBIAN_PACKAGE_CONTROL_EXTRA ${linux}/postinst ${linux}/prerm
                                         ${linux}/postrm)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
# Where the package's programs find the libraries that are not in the loader's path.
set(CPACK_QVX_LIBRARIES /usr/${libraries}/libbinder_ndk.so)
foreach(library IN ITEMS ${QVX_log_LIBRARY} ${QVX_base_LIBRARY})
    list(APPEND CPACK_QVX_LIBRARIES ${library}.0)
endforeach()
set(CPACK_POST_BUILD_SCRIPTS ${linux}/without-run-path.cmake)
include(CPack)
