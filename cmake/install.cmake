# Installing the library for hosts on this machine, and a Debian package of it.
#   cmake --install build [--prefix DIR]
#   (cd build && cpack -G DEB)
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

set_target_properties(vantrel PROPERTIES VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR})

# The runtime: the shared library with its soname link. The development files: the header, the
# unversioned link, pkg-config and CMake package files.
install(TARGETS vantrel EXPORT VantrelTargets
  LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT runtime NAMELINK_COMPONENT dev
  RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT runtime
  ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT dev)
install(FILES ${CMAKE_SOURCE_DIR}/include/vantrel.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} COMPONENT dev)

# The pkg-config file finds the prefix from where it lies, so that the tree can be moved.
file(RELATIVE_PATH VANTREL_PC_TO_PREFIX /root/${CMAKE_INSTALL_LIBDIR}/pkgconfig /root)
string(REGEX REPLACE "/$" "" VANTREL_PC_TO_PREFIX "${VANTREL_PC_TO_PREFIX}")
configure_file(${CMAKE_SOURCE_DIR}/cmake/vantrel.pc.in ${CMAKE_BINARY_DIR}/vantrel.pc @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/vantrel.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig COMPONENT dev)

set(VANTREL_CMAKE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/Vantrel)
install(EXPORT VantrelTargets NAMESPACE Vantrel:: DESTINATION ${VANTREL_CMAKE_DIR} COMPONENT dev)
configure_package_config_file(${CMAKE_SOURCE_DIR}/cmake/VantrelConfig.cmake.in
  ${CMAKE_BINARY_DIR}/VantrelConfig.cmake INSTALL_DESTINATION ${VANTREL_CMAKE_DIR})
write_basic_package_version_file(${CMAKE_BINARY_DIR}/VantrelConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${CMAKE_BINARY_DIR}/VantrelConfig.cmake ${CMAKE_BINARY_DIR}/VantrelConfigVersion.cmake
  DESTINATION ${VANTREL_CMAKE_DIR} COMPONENT dev)

# Three Debian packages, as for other libraries: libvantrel0 (what a host needs at run time),
# libvantrel-dev (what building a host needs), so that hosts can ship the runtime alone, and
# vantrel (the command and its man page, tools/vantrel), which can be left out of a host's
# installation and does not tie the command's path to one soname.
set(CPACK_PACKAGE_NAME vantrel)
set(CPACK_PACKAGE_VENDOR "Vantrel")
set(CPACK_PACKAGE_CONTACT "Vantrel developers <vantrel@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "Colour management for proofing")
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_ALL runtime dev cli)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME libvantrel${PROJECT_VERSION_MAJOR})
set(CPACK_DEBIAN_DEV_PACKAGE_NAME libvantrel-dev)
set(CPACK_DEBIAN_CLI_PACKAGE_NAME vantrel)
set(CPACK_DEBIAN_CLI_PACKAGE_SECTION graphics)
set(CPACK_DEBIAN_CLI_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_DEV_PACKAGE_DEPENDS "libvantrel${PROJECT_VERSION_MAJOR} (= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "Vantrel shared library: ICC profile conversions, proof analyses and profile corrections for proofing")
set(CPACK_COMPONENT_CLI_DESCRIPTION "Vantrel command line: conversions, proof judging with an HTML report, profile corrections")
set(CPACK_COMPONENT_DEV_DESCRIPTION "Vantrel development files: vantrel.h, pkg-config and CMake package files")
include(CPack)
