# SPDX-License-Identifier: Apache-2.0
# Targets that see only the headers that their dependencies allow.
#
# Includes are written from the root of the tree ("ticket/PartialMode.h"), but the root itself is on
# no include path, because that would expose every header to every target. Instead, each target
# publishes its headers as links in its own folder in the build tree. Its include path has that
# folder and those of the targets that it links.
#
#   tintgate_target(NAME KIND                 STATIC, SHARED, MODULE, EXECUTABLE or HEADERS
#     HEADERS  a.h ...                        published headers, relative to the current folder
#     PRIVATE_HEADERS  b.h ...                headers included only by this target's sources
#     SOURCES  a.cpp ...
#     EXPOSES  target ...                     targets needed by the published headers
#     LINKS    target ...)                    targets needed only by the sources
#
# Generated headers have their own targets (see cmake/ExitCodes.cmake).

# Recreated at every configuration, so that no moved header or target stays in its old place. Three
# folders have generated headers, which the build creates.
file(GLOB _published "${PROJECT_BINARY_DIR}/see/*")
list(FILTER _published EXCLUDE REGEX "/(exitcodes|statuses|textkeys)$")
if(_published)
  file(REMOVE_RECURSE ${_published})
endif()

function(_tintgate_publish_headers target folder)
  file(RELATIVE_PATH _here "${PROJECT_SOURCE_DIR}" "${CMAKE_CURRENT_SOURCE_DIR}")
  foreach(_header IN LISTS ARGN)
    get_filename_component(_from "${_header}" ABSOLUTE)
    file(RELATIVE_PATH _name "${PROJECT_SOURCE_DIR}" "${_from}")
    get_filename_component(_dir "${folder}/${_name}" DIRECTORY)
    file(MAKE_DIRECTORY "${_dir}")
    file(CREATE_LINK "${_from}" "${folder}/${_name}" SYMBOLIC)
  endforeach()
endfunction()

function(tintgate_target target kind)
  cmake_parse_arguments(T "" "" "HEADERS;PRIVATE_HEADERS;SOURCES;EXPOSES;LINKS" ${ARGN})
  if(T_UNPARSED_ARGUMENTS)
    message(FATAL_ERROR "${target}: unexpected ${T_UNPARSED_ARGUMENTS}")
  endif()

  set(_public "${PROJECT_BINARY_DIR}/see/${target}")
  set(_private "${PROJECT_BINARY_DIR}/see/${target}.own")
  file(MAKE_DIRECTORY "${_public}" "${_private}")
  _tintgate_publish_headers(${target} "${_public}" ${T_HEADERS})
  _tintgate_publish_headers(${target} "${_private}" ${T_PRIVATE_HEADERS})

  if(kind STREQUAL "HEADERS")
    add_library(${target} INTERFACE)
    target_include_directories(${target} INTERFACE "${_public}")
    target_link_libraries(${target} INTERFACE ${T_EXPOSES})
  else()
    if(kind STREQUAL "EXECUTABLE")
      add_executable(${target} ${T_SOURCES})
    else()
      add_library(${target} ${kind} ${T_SOURCES})
    endif()
    target_include_directories(${target} PUBLIC "${_public}" PRIVATE "${_private}")
    target_link_libraries(${target} PUBLIC ${T_EXPOSES} PRIVATE ${T_LINKS})
    target_link_libraries(${target} PRIVATE tintgate_options)
  endif()

  # Input of the test of the dependencies.
  if(T_HEADERS)
    list(GET T_HEADERS 0 _first)
    get_filename_component(_first "${_first}" ABSOLUTE)
    file(RELATIVE_PATH _first "${PROJECT_SOURCE_DIR}" "${_first}")
    set_property(GLOBAL APPEND PROPERTY TINTGATE_PUBLISHED "${target}=${_first}")
  endif()
  if(NOT kind STREQUAL "HEADERS")
    set_property(GLOBAL APPEND PROPERTY TINTGATE_BUILT "${target}")
  endif()
endfunction()

# A test program. Its include path also has the private headers of the targets in LOOKS_INTO.
#
#   tintgate_test(NAME SOURCES a.cpp ... LINKS target ... [LOOKS_INTO target ...] [LABELS ...])
function(tintgate_test target)
  cmake_parse_arguments(T "" "TIMEOUT" "SOURCES;LINKS;LOOKS_INTO;ENVIRONMENT" ${ARGN})
  if(NOT T_TIMEOUT)
    set(T_TIMEOUT 300)
  endif()
  add_executable(${target} ${T_SOURCES})
  target_include_directories(${target} PRIVATE "${PROJECT_SOURCE_DIR}/tests/support")
  foreach(_inside IN LISTS T_LOOKS_INTO)
    target_include_directories(${target} PRIVATE "${PROJECT_BINARY_DIR}/see/${_inside}.own")
  endforeach()
  target_link_libraries(${target} PRIVATE ${T_LINKS} GTest::gmock GTest::gtest_main tintgate_options)
  target_compile_definitions(${target} PRIVATE
    TINTGATE_SOURCE_DIR="${PROJECT_SOURCE_DIR}" TINTGATE_BINARY_DIR="${PROJECT_BINARY_DIR}")
  # Only the code under test is worth optimising: this halves the compile time of tests. The headers
  # of the test framework are precompiled once (tests/support), with options that agree with those
  # of wx.
  target_compile_options(${target} PRIVATE -O0 -pthread -D_FILE_OFFSET_BITS=64)
  target_precompile_headers(${target} REUSE_FROM test_headers)
  add_test(NAME ${target} COMMAND ${target})
  # Programs write in the language of the user, who here reads English.
  set_tests_properties(${target} PROPERTIES TIMEOUT ${T_TIMEOUT}
    ENVIRONMENT "LANGUAGE=en;${T_ENVIRONMENT}")
endfunction()
