# Tests run by ctest. A test that needs more than its own files runs in a private world
# (scripts/session), so that several may run at the same time and nothing is left behind.

# The thread option is for all alike, or the headers compiled beforehand would not fit every program.
set(pelliko_test_options ${PELLIKO_FEWER_CHECKS} -pthread)

if(PELLIKO_TESTS)
  enable_testing()
endif()

# pelliko_test_headers(NAME HEADERS... [LIBS libs...]): what many test files begin with, compiled once for all
# their programs. Only headers of ready-made parts belong here: a change of our own then never rebuilds it,
# and each file still includes what it uses. Headers that few use do not: what their inline functions need
# of templates is made again in every file.
function(pelliko_test_headers name)
  cmake_parse_arguments(arg "" "" "LIBS" ${ARGN})
  set(source "${CMAKE_BINARY_DIR}/${name}.cpp")
  file(CONFIGURE OUTPUT "${source}" CONTENT "")
  add_library(${name} OBJECT "${source}")
  set_target_properties(${name} PROPERTIES POSITION_INDEPENDENT_CODE OFF)
  target_compile_options(${name} PRIVATE -fPIE ${pelliko_test_options})
  target_link_libraries(${name} PRIVATE pelliko_options GTest::gmock ${arg_LIBS})
  target_precompile_headers(${name} PRIVATE ${arg_UNPARSED_ARGUMENTS}
    <gmock/gmock.h> <gtest/gtest.h>
    <algorithm> <array> <chrono> <filesystem> <fstream> <functional> <map> <memory> <optional> <string>
    <string_view> <vector>)
endfunction()

if(PELLIKO_TESTS)
  pelliko_test_headers(pelliko_test_headers)
endif()

# How a world is asked for: what scripts/session is to start beside the two buses.
set(pelliko_session_bus --no-display --no-server)
set(pelliko_session_display --no-server)
set(pelliko_session_server --no-display)
set(pelliko_session_modem --no-display --no-server --modem ofono:262011234567890,310150123456789)
set(pelliko_session_phone --modem ofono)
set(pelliko_session_cluster --no-server --modem ofono:234159900000100)
set(pelliko_session_full)

# pelliko_test(NAME SOURCES... [LIBS libs...] [SESSION none|bus|display|server|modem|phone|cluster|full] [TIMEOUT seconds]
#              [PRECOMPILED headers])
# One GoogleTest program; NAME names the module under test.
function(pelliko_test name)
  cmake_parse_arguments(arg "" "SESSION;TIMEOUT;PRECOMPILED" "SOURCES;LIBS" ${ARGN})
  add_executable(${name} ${arg_SOURCES})
  set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/tests")
  target_link_libraries(${name} PRIVATE pelliko_options ${arg_LIBS} GTest::gmock GTest::gtest_main)
  target_compile_options(${name} PRIVATE ${pelliko_test_options})
  if(NOT arg_PRECOMPILED)
    set(arg_PRECOMPILED pelliko_test_headers)
  endif()
  target_precompile_headers(${name} REUSE_FROM ${arg_PRECOMPILED})
  target_compile_definitions(${name} PRIVATE PELLIKO_SOURCE_DIR="${PROJECT_SOURCE_DIR}"
                                             PELLIKO_BUILD_DIR="${CMAKE_BINARY_DIR}")
  if(NOT arg_SESSION)
    set(arg_SESSION none)
  endif()
  if(arg_SESSION STREQUAL none)
    add_test(NAME ${name} COMMAND ${name})
  else()
    pelliko_session_command(command ${arg_SESSION} $<TARGET_FILE:${name}>)
    add_test(NAME ${name} COMMAND ${command})
  endif()
  pelliko_test_properties(${name} "${arg_TIMEOUT}")
endfunction()

# pelliko_script_test(NAME COMMAND words... [SESSION ...] [TIMEOUT seconds]): a test that is a script.
function(pelliko_script_test name)
  cmake_parse_arguments(arg "" "SESSION;TIMEOUT" "COMMAND" ${ARGN})
  if(NOT arg_SESSION OR arg_SESSION STREQUAL none)
    set(command ${arg_COMMAND})
  else()
    pelliko_session_command(command ${arg_SESSION} ${arg_COMMAND})
  endif()
  add_test(NAME ${name} COMMAND ${command})
  pelliko_test_properties(${name} "${arg_TIMEOUT}")
endfunction()

# pelliko_engines_test(NAME COMMAND words... [TIMEOUT seconds]): a script that starts the engines which only a share
# server of many machines needs; run by ./test --engines alone.
function(pelliko_engines_test name)
  pelliko_script_test(${name} ${ARGN})
  set_tests_properties(${name} PROPERTIES LABELS engines)
endfunction()

function(pelliko_session_command out kind)
  set(${out} "${PROJECT_SOURCE_DIR}/scripts/session" --build "${CMAKE_BINARY_DIR}"
      ${pelliko_session_${kind}} -- ${ARGN} PARENT_SCOPE)
endfunction()

# The time ends a test that hangs. Where other machines take most of the processor a test may need five times as long
# as usual.
function(pelliko_test_properties name timeout)
  if(NOT timeout)
    set(timeout 300)
  endif()
  set_tests_properties(${name} PROPERTIES TIMEOUT ${timeout} ENVIRONMENT
    "ASAN_OPTIONS=detect_leaks=0:abort_on_error=0;ASAN_SYMBOLIZER_PATH=/usr/lib/llvm-16/bin/llvm-symbolizer;UBSAN_OPTIONS=print_stacktrace=1")
endfunction()
