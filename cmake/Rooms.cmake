# Every folder with a CMakeLists.txt of its own is a room and is found without being listed.

function(pelliko_add_rooms)
  foreach(room IN LISTS ARGN)
    if(EXISTS "${CMAKE_CURRENT_SOURCE_DIR}/${room}/CMakeLists.txt")
      add_subdirectory(${room})
    endif()
  endforeach()
endfunction()

# Adds every direct sub-folder of the current one that is a room.
function(pelliko_add_sub_rooms)
  file(GLOB lists CONFIGURE_DEPENDS "${CMAKE_CURRENT_SOURCE_DIR}/*/CMakeLists.txt")
  foreach(list IN LISTS lists)
    get_filename_component(room "${list}" DIRECTORY)
    add_subdirectory("${room}")
  endforeach()
endfunction()

# pelliko_library(NAME SOURCES... [PUBLIC libs...] [PRIVATE libs...])
# A static library with the project's warnings whose own folder is its public include directory,
# so that callers include a platform header by the platform's own name.
function(pelliko_library name)
  cmake_parse_arguments(arg "" "" "SOURCES;PUBLIC;PRIVATE" ${ARGN})
  add_library(${name} STATIC ${arg_SOURCES})
  target_include_directories(${name} PUBLIC "${CMAKE_CURRENT_SOURCE_DIR}")
  target_link_libraries(${name} PUBLIC ${arg_PUBLIC} PRIVATE pelliko_options ${arg_PRIVATE})
endfunction()

# pelliko_precompile(TARGET HEADERS...): headers of ready-made parts that most files of TARGET begin with are
# parsed once. Only where the tests are built, again and again; the release build shows that each file still
# includes what it uses, and its compile commands suit other compilers' tools.
function(pelliko_precompile target)
  if(PELLIKO_TESTS)
    target_precompile_headers(${target} PRIVATE ${ARGN})
  endif()
endfunction()

# pelliko_program(NAME SOURCES... [LIBS libs...] [HIDDEN]): a program that is installed and put into bin/ of the build;
# a HIDDEN one, which nobody types, into libexec/.
function(pelliko_program name)
  cmake_parse_arguments(arg "HIDDEN" "" "SOURCES;LIBS" ${ARGN})
  add_executable(${name} ${arg_SOURCES})
  target_link_libraries(${name} PRIVATE pelliko_options ${arg_LIBS})
  if(arg_HIDDEN)
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/libexec")
    install(TARGETS ${name} RUNTIME DESTINATION ${CMAKE_INSTALL_LIBEXECDIR})
  else()
    install(TARGETS ${name} RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
  endif()
endfunction()

# Where the system looks for configuration, which is /etc for what is installed below /usr/local too.
set(pelliko_system_etc "${CMAKE_INSTALL_SYSCONFDIR}")
if(CMAKE_INSTALL_PREFIX MATCHES "^/usr(/local)?/?$")
  set(pelliko_system_etc /etc)
endif()

# Where programs look for their modules, seen from their own folder: the same in the build tree and installed.
file(RELATIVE_PATH pelliko_module_dir "${CMAKE_INSTALL_FULL_BINDIR}" "${CMAKE_INSTALL_FULL_LIBDIR}/pelliko")

# pelliko_module(NAME SOURCES... [LIBS libs...]): a part of programs that they load when they need it
# (platform/common/Module.h), NAME.so. Whoever loads it depends on the target NAME.
function(pelliko_module name)
  cmake_parse_arguments(arg "" "" "SOURCES;LIBS" ${ARGN})
  add_library(${name} MODULE ${arg_SOURCES})
  set_target_properties(${name} PROPERTIES PREFIX "" LIBRARY_OUTPUT_DIRECTORY "${CMAKE_RUNTIME_OUTPUT_DIRECTORY}/${pelliko_module_dir}"
                        CXX_VISIBILITY_PRESET hidden VISIBILITY_INLINES_HIDDEN ON)
  target_link_libraries(${name} PRIVATE pelliko_options ${arg_LIBS})
  # The background service loads all of them, and every other program needs that service.
  install(TARGETS ${name} LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}/pelliko" COMPONENT service)
endfunction()

# pelliko_activatable(BUS_NAME PROGRAM [UNIT unit] [HIDDEN]): the bus starts PROGRAM when somebody calls BUS_NAME.
# A bus that systemd runs leaves that to the user unit, where systemd would find the installed one.
# The build tree's file (for sessions) names the program where it was built, the installed one where it goes.
function(pelliko_activatable bus_name program)
  cmake_parse_arguments(arg "HIDDEN" "UNIT" "" ${ARGN})
  set(SYSTEMD_SERVICE "")
  set(built "${CMAKE_RUNTIME_OUTPUT_DIRECTORY}")
  set(installed "${CMAKE_INSTALL_FULL_BINDIR}")
  if(arg_HIDDEN)
    set(built "${CMAKE_BINARY_DIR}/libexec")
    set(installed "${CMAKE_INSTALL_FULL_LIBEXECDIR}")
  endif()
  set(EXEC "${built}/${program}")
  set(BUS_NAME "${bus_name}")
  configure_file("${PROJECT_SOURCE_DIR}/dbus/activation.service.in"
                 "${CMAKE_BINARY_DIR}/dbus-services/${bus_name}.service" @ONLY)
  set(EXEC "${installed}/${program}")
  if(arg_UNIT AND CMAKE_INSTALL_PREFIX MATCHES "^/usr(/local)?/?$")
    set(SYSTEMD_SERVICE "SystemdService=${arg_UNIT}\n")
  endif()
  configure_file("${PROJECT_SOURCE_DIR}/dbus/activation.service.in"
                 "${CMAKE_CURRENT_BINARY_DIR}/${bus_name}.service" @ONLY)
  install(FILES "${CMAKE_CURRENT_BINARY_DIR}/${bus_name}.service"
          DESTINATION "${CMAKE_INSTALL_DATADIR}/dbus-1/services")
endfunction()

# pelliko_dbus_interface(TARGET XML PREFIX NAMESPACE): a static library of the code that gdbus-codegen
# makes from dbus/XML; include it as <XML's base name>.h.
function(pelliko_dbus_interface target xml prefix namespace)
  get_filename_component(base "${xml}" NAME_WLE)
  set(dir "${CMAKE_CURRENT_BINARY_DIR}/${target}")
  file(MAKE_DIRECTORY "${dir}")
  set(source "${PROJECT_SOURCE_DIR}/dbus/${xml}")
  add_custom_command(
    OUTPUT "${dir}/${base}.c" "${dir}/${base}.h"
    COMMAND ${GDBUS_CODEGEN} --interface-prefix ${prefix} --c-namespace ${namespace}
            --c-generate-autocleanup all --header --output "${dir}/${base}.h" "${source}"
    COMMAND ${GDBUS_CODEGEN} --interface-prefix ${prefix} --c-namespace ${namespace}
            --c-generate-autocleanup all --body --output "${dir}/${base}.c" "${source}"
    DEPENDS "${source}" VERBATIM)
  add_library(${target} STATIC "${dir}/${base}.c" "${dir}/${base}.h")
  target_include_directories(${target} SYSTEM PUBLIC "${dir}")
  target_link_libraries(${target} PUBLIC PkgConfig::gio)
endfunction()
