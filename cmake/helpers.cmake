# Small helpers for the folders' own CMakeLists.txt.

# zqvissvc_sources(<variable> <glob>...): every matching source; folders need no list of files.
function(zqvissvc_sources variable)
  list(TRANSFORM ARGN PREPEND ${CMAKE_CURRENT_SOURCE_DIR}/)
  file(GLOB found CONFIGURE_DEPENDS ${ARGN})
  set(${variable} ${found} PARENT_SCOPE)
endfunction()

# zqvissvc_host_program(<target> <source>...): a program with the reference host inside. The
# library finds the host services by name in the running program, so it must export them; on
# Windows the host's own declarations do that.
function(zqvissvc_host_program target)
  add_executable(${target} ${ARGN})
  target_link_libraries(${target} PRIVATE refhost)
  if(NOT WIN32)
    set_target_properties(${target} PROPERTIES ENABLE_EXPORTS ON)
  endif()
  target_include_directories(${target} PRIVATE ${PROJECT_BINARY_DIR}/generated)
endfunction()

# zqvissvc_string_resources(<source>...): resource sources of this folder's targets include the list
# of strings; the resource compiler does not report that.
function(zqvissvc_string_resources)
  set_property(SOURCE ${ARGN} APPEND PROPERTY OBJECT_DEPENDS
               ${PROJECT_SOURCE_DIR}/src/base/string_table.def)
endfunction()

# zqvissvc_static_program(<target> <source>...): the same with the whole library inside, for
# programs that look behind the exported functions.
function(zqvissvc_static_program target)
  zqvissvc_host_program(${target} ${ARGN})
  target_link_libraries(${target} PRIVATE zqvissvc_core zqvissvc_exports)
  if(WIN32)
    target_sources(${target} PRIVATE ${ZQVISSVC_RESOURCES})
    zqvissvc_string_resources(${ZQVISSVC_RESOURCES})
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR}/src)
  endif()
endfunction()
