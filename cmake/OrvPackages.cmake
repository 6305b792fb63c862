# Debian packages by cpack, of the components that were installed: a program's part of the library, what it is built
# with, the command, the service.
set(CPACK_GENERATOR DEB)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_ALL shared library command service)
set(CPACK_STRIP_FILES ON)
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_PACKAGE_CONTACT "The developers of orv <orv@localhost>")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS
  ${PROJECT_BINARY_DIR}/messages ${PROJECT_BINARY_DIR}/compare ${PROJECT_BINARY_DIR}/envelope ${PROJECT_BINARY_DIR}/json)

function(orv_package component name section summary text)
  string(TOUPPER ${component} key)
  set(CPACK_DEBIAN_${key}_PACKAGE_NAME ${name} PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_PACKAGE_SECTION ${section} PARENT_SCOPE)
  set(CPACK_DEBIAN_${key}_DESCRIPTION "${summary}\n${text}" PARENT_SCOPE)
  set(place ${CMAKE_INSTALL_DATADIR}/doc/${name})
  install(FILES ${PROJECT_SOURCE_DIR}/cmake/copyright COMPONENT ${component} DESTINATION ${place})
  install(FILES ${PROJECT_BINARY_DIR}/changelog.gz COMPONENT ${component} DESTINATION ${place})
endfunction()

string(TIMESTAMP date "%a, %d %b %Y %H:%M:%S +0000" UTC)
file(WRITE ${PROJECT_BINARY_DIR}/changelog "orv (${PROJECT_VERSION}) unstable; urgency=medium\n\n"
  "  * What is new is told in CHANGELOG.md of the sources.\n\n -- ${CPACK_PACKAGE_CONTACT}  ${date}\n")
execute_process(COMMAND gzip --best --no-name --stdout ${PROJECT_BINARY_DIR}/changelog
  OUTPUT_FILE ${PROJECT_BINARY_DIR}/changelog.gz COMMAND_ERROR_IS_FATAL ANY)
orv_package(shared liborv0 libs "messages of an invitation protocol"
  "Shared libraries: eighteen message types as C++ values, their JSON form, their\nenvelopes, and where two of them differ.")
orv_package(library liborv-dev libdevel "messages of an invitation protocol, to build with"
  "Headers, CMake and pkg-config files, and the schema for other languages.")
orv_package(command orv-tools utils "command for the messages of an invitation protocol"
  "Shows, makes, explains, converts and compares messages and captures of them.")
orv_package(service orv-service net "background service of an invitation protocol"
  "A service that systemd starts once.")

set(sameVersion "(= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_SHARED_PACKAGE_CONTROL_EXTRA ${PROJECT_SOURCE_DIR}/cmake/triggers)
set(CPACK_DEBIAN_SHARED_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_LIBRARY_PACKAGE_DEPENDS "liborv0 ${sameVersion}")
set(CPACK_DEBIAN_COMMAND_PACKAGE_DEPENDS "liborv0 ${sameVersion}")
include(CPack)
