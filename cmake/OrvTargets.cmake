# What all targets of the project share.

set(CMAKE_CXX_STANDARD 23)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
# What a shared library shows is in exported.map.
if(NOT BUILD_SHARED_LIBS)
  set(CMAKE_CXX_VISIBILITY_PRESET hidden)
endif()
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)

if(PROJECT_IS_TOP_LEVEL AND NOT CMAKE_BUILD_TYPE AND NOT CMAKE_CONFIGURATION_TYPES)
  set(CMAKE_BUILD_TYPE RelWithDebInfo)
endif()
find_package(PkgConfig REQUIRED)
pkg_check_modules(PROTOBUF_LITE REQUIRED IMPORTED_TARGET protobuf-lite)
pkg_check_modules(UTF8PROC REQUIRED IMPORTED_TARGET libutf8proc)
pkg_check_modules(XXHASH REQUIRED libxxhash)  # its header alone

# Warnings are errors in the project's own sources, unless it is part of another project, whose compiler may
# know more of them.
function(orv_warnings target)
  target_compile_options(${target} PRIVATE -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
  if(PROJECT_IS_TOP_LEVEL)
    target_compile_options(${target} PRIVATE -Werror)
  endif()
  # With -O3 g++ 12 finds overlaps in std::string's operator+ (GCC bug 105651), and accesses out of bounds where
  # it made one function of two that are the same.
  if(CMAKE_CXX_COMPILER_ID STREQUAL GNU AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
    target_compile_options(${target} PRIVATE $<$<CONFIG:Release>:-Wno-restrict -Wno-array-bounds>)
  endif()
endfunction()

# How the library's own code is compiled: docs/decisions/exception-neutral.md. Without unwind tables no exception
# gets through it and leaves a message half changed: running out of memory ends the program where it happens.
option(ORV_EXCEPTIONS "Let exceptions pass through the library; OFF: running out of memory ends the program" ON)
set(ORV_WITHOUT_EXCEPTIONS -fno-exceptions -fno-rtti -fno-unwind-tables -fno-asynchronous-unwind-tables)
function(orv_exceptions target)
  if(NOT ORV_EXCEPTIONS)
    target_compile_options(${target} PRIVATE ${ORV_WITHOUT_EXCEPTIONS})
  endif()
endfunction()

# What all code of the library is compiled with: a program gets what it uses alone where it links with
# --gc-sections, and the library calls its own functions, whatever the program defines.
function(orv_library_options target)
  orv_warnings(${target})
  target_compile_options(${target} PRIVATE -ffunction-sections -fdata-sections
    $<$<BOOL:${BUILD_SHARED_LIBS}>:-fno-semantic-interposition>)
endfunction()

# A library for users, orv::<name>: static, or shared with BUILD_SHARED_LIBS. Its file has the name that follows.
function(orv_library name file)
  add_library(orv_${name} ${ARGN})
  add_library(orv::${name} ALIAS orv_${name})
  orv_library_options(orv_${name})
  target_compile_features(orv_${name} PUBLIC cxx_std_23)
  set_target_properties(orv_${name} PROPERTIES
    EXPORT_NAME ${name} OUTPUT_NAME ${file} LINKER_LANGUAGE CXX VERSION ${PROJECT_VERSION} SOVERSION 0)
  if(BUILD_SHARED_LIBS)
    set(exported ${PROJECT_SOURCE_DIR}/cmake/exported.map)
    target_link_options(orv_${name} PRIVATE
      LINKER:--version-script=${exported} LINKER:-Bsymbolic-functions,-z,defs LINKER:--as-needed)
    set_target_properties(orv_${name} PROPERTIES LINK_DEPENDS ${exported})
  endif()
endfunction()

# A layer of the library: the folder `name` beside the calling CMakeLists.txt (or that folder itself), whose
# headers are the `orv` folder in it. It sees its own headers and those of the layers that it uses, no others,
# so that an include that turns an arrow does not compile.
function(orv_layer name)
  cmake_parse_arguments(PARSE_ARGV 1 layer "" "" "USES;SOURCES")
  set(folder ${CMAKE_CURRENT_SOURCE_DIR})
  if(IS_DIRECTORY ${folder}/${name})
    string(APPEND folder /${name})
  endif()
  add_library(orv_${name} OBJECT ${layer_SOURCES})
  set_target_properties(orv_${name} PROPERTIES ORV_FOLDER ${folder})
  orv_library_options(orv_${name})
  orv_exceptions(orv_${name})
  target_compile_features(orv_${name} PUBLIC cxx_std_23)
  target_include_directories(orv_${name} PUBLIC ${folder})
  list(TRANSFORM layer_USES PREPEND orv_)
  target_link_libraries(orv_${name} PUBLIC ${layer_USES})
endfunction()
