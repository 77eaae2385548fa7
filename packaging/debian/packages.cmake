# The Debian packages, made by cpack: the daemon with its unit, the stand-ins, the simulator, the headers.
file(STRINGS ${CMAKE_CURRENT_LIST_DIR}/changelog newest_entry LIMIT_COUNT 1)
if(NOT newest_entry MATCHES "^kiv-mirta-led \\(${PROJECT_VERSION}\\) ")
  message(FATAL_ERROR "packaging/debian/changelog: the first entry is not one of version ${PROJECT_VERSION}")
endif()
file(STRINGS ${CMAKE_CURRENT_LIST_DIR}/changelog CPACK_PACKAGE_CONTACT REGEX "^ -- " LIMIT_COUNT 1)
string(REGEX REPLACE "^ -- (.*>)  .*" "\\1" CPACK_PACKAGE_CONTACT "${CPACK_PACKAGE_CONTACT}")

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME kiv-mirta-led)
set(CPACK_OUTPUT_FILE_PREFIX ${PROJECT_BINARY_DIR}/packages)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_PRE_BUILD_SCRIPTS ${CMAKE_CURRENT_LIST_DIR}/add_documents.cmake)
set(CPACK_KIV_DOCUMENTS ${CMAKE_CURRENT_LIST_DIR})

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_COMPONENT_DAEMON_GROUP led)
set(CPACK_COMPONENT_SYSTEMD_GROUP led)
set(CPACK_COMPONENTS_ALL daemon systemd headers)
if(TARGET kivstandin)
  list(APPEND CPACK_COMPONENTS_ALL standins)
endif()
if(TARGET kiv_led_sim)
  list(APPEND CPACK_COMPONENTS_ALL simulator)
endif()

set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})
if(CMAKE_CROSSCOMPILING)
  list(APPEND CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_FIND_ROOT_PATH}/lib)
  set(CPACK_KIV_CROSS ON)
endif()
find_program(DPKG_ARCHITECTURE dpkg-architecture)
if(DPKG_ARCHITECTURE AND CMAKE_LIBRARY_ARCHITECTURE)
  execute_process(COMMAND ${DPKG_ARCHITECTURE} -t${CMAKE_LIBRARY_ARCHITECTURE} -qDEB_HOST_ARCH
                  OUTPUT_VARIABLE CPACK_DEBIAN_PACKAGE_ARCHITECTURE OUTPUT_STRIP_TRAILING_WHITESPACE)
endif()

set(same_version "(= ${PROJECT_VERSION})")

set(CPACK_DEBIAN_LED_PACKAGE_NAME kiv-mirta-led)
set(CPACK_DEBIAN_LED_PACKAGE_DEPENDS "kiv-led-standins | kiv-platform")
set(CPACK_DEBIAN_LED_PACKAGE_CONTROL_EXTRA ${CMAKE_CURRENT_LIST_DIR}/postinst ${CMAKE_CURRENT_LIST_DIR}/prerm)
set(CPACK_DEBIAN_LED_DESCRIPTION "indicator LEDs of a mobile-broadband device
The service that owns the indicator LEDs of a handheld router, a data card, a
paper-kite, a module CPE or a single-chip CPE. Its systemd unit is installed,
but enabled by nobody but you. A device brings its own service libraries,
which is what kiv-platform stands for.")

set(CPACK_DEBIAN_STANDINS_PACKAGE_NAME kiv-led-standins)
set(CPACK_DEBIAN_STANDINS_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_STANDINS_PACKAGE_PROVIDES kiv-platform)
set(CPACK_DEBIAN_STANDINS_PACKAGE_CONTROL_EXTRA ${CMAKE_CURRENT_LIST_DIR}/triggers)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_STANDINS_DESCRIPTION "stand-ins for the libraries that the LED daemon links
They take the place of a device's ten closed service libraries on a PC, and
keep the whole device in one directory.")

set(CPACK_DEBIAN_SIMULATOR_PACKAGE_NAME kiv-led-sim)
set(CPACK_DEBIAN_SIMULATOR_PACKAGE_SECTION devel)
set(CPACK_DEBIAN_SIMULATOR_PACKAGE_DEPENDS "kiv-mirta-led ${same_version}, kiv-led-standins ${same_version}")
set(CPACK_DEBIAN_SIMULATOR_DESCRIPTION "simulator of the device around the LED daemon
Plays scenarios to the real daemon, on a clock of its own, and shows what its
LEDs do. Scenarios to begin with are in /usr/share/kiv_led/scenarios.")

set(CPACK_DEBIAN_HEADERS_PACKAGE_NAME kiv-platform-dev)
set(CPACK_DEBIAN_HEADERS_PACKAGE_SECTION libdevel)
if(TARGET kivstandin)
  set(CPACK_DEBIAN_HEADERS_PACKAGE_DEPENDS "kiv-led-standins ${same_version}")
endif()
set(CPACK_DEBIAN_HEADERS_DESCRIPTION "headers of the libraries that the LED daemon links
The contract with a device's ten service libraries, for programs that talk to
the daemon or take the place of a library, with a file for pkg-config.")

include(CPack)
