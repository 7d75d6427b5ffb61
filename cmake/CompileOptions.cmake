# One place for what every target is compiled with.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")

option(PELLIKO_TESTS "Build the tests" OFF)
option(PELLIKO_COVERAGE "Count covered lines" OFF)
set(PELLIKO_SANITIZE "" CACHE STRING "Sanitizers to build with, for example address,undefined")

# ccache makes a second build of the same sources cheap; it is used when it is there.
find_program(PELLIKO_CCACHE ccache)
if(PELLIKO_CCACHE)
  set(CMAKE_C_COMPILER_LAUNCHER "${PELLIKO_CCACHE}")
  # Without these it never stores what was compiled with a precompiled header.
  set(CMAKE_CXX_COMPILER_LAUNCHER "${CMAKE_COMMAND}" -E env
      CCACHE_SLOPPINESS=pch_defines,time_macros "${PELLIKO_CCACHE}")
  if(PELLIKO_TESTS AND CMAKE_CXX_COMPILER_ID STREQUAL GNU)
    add_compile_options($<$<COMPILE_LANGUAGE:CXX>:-fpch-preprocess>)
  endif()
endif()

add_compile_definitions(_FILE_OFFSET_BITS=64)
if(NOT PELLIKO_SANITIZE)
  add_compile_definitions($<$<CONFIG:RelWithDebInfo>:_FORTIFY_SOURCE=2>)
endif()

# The debug build trades debugger detail for build time: two cores build it for every test run.
set(CMAKE_CXX_FLAGS_DEBUG "-O0 -g1")
set(CMAKE_C_FLAGS_DEBUG "-O0 -g1")
set(CMAKE_CXX_FLAGS_RELWITHDEBINFO "-O2 -g1")
set(CMAKE_C_FLAGS_RELWITHDEBINFO "-O2 -g1")

add_library(pelliko_warnings INTERFACE)
target_compile_options(pelliko_warnings INTERFACE
  -Wall -Wextra -Wpedantic -Werror
  -Wshadow -Wformat=2 -Wundef -Wimplicit-fallthrough
  $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor -Woverloaded-virtual -Wextra-semi -Wold-style-cast
    -Wcast-qual -Wsuggest-override>)
# GLib's macros meet the first two of these warnings of Clang, and a translated text is a format that is no literal.
# GCC, which builds the release, checks our own code for all three.
set(PELLIKO_CLANG_WARNINGS -Wno-cast-qual -Wno-unused-variable -Wno-format-nonliteral)
target_compile_options(pelliko_warnings INTERFACE
  "$<$<AND:$<COMPILE_LANGUAGE:C>,$<C_COMPILER_ID:Clang>>:${PELLIKO_CLANG_WARNINGS}>"
  "$<$<AND:$<COMPILE_LANGUAGE:CXX>,$<CXX_COMPILER_ID:Clang>>:${PELLIKO_CLANG_WARNINGS}>")

add_library(pelliko_options INTERFACE)
target_link_libraries(pelliko_options INTERFACE pelliko_warnings)
if(PELLIKO_SANITIZE)
  add_compile_options(-fsanitize=${PELLIKO_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=undefined)
  add_link_options(-fsanitize=${PELLIKO_SANITIZE})
  # An enumeration of a C interface holds any int: an unknown value is refused with an error, which tests try.
  add_compile_options($<$<CXX_COMPILER_ID:Clang>:-fno-sanitize=enum>)
endif()
# For the test sources themselves: these two checks take a third of the time in which the test framework's
# templates are compiled. What is tested keeps every check.
if(PELLIKO_SANITIZE MATCHES undefined)
  set(PELLIKO_FEWER_CHECKS -fno-sanitize=null,alignment)
endif()
if(PELLIKO_COVERAGE)
  add_compile_options(--coverage)
  add_link_options(--coverage)
endif()
