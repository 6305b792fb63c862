# Installing the library: headers as <orv/…>, and find_package(orv) giving orv::messages. Its components come with
# find_package(orv COMPONENTS compare envelope json testing), those that were built; pkg-config calls them orv-compare and
# so on. What a program needs when it runs is the component `shared`, what it is built with `library`.
include(CMakePackageConfigHelpers)
include(GNUInstallDirs)

set(orvPackageDirectory ${CMAKE_INSTALL_LIBDIR}/cmake/orv)
set(orvPkgConfigDirectory ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
set(orvPrefix)
cmake_path(RELATIVE_PATH CMAKE_INSTALL_PREFIX BASE_DIRECTORY ${CMAKE_INSTALL_PREFIX}/${orvPkgConfigDirectory}
  OUTPUT_VARIABLE orvPrefix)
set(orvIsStatic TRUE)
if(BUILD_SHARED_LIBS)
  set(orvIsStatic FALSE)
endif()

# A library, under the name that it has in the project, with the headers of its include folders. What pkg-config
# says of it: what it is and, where all is linked statically, which other packages it needs.
function(orv_install component orvDescription orvRequires)
  set(target orv_${component})
  install(TARGETS ${target} EXPORT ${target}Targets COMPONENT library
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT shared NAMELINK_COMPONENT library
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR}
    INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
  install(EXPORT ${target}Targets NAMESPACE orv:: DESTINATION ${orvPackageDirectory} COMPONENT library)
  foreach(folder IN LISTS ARGN)
    install(DIRECTORY ${PROJECT_SOURCE_DIR}/${folder}/orv COMPONENT library
      DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}
      FILES_MATCHING PATTERN "*.hpp")
  endforeach()
  get_target_property(orvFile ${target} OUTPUT_NAME)
  if(NOT orvFile)
    return()  # headers alone
  endif()
  string(REPLACE _ - orvName ${orvFile})
  configure_file(${CMAKE_CURRENT_FUNCTION_LIST_DIR}/orv.pc.in ${PROJECT_BINARY_DIR}/${orvName}.pc @ONLY)
  install(FILES ${PROJECT_BINARY_DIR}/${orvName}.pc DESTINATION ${orvPkgConfigDirectory} COMPONENT library)
endfunction()

set(runtimePackages)
if(orvIsStatic)
  set(runtimePackages "protobuf-lite libutf8proc")
endif()
orv_install(messages "The messages of an invitation protocol" "${runtimePackages}"
  runtime runtime/spelling messages/core messages/connection messages/join messages/group messages)
orv_install(compare "Where two of orv's messages differ" orv compare)
orv_install(envelope "Which payload an envelope of orv's carries" orv envelope)
if(TARGET orv_json)
  orv_install(json "The messages of orv as JSON" orv json)
endif()
if(TARGET orv_testing)
  orv_install(testing "" "" testing)
endif()

install(FILES ${PROJECT_SOURCE_DIR}/proto/orv.proto COMPONENT library DESTINATION ${CMAKE_INSTALL_DATADIR}/orv)

configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/orvConfig.cmake.in ${PROJECT_BINARY_DIR}/orvConfig.cmake
  INSTALL_DESTINATION ${orvPackageDirectory})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/orvConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/orvConfig.cmake ${PROJECT_BINARY_DIR}/orvConfigVersion.cmake COMPONENT library
  DESTINATION ${orvPackageDirectory})

# What shows the values in gdb, which loads it of itself with the shared library.
set(orvPrinters ${CMAKE_INSTALL_DATADIR}/orv)
set(orvPrintersName orv-gdb.py)
if(BUILD_SHARED_LIBS)
  set(orvPrinters ${CMAKE_INSTALL_DATADIR}/gdb/auto-load${CMAKE_INSTALL_FULL_LIBDIR})
  set(orvPrintersName liborv.so.${PROJECT_VERSION}-gdb.py)
endif()
install(FILES ${PROJECT_SOURCE_DIR}/tools/gdb/orv.py COMPONENT library DESTINATION ${orvPrinters}
  RENAME ${orvPrintersName})

if(TARGET orv_service)
  set(orvService ${CMAKE_INSTALL_FULL_LIBEXECDIR}/orv/orv_service)
  configure_file(${PROJECT_SOURCE_DIR}/service/orv.service.in ${PROJECT_BINARY_DIR}/orv.service @ONLY)
  install(TARGETS orv_service COMPONENT service DESTINATION ${CMAKE_INSTALL_LIBEXECDIR}/orv)
  install(FILES ${PROJECT_BINARY_DIR}/orv.service COMPONENT service DESTINATION lib/systemd/system)
endif()

if(ORV_BUILD_TESTS)
  add_test(NAME Build.AnInstalledLibraryServesItsUsers
    COMMAND ${CMAKE_COMMAND} -DBUILD=${PROJECT_BINARY_DIR} -DCONSUMER=${PROJECT_SOURCE_DIR}/examples/custom
      -DGENERATOR=${CMAKE_GENERATOR} -DCOMPILER=${CMAKE_CXX_COMPILER} "-DFLAGS=${CMAKE_CXX_FLAGS}"
      -P ${PROJECT_SOURCE_DIR}/cmake/test_installation.cmake)
  set_tests_properties(Build.AnInstalledLibraryServesItsUsers PROPERTIES TIMEOUT 600)
endif()
