# What a build of the framework may choose. What belongs to a product comes from varnel_product
# (VarnelProduct.cmake), program by program.

set(VARNEL_BUILD_NUMBER "1" CACHE STRING "The framework's build number")
# git writes the revision into the file when it makes a tarball.
file(STRINGS "${CMAKE_CURRENT_LIST_DIR}/SourceVersion.txt" source_version REGEX "^[0-9a-f]+$")
string(SUBSTRING "${source_version}" 0 12 source_version)
set(VARNEL_SOURCE_VERSION "${source_version}" CACHE STRING "The source revision that a release is built from")

# The system whose adapters are built, a folder of Platform/; see docs/porting.md.
set(VARNEL_SYSTEM "${CMAKE_SYSTEM_NAME}" CACHE STRING "Linux, or Bare: POSIX alone")
set_property(CACHE VARNEL_SYSTEM PROPERTY STRINGS Linux Bare)

if(PROJECT_IS_TOP_LEVEL)
  option(BUILD_SHARED_LIBS "Build the framework as a shared library" ON)
elseif(NOT DEFINED BUILD_SHARED_LIBS)
  set(BUILD_SHARED_LIBS ON)  # Here alone: what a host that contains this tree makes of its libraries is its own.
endif()
option(VARNEL_BUILD_TESTS "Build the tests" ${PROJECT_IS_TOP_LEVEL})
option(VARNEL_BUILD_EXAMPLES "Build the examples" ${PROJECT_IS_TOP_LEVEL})
option(VARNEL_BUILD_BENCHMARKS "Build the benchmarks, which are Linux's" OFF)
option(VARNEL_BUILD_FUZZERS "Build the fuzzers (Clang)" OFF)
option(VARNEL_WARNINGS_AS_ERRORS "Treat warnings as errors" ${PROJECT_IS_TOP_LEVEL})
set(VARNEL_SANITIZE "" CACHE STRING "Sanitizers, separated by commas: address,undefined or thread")
option(VARNEL_COVERAGE "Record code coverage" OFF)
