# varnel_product(TARGET NAME name [IDENTIFIER id] [VERSION version] [ARRANGE_VERSION version]
#                [CHANNEL site|appstore|marketta] [PRIVATE_BETA ON] [DEBUG_MODE ON]
#                [REDIRECT_HOST host] [COOKIE_DOMAIN domain] [DESKTOP entry] [ICON icon])
#
# Declares which product a program is: see <Varnel/Context/Product.h>. The shared library belongs to no
# product and serves them all.
#
#     add_executable(fotovia main.cpp)
#     target_link_libraries(fotovia PRIVATE Varnel::Varnel)
#     varnel_product(fotovia NAME "Fotovia 3" IDENTIFIER com.quennel.site.Fotovia3 VERSION 3.1
#                    CHANNEL site)
#
# TARGET is the program, or a library that all programs of the product link: then each of them compiles
# the declaration itself. VERSION is the project's unless given, ARRANGE_VERSION the VERSION. A product
# without a CHANNEL stops as soon as it is asked for one.

set(VARNEL_PRODUCT_TEMPLATE "${CMAKE_CURRENT_LIST_DIR}/Product.cpp.in")

function(varnel_product target)
  cmake_parse_arguments(PARSE_ARGV 1 PRODUCT "" "NAME;IDENTIFIER;VERSION;ARRANGE_VERSION;CHANNEL;\
PRIVATE_BETA;DEBUG_MODE;REDIRECT_HOST;COOKIE_DOMAIN;DESKTOP;ICON" "")
  if(PRODUCT_UNPARSED_ARGUMENTS)
    message(FATAL_ERROR "varnel_product(${target}) does not know ${PRODUCT_UNPARSED_ARGUMENTS}")
  endif()
  if(NOT PRODUCT_NAME)
    message(FATAL_ERROR "varnel_product(${target}) needs a NAME")
  endif()
  if(PRODUCT_CHANNEL AND NOT PRODUCT_CHANNEL MATCHES "^(site|appstore|marketta)$")
    message(FATAL_ERROR "varnel_product(${target}): CHANNEL is '${PRODUCT_CHANNEL}'; it must be "
                        "site, appstore or marketta")
  endif()
  if(NOT PRODUCT_VERSION)
    set(PRODUCT_VERSION "${PROJECT_VERSION}")
  endif()
  if(NOT PRODUCT_ARRANGE_VERSION)
    set(PRODUCT_ARRANGE_VERSION "${PRODUCT_VERSION}")
  endif()

  foreach(switch IN ITEMS site appstore marketta private_beta debug_mode)
    set(is_${switch} false)
  endforeach()
  if(PRODUCT_CHANNEL)
    set(is_${PRODUCT_CHANNEL} true)
  endif()
  if(PRODUCT_PRIVATE_BETA)
    set(is_private_beta true)
  endif()
  if(PRODUCT_DEBUG_MODE)
    set(is_debug_mode true)
  endif()

  set(declaration "${CMAKE_CURRENT_BINARY_DIR}/${target}.product.cpp")
  configure_file("${VARNEL_PRODUCT_TEMPLATE}" "${declaration}" @ONLY)
  get_target_property(type ${target} TYPE)
  if(type MATCHES "^(EXECUTABLE|SHARED_LIBRARY|MODULE_LIBRARY)$")
    target_sources(${target} PRIVATE "${declaration}")
  else()
    target_sources(${target} INTERFACE "${declaration}")
  endif()
endfunction()
