# What all targets of the project share.

set(CMAKE_CXX_STANDARD 23)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)

if(NOT CMAKE_BUILD_TYPE AND NOT CMAKE_CONFIGURATION_TYPES)
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
  orv_warnings(orv_${name})
  orv_exceptions(orv_${name})
  target_compile_features(orv_${name} PUBLIC cxx_std_23)
  target_include_directories(orv_${name} PUBLIC ${folder})
  list(TRANSFORM layer_USES PREPEND orv_)
  target_link_libraries(orv_${name} PUBLIC ${layer_USES})
endfunction()
