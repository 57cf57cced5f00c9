# Installing vexil for hosts: the shared library, the public headers, a CMake package
# (find_package(vexil) gives vexil::vexil), a pkg-config file and the `vexil` command, in
# three components that `make package` turns into Debian packages (cmake/VexilPackage.cmake).
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

set(VEXIL_CMAKE_DIR "${CMAKE_INSTALL_LIBDIR}/cmake/vexil")

install(TARGETS vexil EXPORT vexilTargets
  LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT library NAMELINK_COMPONENT development
  ARCHIVE DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT development
  RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}" COMPONENT library)
install(DIRECTORY "${PROJECT_SOURCE_DIR}/include/vexil" DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}"
  COMPONENT development)
install(EXPORT vexilTargets NAMESPACE vexil:: DESTINATION "${VEXIL_CMAKE_DIR}" COMPONENT development)
install(TARGETS vexil_cli RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}" COMPONENT cli)

configure_package_config_file("${PROJECT_SOURCE_DIR}/cmake/vexilConfig.cmake.in"
  "${PROJECT_BINARY_DIR}/vexilConfig.cmake" INSTALL_DESTINATION "${VEXIL_CMAKE_DIR}")
write_basic_package_version_file("${PROJECT_BINARY_DIR}/vexilConfigVersion.cmake"
  COMPATIBILITY SameMajorVersion)
install(FILES "${PROJECT_BINARY_DIR}/vexilConfig.cmake" "${PROJECT_BINARY_DIR}/vexilConfigVersion.cmake"
  DESTINATION "${VEXIL_CMAKE_DIR}" COMPONENT development)

# The prefix is found relative to the file itself, so the file stays valid wherever the
# package is installed (or moved).
file(RELATIVE_PATH VEXIL_PC_TO_PREFIX "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
configure_file("${PROJECT_SOURCE_DIR}/cmake/vexil.pc.in" "${PROJECT_BINARY_DIR}/vexil.pc" @ONLY)
install(FILES "${PROJECT_BINARY_DIR}/vexil.pc" DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig"
  COMPONENT development)
