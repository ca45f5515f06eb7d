# What a build of the suite may choose. The build switches end up in the exported functions of
# Sources/Context/BuildSwitches.h; nothing reads them at run time.

set(VARNEL_CHANNEL "site" CACHE STRING "Distribution channel: site, appstore or marketta")
set_property(CACHE VARNEL_CHANNEL PROPERTY STRINGS site appstore marketta)
if(NOT VARNEL_CHANNEL MATCHES "^(site|appstore|marketta)$")
  message(FATAL_ERROR
    "VARNEL_CHANNEL is '${VARNEL_CHANNEL}'; it must be site, appstore or marketta")
endif()

option(VARNEL_PRIVATE_BETA "Build a private beta" OFF)
option(VARNEL_DEBUG_MODE "Build with debug mode on" OFF)
set(VARNEL_APP_NAME "Orvane 2" CACHE STRING "The application's name in texts")
set(VARNEL_APP_DISPLAY_VERSION "${PROJECT_VERSION}" CACHE STRING
    "The application's version as shown to the user")
set(VARNEL_APP_ARRANGE_VERSION "${VARNEL_APP_DISPLAY_VERSION}" CACHE STRING
    "The application's version as compared with others")

set(VARNEL_COOKIE_DOMAIN ".quennel.example" CACHE STRING
    "The domain of the vendor's web-analytics cookie, with its leading dot")
set(VARNEL_REDIRECT_HOST "links.quennel.example" CACHE STRING
    "Host of the service that links go through")

set(VARNEL_BUILD_NUMBER "1" CACHE STRING "The framework's build number")
set(VARNEL_SOURCE_VERSION "" CACHE STRING "The source revision that a release is built from")

option(BUILD_SHARED_LIBS "Build the framework as a shared library" ON)
option(VARNEL_BUILD_TESTS "Build the tests" ${PROJECT_IS_TOP_LEVEL})
option(VARNEL_BUILD_EXAMPLES "Build the examples" ${PROJECT_IS_TOP_LEVEL})
option(VARNEL_BUILD_BENCHMARKS "Build the benchmarks" OFF)
option(VARNEL_BUILD_FUZZERS "Build the fuzzers (Clang)" OFF)
option(VARNEL_WARNINGS_AS_ERRORS "Treat warnings as errors" ${PROJECT_IS_TOP_LEVEL})
set(VARNEL_SANITIZE "" CACHE STRING "Sanitizers, separated by commas: address,undefined or thread")
option(VARNEL_COVERAGE "Record code coverage" OFF)
