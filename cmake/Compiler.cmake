# Language, warnings and instrumentation, the same for every target of the tree.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_ARCHIVE_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/lib")
set(CMAKE_LIBRARY_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/lib")
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY "${CMAKE_BINARY_DIR}/bin")

find_program(VARNEL_CCACHE ccache)
if(VARNEL_CCACHE AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
  set(CMAKE_CXX_COMPILER_LAUNCHER "${VARNEL_CCACHE}")
endif()

# The library's own calls go to its own functions, and so may be inlined; see also its link options.
add_compile_options(-fno-semantic-interposition)

add_compile_options(-Wall -Wextra -Wpedantic -Wshadow -Wconversion)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
  # GCC 12 sees overlapping copies in plain assignments to strings (its bug 105651).
  add_compile_options(-Wno-restrict)
endif()
# Clang looks behind the links to headers, and in a checkout named varnel finds <Varnel/Platform/…> misspelled.
set(VARNEL_CLANG_AND_LINKS $<$<CXX_COMPILER_ID:Clang,AppleClang>:-Wno-nonportable-include-path>)
add_compile_options(${VARNEL_CLANG_AND_LINKS})
if(VARNEL_WARNINGS_AS_ERRORS)
  add_compile_options(-Werror)
endif()

if(VARNEL_SANITIZE)
  add_compile_options(-fsanitize=${VARNEL_SANITIZE} -fno-omit-frame-pointer
                      -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${VARNEL_SANITIZE})
  if(VARNEL_SANITIZE MATCHES "thread" AND CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # The sanitizer does not model stand-alone fences; the tree uses none, the standard library may.
    add_compile_options(-Wno-tsan)
  endif()
endif()
if(VARNEL_COVERAGE)
  add_compile_options(--coverage)
  add_link_options(--coverage)
endif()
