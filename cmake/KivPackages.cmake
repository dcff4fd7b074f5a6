# Makes the Debian packages, one per component: "cmake --build BUILD --target package". System packages have the prefix /usr.
set(package_of_system libkiv-system${PROJECT_VERSION_MAJOR})
set(package_of_platform libkiv-platform${PROJECT_VERSION_MAJOR})
set(package_of_dev libkiv-system-dev)
set(package_of_client libkiv-client-dev)
set(package_of_kivctl kivctl)

# Each package contains its component, the copyright and a changelog.
configure_file(cmake/debian/changelog.in debian/changelog @ONLY)
file(READ LICENSE license)
string(REGEX REPLACE "^MIT License\n\n" "" license "${license}")
file(CONFIGURE OUTPUT debian/copyright CONTENT "libkiv_system, libkiv_util, libkiv_platform and kivctl\n\n@license@" @ONLY)
add_custom_command(OUTPUT debian/changelog.Debian.gz
  COMMAND gzip --best --no-name --stdout debian/changelog >debian/changelog.Debian.gz
  WORKING_DIRECTORY ${PROJECT_BINARY_DIR} DEPENDS ${PROJECT_BINARY_DIR}/debian/changelog)
add_custom_target(debian_changelog ALL DEPENDS debian/changelog.Debian.gz)
foreach(component IN ITEMS system platform dev client kivctl)
  install(FILES ${PROJECT_BINARY_DIR}/debian/copyright ${PROJECT_BINARY_DIR}/debian/changelog.Debian.gz
    DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package_of_${component}} COMPONENT ${component} EXCLUDE_FROM_ALL)
  string(TOUPPER ${component} upper)
  set(CPACK_DEBIAN_${upper}_PACKAGE_NAME ${package_of_${component}})
  list(APPEND CPACK_COMPONENTS_ALL ${component})
endforeach()
configure_file(cmake/debian/options.cmake.in debian/options.cmake @ONLY)

set(CPACK_GENERATOR DEB)
set(CPACK_PROJECT_CONFIG_FILE ${PROJECT_BINARY_DIR}/debian/options.cmake)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_SOURCE kiv-system)
set(CPACK_DEBIAN_PACKAGE_MAINTAINER "kiv-agent developers <kiv-system@example.org>")
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)

# dpkg-shlibdeps finds dependencies on other packages; dependencies between these packages are listed here.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS
  ${PROJECT_BINARY_DIR}/lib/DASystem ${PROJECT_BINARY_DIR}/lib/kiv_util ${PROJECT_BINARY_DIR}/platform)
if(CMAKE_SYSROOT)
  list(APPEND CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_SYSROOT}/usr/lib/${CMAKE_LIBRARY_ARCHITECTURE})
endif()
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_COMPONENT_SYSTEM_DEPENDS platform)
set(CPACK_COMPONENT_DEV_DEPENDS system platform client)
set(CPACK_COMPONENT_KIVCTL_DEPENDS system platform)
set(CPACK_DEBIAN_DEV_PACKAGE_DEPENDS libglib2.0-dev)
set(CPACK_DEBIAN_DEV_PACKAGE_SHLIBDEPS OFF)
set(CPACK_DEBIAN_CLIENT_PACKAGE_SHLIBDEPS OFF)
set(CPACK_DEBIAN_CLIENT_PACKAGE_ARCHITECTURE all)
set(CPACK_DEBIAN_SYSTEM_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_PLATFORM_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_CLIENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_KIVCTL_PACKAGE_SECTION devel)
# A trigger runs ldconfig for the libraries. Naming other scripts makes CPack omit its own for that; they do not exist, so it warns.
set(CPACK_DEBIAN_SYSTEM_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/cmake/debian/triggers no/postinst no/postrm)
set(CPACK_DEBIAN_PLATFORM_PACKAGE_CONTROL_EXTRA ${CPACK_DEBIAN_SYSTEM_PACKAGE_CONTROL_EXTRA})

set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "") # each package has its own
set(CPACK_COMPONENT_SYSTEM_DESCRIPTION "system-access layer of kiv-agent
One facade gives an on-device agent the identity of the device and its SIM
subscribers, country and language data and connection changes. It sends the
agent's notifications and push messages over the system bus.")
set(CPACK_COMPONENT_PLATFORM_DESCRIPTION "simulated mobile device behind the platform's C interfaces
Replaces the libraries of a device on other machines. It checks its callers
strictly, and a profile or a file configures it.")
set(CPACK_COMPONENT_DEV_DESCRIPTION "system-access layer of kiv-agent: development files
Contains headers, files for pkg-config and CMake, the bus interfaces, and an
example of the agent's bus policy.")
set(CPACK_COMPONENT_CLIENT_DESCRIPTION "client services of kiv-agent: interfaces and examples
Contains the bus interfaces with which a client service subscribes to the
agent's events and receives them. Also contains examples of the bus policy and
the .service file that a client service installs.")
set(CPACK_COMPONENT_KIVCTL_DESCRIPTION "small agent and remote control of the simulated device
Queries the system-access layer from the command line, acts as a client
service, and contains the bus services of a device.")
include(CPack)
