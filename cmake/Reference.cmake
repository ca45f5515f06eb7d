# The target "reference": pages of the public headers and of docs/, in the build folder's reference/. It
# compiles nothing, and fails with a warning of Doxygen's.
find_program(VARNEL_DOXYGEN doxygen)
if(NOT VARNEL_DOXYGEN)
  return()
endif()
get_property(reference_input GLOBAL PROPERTY VARNEL_TESTING_HEADERS)
foreach(floor IN ITEMS VarnelPlatform Basalt Tallyhouse VarnelSources)
  get_property(headers GLOBAL PROPERTY VARNEL_PUBLIC_HEADERS_${floor})
  list(APPEND reference_input ${headers})
endforeach()
file(GLOB pages CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/docs/*.md")
list(APPEND reference_input ${pages} "${PROJECT_SOURCE_DIR}/README.md" "${PROJECT_SOURCE_DIR}/CONTRIBUTING.md")
list(JOIN reference_input "\" \\\n  \"" reference_input)
string(PREPEND reference_input "\"")
string(APPEND reference_input "\"")
configure_file("${PROJECT_SOURCE_DIR}/docs/Doxyfile.in" "${CMAKE_BINARY_DIR}/Doxyfile" @ONLY)
add_custom_target(reference COMMAND "${VARNEL_DOXYGEN}" "${CMAKE_BINARY_DIR}/Doxyfile"
  WORKING_DIRECTORY "${PROJECT_SOURCE_DIR}" COMMENT "Writing ${CMAKE_BINARY_DIR}/reference" VERBATIM)
