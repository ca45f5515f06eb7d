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
# TARGET is the program, or a library that all programs of the product link: of one without files of
# its own (INTERFACE) each program compiles the declaration itself. A target declares one product.
# VERSION is the project's unless given, ARRANGE_VERSION the VERSION. A product without a CHANNEL stops
# as soon as it is asked for one.

function(varnel_product target)
  set(texts NAME IDENTIFIER VERSION ARRANGE_VERSION CHANNEL REDIRECT_HOST COOKIE_DOMAIN DESKTOP ICON)
  # What is not given is looked for in the host's cache: the prefix is one that nobody else has.
  cmake_parse_arguments(PARSE_ARGV 1 varnel_product "" "${texts};PRIVATE_BETA;DEBUG_MODE" "")
  if(varnel_product_UNPARSED_ARGUMENTS)
    message(FATAL_ERROR
            "varnel_product(${target}) does not know ${varnel_product_UNPARSED_ARGUMENTS}")
  endif()
  # Any text is a name, and any a version: "Off" and "0" too.
  if("${varnel_product_NAME}" STREQUAL "")
    message(FATAL_ERROR "varnel_product(${target}) needs a NAME")
  endif()
  set(channel "${varnel_product_CHANNEL}")
  if(NOT channel MATCHES "^(site|appstore|marketta|)$")
    message(FATAL_ERROR "varnel_product(${target}): CHANNEL is '${channel}'; it must be site, "
                        "appstore or marketta")
  endif()
  get_property(is_declared TARGET ${target} PROPERTY VARNEL_PRODUCT SET)
  if(is_declared)
    message(FATAL_ERROR "varnel_product(${target}): the target declares a product already")
  endif()
  set_property(TARGET ${target} PROPERTY VARNEL_PRODUCT "${varnel_product_NAME}")
  if("${varnel_product_VERSION}" STREQUAL "")
    set(varnel_product_VERSION "${PROJECT_VERSION}")
  endif()
  if("${varnel_product_ARRANGE_VERSION}" STREQUAL "")
    set(varnel_product_ARRANGE_VERSION "${varnel_product_VERSION}")
  endif()

  foreach(switch IN ITEMS site appstore marketta private_beta debug_mode)
    set(is_${switch} false)
  endforeach()
  if(channel)
    set(is_${channel} true)
  endif()
  if(varnel_product_PRIVATE_BETA)
    set(is_private_beta true)
  endif()
  if(varnel_product_DEBUG_MODE)
    set(is_debug_mode true)
  endif()
  foreach(text IN LISTS texts)
    string(REGEX REPLACE "([\"\\\\?])" "\\\\\\1" ${text} "${varnel_product_${text}}")
    string(REPLACE "\n" "\\n" ${text} "${${text}}")
  endforeach()

  set(declaration "${CMAKE_CURRENT_BINARY_DIR}/${target}.product.cpp")
  configure_file("${CMAKE_CURRENT_FUNCTION_LIST_DIR}/Product.cpp.in" "${declaration}" @ONLY)
  get_target_property(type ${target} TYPE)
  if(type STREQUAL "INTERFACE_LIBRARY")
    target_sources(${target} INTERFACE "${declaration}")
  else()
    target_sources(${target} PRIVATE "${declaration}")
  endif()
endfunction()
