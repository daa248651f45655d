# SPDX-License-Identifier: Apache-2.0
#
# How everything here is built: language, warnings, visibility, sanitizers, where the products go, and one function a
# component. A component's public headers stand in its include/ folder and are all that others see of it; its internal
# headers stand beside its sources.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/lib)
set(CMAKE_ARCHIVE_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/archive)
# Programs find the libraries beside them, wherever the tree is moved to.
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)
set(TOVI_PLUGIN_DIRECTORY ${CMAKE_BINARY_DIR}/lib/tovicli/plugins)

# Code and what is only read share a segment: two mappings and page faults less for each library that a command loads.
add_link_options(-Wl,--as-needed -Wl,-O1 -Wl,-z,noseparate-code)
if(TOVI_SANITIZE)
  add_compile_options(-fsanitize=${TOVI_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=${TOVI_SANITIZE})
else()
  # Reports what a library still lacks when it is linked, not when it is loaded. What a library has itself (functions,
  # virtual tables, type information) needs no name looked up when it is loaded: nobody substitutes parts of one.
  add_link_options("$<$<STREQUAL:$<TARGET_PROPERTY:TYPE>,SHARED_LIBRARY>:-Wl,-z,defs,-Bsymbolic>")
endif()

if(TOVI_COVERAGE)
  # One file a binary, which is the memory that its processes count in (%c): what a process does that is killed, or that
  # leaves by _exit, is counted too. What several add to at once has to be added atomically.
  set(profiles "${CMAKE_BINARY_DIR}/profiles/%c%m.profraw")
  add_compile_options(-fprofile-instr-generate=${profiles} -fcoverage-mapping -fprofile-update=atomic "SHELL:-mllvm -runtime-counter-relocation")
  add_link_options(-fprofile-instr-generate=${profiles})
endif()

add_library(tovi_warnings INTERFACE)
target_compile_options(tovi_warnings INTERFACE -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Werror)
# Two warnings of g++ 12's optimizer cry wolf: std::variant inside a KJ promise counts as uninitialized, and joining a
# literal and a std::string as an overlapping copy. clang and the sanitizers look at the same code.
target_compile_options(tovi_warnings INTERFACE $<$<COMPILE_LANG_AND_ID:CXX,GNU>:-Wno-maybe-uninitialized -Wno-restrict>)

# tovi_component(<target> STATIC|SHARED SOURCES ... [PUBLIC targets...] [PRIVATE targets...])
function(tovi_component target type)
  cmake_parse_arguments(arg "" "" "SOURCES;PUBLIC;PRIVATE" ${ARGN})
  add_library(${target} ${type} ${arg_SOURCES})
  if(IS_DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR}/include)
    target_include_directories(${target} PUBLIC ${CMAKE_CURRENT_SOURCE_DIR}/include)
  endif()
  target_include_directories(${target} PRIVATE ${CMAKE_CURRENT_SOURCE_DIR})
  target_link_libraries(${target} PUBLIC ${arg_PUBLIC} PRIVATE tovi_warnings ${arg_PRIVATE})
endfunction()

# tovi_program(<target> SOURCES ... LIBRARIES ...)
function(tovi_program target)
  cmake_parse_arguments(arg "" "" "SOURCES;LIBRARIES" ${ARGN})
  add_executable(${target} ${arg_SOURCES})
  target_include_directories(${target} PRIVATE ${CMAKE_CURRENT_SOURCE_DIR})
  target_link_libraries(${target} PRIVATE tovi_warnings ${arg_LIBRARIES})
endfunction()
