# What is installed, in components that are packages of their own:
#
#   libraries     what programs need to run
#   development   what they need to be built: headers, CMake and pkg-config files, the functions' manual pages
#   program       merowireless, with its completions and manual pages
#   appliance     the kit. Its paths are the appliance's own, whatever the prefix is, so that it is only installed where
#                 it is asked for by its name.
include(CMakePackageConfigHelpers)

set(MERO_INSTALL_HEADERS ${CMAKE_INSTALL_INCLUDEDIR}/merowireless-core)
set(MERO_INSTALL_CMAKE ${CMAKE_INSTALL_LIBDIR}/cmake/merowireless-core)

function(mero_install_library name)
  install(TARGETS ${name} EXPORT merowireless-core
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT libraries NAMELINK_COMPONENT development
    INCLUDES DESTINATION ${MERO_INSTALL_HEADERS})
endfunction()

# A directory of their own, since libiw has a wireless.h, too.
install(FILES include/platform.h include/wireless.h DESTINATION ${MERO_INSTALL_HEADERS} COMPONENT development)

# It says where things are by where it is itself: `cmake --install` may be given another prefix.
cmake_path(RELATIVE_PATH CMAKE_INSTALL_PREFIX BASE_DIRECTORY ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig
  OUTPUT_VARIABLE MERO_PREFIX_FROM_PC)
configure_file(cmake/libmerowireless-core.pc.in libmerowireless-core.pc @ONLY)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/libmerowireless-core.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig
  COMPONENT development)

install(EXPORT merowireless-core NAMESPACE merowireless-core:: FILE merowireless-core-config.cmake
  DESTINATION ${MERO_INSTALL_CMAKE} COMPONENT development)
write_basic_package_version_file(merowireless-core-config-version.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${CMAKE_CURRENT_BINARY_DIR}/merowireless-core-config-version.cmake DESTINATION ${MERO_INSTALL_CMAKE}
  COMPONENT development)

file(GLOB documents CONFIGURE_DEPENDS SECURITY.md docs/[!.]*.md)
list(REMOVE_ITEM documents ${CMAKE_CURRENT_SOURCE_DIR}/docs/appliance.md)
install(FILES ${documents} DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT program)
install(DIRECTORY docs/pictures DESTINATION ${CMAKE_INSTALL_DOCDIR} COMPONENT program FILES_MATCHING PATTERN *.svg)
install(DIRECTORY examples DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/libmerowireless-core-dev COMPONENT development)
