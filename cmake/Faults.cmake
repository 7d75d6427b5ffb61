# pelliko_faulty(TARGET LIBS libs...): where there is a fault plan (platform/faults), the calls that the static library TARGET
# makes of public headers of platform/ and service/ go through it. LIBS are the libraries that TARGET calls.
function(pelliko_faulty target)
  if(NOT TARGET platform_faults)
    return()
  endif()
  cmake_parse_arguments(arg "" "" "LIBS" ${ARGN})
  set(out "${CMAKE_BINARY_DIR}/platform/faults")
  # The file holds nothing: with it the library is made anew, and its calls renamed, when their list changes.
  target_sources(${target} PRIVATE "${out}/calls.cpp")
  set_source_files_properties("${out}/calls.cpp" PROPERTIES GENERATED ON)
  add_dependencies(${target} platform_fault_pieces)
  add_custom_command(TARGET ${target} POST_BUILD
    COMMAND ${CMAKE_OBJCOPY} "--redefine-syms=${out}/renames.txt" "$<TARGET_FILE:${target}>" VERBATIM)
  # The linker meets the pieces between the caller and what it calls.
  set_property(TARGET platform_fault_calls APPEND PROPERTY INTERFACE_LINK_LIBRARIES ${arg_LIBS})
  target_link_libraries(${target} PUBLIC platform_fault_calls)
endfunction()
