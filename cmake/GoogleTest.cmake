# SPDX-License-Identifier: Apache-2.0
#
# include(GoogleTest) gives GTest::gtest_main, GTest::gmock_main and gtest_discover_tests in every build. The installed
# library has one width only; a 32-bit build compiles GoogleTest from the sources that Debian installs beside it.
# Stands in front of CMake's module of the same name and takes that in.
include(${CMAKE_ROOT}/Modules/GoogleTest.cmake)

if(TARGET GTest::gtest_main)
  return()
endif()

if(TOVI_ABI32)
  set(INSTALL_GTEST OFF CACHE INTERNAL "")
  set(BUILD_GMOCK ON CACHE INTERNAL "")
  add_subdirectory(/usr/src/googletest ${CMAKE_BINARY_DIR}/googletest EXCLUDE_FROM_ALL SYSTEM)
  foreach(library gtest gtest_main gmock gmock_main)
    target_compile_options(${library} PRIVATE -w)
    if(NOT TARGET GTest::${library})
      add_library(GTest::${library} ALIAS ${library})
    endif()
  endforeach()
else()
  find_package(GTest REQUIRED)
  # Imported targets are seen only from where they were found, but the first include may stand in a sibling folder.
  foreach(library gtest gtest_main gmock gmock_main)
    set_target_properties(GTest::${library} PROPERTIES IMPORTED_GLOBAL TRUE)
  endforeach()
endif()
