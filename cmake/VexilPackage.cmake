# Debian packages of the installed components, built by `make package` with CPack:
# libvexil0 (the library, its dependencies found by dpkg-shlibdeps), libvexil-dev
# (headers, CMake and pkg-config files) and vexil (the command-line host).
set(CPACK_GENERATOR "DEB")
set(CPACK_PACKAGE_NAME "vexil")
set(CPACK_PACKAGE_VENDOR "vexil")
set(CPACK_PACKAGE_CONTACT "vexil developers <vexil@localhost>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "Language Server Protocol client and directory watching for IDE hosts")
set(CPACK_PACKAGING_INSTALL_PREFIX "/usr")
set(CPACK_PACKAGE_DIRECTORY "${PROJECT_BINARY_DIR}/packages")

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_ALL library development cli)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# The library of the first package, which the other two depend on by name below.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${PROJECT_BINARY_DIR}")
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
set(CPACK_DEBIAN_PACKAGE_SECTION "libs")

set(CPACK_DEBIAN_LIBRARY_PACKAGE_NAME "libvexil${PROJECT_VERSION_MAJOR}")
set(CPACK_COMPONENT_LIBRARY_DESCRIPTION "vexil shared library: a language-server client and directory watching for IDE hosts")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME "libvexil-dev")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION "libdevel")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION "vexil development files: headers, CMake package and pkg-config file")
set(CPACK_COMPONENT_DEVELOPMENT_DEPENDS library)
set(CPACK_DEBIAN_CLI_PACKAGE_NAME "vexil")
set(CPACK_DEBIAN_CLI_PACKAGE_SECTION "devel")
set(CPACK_COMPONENT_CLI_DESCRIPTION "vexil command: ask language servers, watch directories, run watcher tasks")
set(CPACK_COMPONENT_CLI_DEPENDS library)

include(CPack)
