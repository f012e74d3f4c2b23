# What `cmake --install` gives beside the programs: the library with its public headers (see orbek_public_headers), the
# packages for CMake and pkg-config, and a configuration that is ready for use. The models are installed by tools/.

include(CMakePackageConfigHelpers)

set(ORBEK_DATA ${CMAKE_INSTALL_DATADIR}/orbek)
set(package_folder ${CMAKE_INSTALL_LIBDIR}/cmake/orbek)
set(packages ${CMAKE_CURRENT_BINARY_DIR}/packages)

install(TARGETS orbek EXPORT orbek-targets)
install(EXPORT orbek-targets NAMESPACE orbek:: DESTINATION ${package_folder})
configure_package_config_file(cmake/orbek-config.cmake.in ${packages}/orbek-config.cmake
    INSTALL_DESTINATION ${package_folder} PATH_VARS ORBEK_DATA)
write_basic_package_version_file(${packages}/orbek-config-version.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${packages}/orbek-config.cmake ${packages}/orbek-config-version.cmake DESTINATION ${package_folder})

file(RELATIVE_PATH ORBEK_PREFIX_FROM_PC /${CMAKE_INSTALL_LIBDIR}/pkgconfig /)
string(REGEX REPLACE "/$" "" ORBEK_PREFIX_FROM_PC "${ORBEK_PREFIX_FROM_PC}")
configure_file(cmake/orbek.pc.in ${packages}/orbek.pc @ONLY)
install(FILES ${packages}/orbek.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# The configuration names the folder of the models, which is known at the time of installation.
install(CODE "
    set(INSTALLDIR \"\${CMAKE_INSTALL_PREFIX}/${ORBEK_DATA}\")
    file(MAKE_DIRECTORY \"\$ENV{DESTDIR}\${INSTALLDIR}\")
    configure_file(\"${CMAKE_SOURCE_DIR}/cmake/orbek.conf.in\" \"\$ENV{DESTDIR}\${INSTALLDIR}/orbek.conf\" @ONLY)
")
