# Programs that try inputs nobody thought of (tests/fuzz). They need Clang, which the debug build has.

# What -fsanitize=fuzzer-no-link asks for, in the form that files with a precompiled header can have too.
set(PELLIKO_FUZZ_COUNTERS -fsanitize-coverage=inline-8bit-counters,pc-table,indirect-calls,trace-cmp,stack-depth)
set(PELLIKO_FUZZING OFF)
if(PELLIKO_TESTS AND CMAKE_CXX_COMPILER_ID STREQUAL Clang)
  set(PELLIKO_FUZZING ON)
endif()

# pelliko_fuzzed(SOURCES...): the branches of these files of a room are counted, so that the fuzzer sees which
# input leads to a new place. Only files that read what comes from outside: it costs time wherever they run.
function(pelliko_fuzzed)
  if(PELLIKO_FUZZING)
    set_property(SOURCE ${ARGN} APPEND PROPERTY COMPILE_OPTIONS ${PELLIKO_FUZZ_COUNTERS})
  endif()
endfunction()

# pelliko_fuzz_target(NAME [LIBS libs...] [OPTIONS options...]): the folder NAME beside this list has Target.cpp, the
# inputs to begin with in corpus/ and words worth trying in dictionary. The test runs all inputs, then made-up ones for
# ten seconds, the same in every run, so that a change is to blame for what it finds, which is kept in the build tree.
# OPTIONS are the fuzzer's own.
function(pelliko_fuzz_target name)
  cmake_parse_arguments(arg "" "" "LIBS;OPTIONS" ${ARGN})
  set(program fuzz_${name})
  set(folder "${CMAKE_CURRENT_SOURCE_DIR}/${name}")
  add_executable(${program} ${name}/Target.cpp)
  set_target_properties(${program} PROPERTIES RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/tests")
  target_include_directories(${program} PRIVATE "${CMAKE_CURRENT_SOURCE_DIR}")
  target_compile_options(${program} PRIVATE ${PELLIKO_FUZZ_COUNTERS})
  target_link_options(${program} PRIVATE -fsanitize=fuzzer)
  target_link_libraries(${program} PRIVATE pelliko_options ${arg_LIBS})
  file(MAKE_DIRECTORY "${CMAKE_BINARY_DIR}/fuzz/${name}/corpus" "${CMAKE_BINARY_DIR}/fuzz/${name}/findings")
  # scripts/fuzz runs the same words for longer.
  string(JOIN " " options ${arg_OPTIONS})
  file(WRITE "${CMAKE_BINARY_DIR}/fuzz/${name}/options" "${options}\n")
  pelliko_script_test(${program}
    COMMAND "${PROJECT_SOURCE_DIR}/scripts/fuzz" --build "${CMAKE_BINARY_DIR}" --fresh --seed 1 --seconds 10 ${name})
endfunction()
