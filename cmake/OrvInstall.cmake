# Installing the library: headers as <orv/…>, and find_package(orv) giving orv::messages. Its components come
# with find_package(orv COMPONENTS compare envelope json testing), those that were built.
include(CMakePackageConfigHelpers)
include(GNUInstallDirs)

set(orvPackageDirectory ${CMAKE_INSTALL_LIBDIR}/cmake/orv)

# A library, under the name that it has in the project, with the headers of its include folders.
function(orv_install target exportSet)
  string(REPLACE "orv_" "" exportName ${target})
  set_target_properties(${target} PROPERTIES EXPORT_NAME ${exportName})
  install(TARGETS ${target} EXPORT ${exportSet} COMPONENT library
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR}
    INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
  install(EXPORT ${exportSet} NAMESPACE orv:: DESTINATION ${orvPackageDirectory} COMPONENT library)
  foreach(folder IN LISTS ARGN)
    install(DIRECTORY ${PROJECT_SOURCE_DIR}/${folder}/orv COMPONENT library
      DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}
      FILES_MATCHING PATTERN "*.hpp")
  endforeach()
endfunction()

orv_install(orv_messages orv_messagesTargets
  runtime runtime/spelling messages/core messages/connection messages/join messages/group messages)
foreach(component IN ITEMS compare envelope json testing)
  if(TARGET orv_${component})
    orv_install(orv_${component} orv_${component}Targets ${component})
  endif()
endforeach()

install(FILES ${PROJECT_SOURCE_DIR}/proto/orv.proto COMPONENT library DESTINATION ${CMAKE_INSTALL_DATADIR}/orv)

configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/orvConfig.cmake.in ${PROJECT_BINARY_DIR}/orvConfig.cmake
  INSTALL_DESTINATION ${orvPackageDirectory})
write_basic_package_version_file(${PROJECT_BINARY_DIR}/orvConfigVersion.cmake COMPATIBILITY SameMinorVersion)
install(FILES ${PROJECT_BINARY_DIR}/orvConfig.cmake ${PROJECT_BINARY_DIR}/orvConfigVersion.cmake COMPONENT library
  DESTINATION ${orvPackageDirectory})

if(ORV_BUILD_TESTS)
  add_test(NAME Build.AnInstalledLibraryServesItsUsers
    COMMAND ${CMAKE_COMMAND} -DBUILD=${PROJECT_BINARY_DIR} -DCONSUMER=${PROJECT_SOURCE_DIR}/examples/custom
      -DGENERATOR=${CMAKE_GENERATOR} -DCOMPILER=${CMAKE_CXX_COMPILER} "-DFLAGS=${CMAKE_CXX_FLAGS}"
      -P ${PROJECT_SOURCE_DIR}/cmake/test_installation.cmake)
  set_tests_properties(Build.AnInstalledLibraryServesItsUsers PROPERTIES TIMEOUT 600)
endif()
