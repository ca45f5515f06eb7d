# The floors of the tree. Each is an object library; code includes its headers below the one name of the
# framework (<Varnel/Platform/Ports/Clock.h>, <Varnel/Logging/Logger.h>), in the tree through links under
# the build's include folder and in an installation alike.

set(VARNEL_INCLUDE_ROOT "${CMAKE_BINARY_DIR}/include")
if(IS_SYMLINK "${VARNEL_INCLUDE_ROOT}/Varnel")
  file(REMOVE_RECURSE "${VARNEL_INCLUDE_ROOT}")  # An older build's, which pointed into the tree.
endif()

# varnel_floor(TARGET PREFIX): declares the floor of the current folder, with headers under PREFIX: a
# folder of Varnel, or Varnel itself, which then gets a link for each folder of the floor.
function(varnel_floor target prefix)
  set(folders "")
  if(prefix STREQUAL "Varnel")
    file(GLOB folders RELATIVE "${CMAKE_CURRENT_SOURCE_DIR}" "${CMAKE_CURRENT_SOURCE_DIR}/*/CMakeLists.txt")
    list(TRANSFORM folders REPLACE "(.*)/CMakeLists.txt" "/\\1")
  endif()
  file(MAKE_DIRECTORY "${VARNEL_INCLUDE_ROOT}/Varnel")
  foreach(folder IN LISTS folders ITEMS "")
    set(link "${VARNEL_INCLUDE_ROOT}/${prefix}${folder}")
    if(NOT EXISTS "${link}")
      file(CREATE_LINK "${CMAKE_CURRENT_SOURCE_DIR}${folder}" "${link}" SYMBOLIC)
    endif()
  endforeach()
  add_library(${target} OBJECT)
  target_include_directories(${target} PUBLIC "${VARNEL_INCLUDE_ROOT}")
  target_link_libraries(${target} PUBLIC Threads::Threads)
  set_target_properties(${target} PROPERTIES
    VARNEL_PREFIX "${prefix}" VARNEL_ROOT "${CMAKE_CURRENT_SOURCE_DIR}")
endfunction()

# varnel_uses(TARGET LIBRARY…): the floor is built on libraries from outside the tree. A static framework
# passes them on to its hosts.
function(varnel_uses target)
  target_link_libraries(${target} PRIVATE ${ARGN})
  set_property(GLOBAL APPEND PROPERTY VARNEL_OUTSIDE_LIBRARIES ${ARGN})
endfunction()

# varnel_module(TARGET FILE SOURCES SOURCE…): a part of the framework that is loaded when it is first
# needed (Platform/POSIX/Modules.h), so that only hosts that need it pay for its libraries.
function(varnel_module target file)
  cmake_parse_arguments(ARG "" "" "SOURCES" ${ARGN})
  add_library(${target} MODULE ${ARG_SOURCES})
  target_include_directories(${target} PRIVATE "${VARNEL_INCLUDE_ROOT}")
  set_target_properties(${target} PROPERTIES
    PREFIX "" OUTPUT_NAME "${file}" LIBRARY_OUTPUT_DIRECTORY "${VARNEL_MODULES_OUTPUT_FOLDER}")
  set(exported "${PROJECT_SOURCE_DIR}/cmake/module.map")
  target_link_options(${target} PRIVATE "LINKER:--version-script=${exported}")
  set_target_properties(${target} PROPERTIES LINK_DEPENDS "${exported}")
  install(TARGETS ${target} LIBRARY DESTINATION "${VARNEL_LIB_FOLDER}")
  set_property(GLOBAL APPEND PROPERTY VARNEL_MODULES ${target})
endfunction()

# varnel_sources(TARGET [PUBLIC_HEADERS …] [SOURCES …]): adds the current folder's files to a floor.
# Public headers are installed and compiled alone; other headers need no listing.
function(varnel_sources target)
  cmake_parse_arguments(ARG "" "" "PUBLIC_HEADERS;SOURCES" ${ARGN})
  get_target_property(prefix ${target} VARNEL_PREFIX)
  get_target_property(root ${target} VARNEL_ROOT)
  foreach(source IN LISTS ARG_SOURCES)
    target_sources(${target} PRIVATE "${CMAKE_CURRENT_SOURCE_DIR}/${source}")
  endforeach()
  foreach(header IN LISTS ARG_PUBLIC_HEADERS)
    file(RELATIVE_PATH relative "${root}" "${CMAKE_CURRENT_SOURCE_DIR}/${header}")
    set_property(GLOBAL APPEND PROPERTY VARNEL_PUBLIC_HEADERS_${target}
                 "${VARNEL_INCLUDE_ROOT}/${prefix}/${relative}")
  endforeach()
endfunction()
