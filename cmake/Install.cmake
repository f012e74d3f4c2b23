# What `cmake --install` gives beside the programs: the library with its public headers (see orbek_public_headers), the
# packages for CMake and pkg-config, a configuration that is ready for use, the examples with their pictures, and the
# manual. The models are installed by tools/.

include(CMakePackageConfigHelpers)

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

# Nothing in the tree names its own place, so that it can be moved: the configuration refers to the library's.
install(FILES cmake/orbek.conf DESTINATION ${ORBEK_DATA})

# The people of the ready-made capture device lie where that one looks, and the examples that use them beside them.
install(DIRECTORY examples/ DESTINATION ${ORBEK_DATA}/examples PATTERN CMakeLists.txt EXCLUDE
                                                               PATTERN convert.cpp EXCLUDE)
foreach(example camera find_faces people search_in_c)
    install(FILES examples/${example}/CMakeLists.txt DESTINATION ${ORBEK_DATA}/examples/${example})
endforeach()

# What there is to read.
install(DIRECTORY docs/manual DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(FILES models/CARD.md docs/scan_formats.md DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY ${CMAKE_BINARY_DIR}/docs/html DESTINATION ${CMAKE_INSTALL_DOCDIR} OPTIONAL)
