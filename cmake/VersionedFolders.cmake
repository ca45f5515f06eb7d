# Where what the library loads at run time lies, below the prefix. The paths bear the version that
# breaks compatibility, so that two of them stand side by side.

set(VARNEL_VERSIONED_NAME "varnel-${PROJECT_VERSION_MAJOR}.${PROJECT_VERSION_MINOR}")
foreach(kind IN ITEMS LIB DATA)
  set(folder "${CMAKE_INSTALL_${kind}DIR}")
  if(IS_ABSOLUTE "${folder}")
    # The library looks from its own place, wherever the prefix has been moved to.
    file(RELATIVE_PATH folder "${CMAKE_INSTALL_PREFIX}" "${folder}")
  endif()
  set(VARNEL_${kind}_FOLDER "${folder}/${VARNEL_VERSIONED_NAME}")
endforeach()

# In the build tree the modules lie beside the library as well.
set(VARNEL_MODULES_OUTPUT_FOLDER "${CMAKE_BINARY_DIR}/lib/${VARNEL_VERSIONED_NAME}")

# What other builds find the libraries by: the CMake package, and the way from the files of pkg-config to
# the prefix.
set(VARNEL_PACKAGE_FOLDER "${CMAKE_INSTALL_LIBDIR}/cmake/Varnel")
file(RELATIVE_PATH VARNEL_PREFIX_FROM_PKGCONFIG
     "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig" "${CMAKE_INSTALL_PREFIX}")
file(RELATIVE_PATH VARNEL_LIBRARIES_FROM_PREFIX "${CMAKE_INSTALL_PREFIX}" "${CMAKE_INSTALL_FULL_LIBDIR}")
file(RELATIVE_PATH VARNEL_HEADERS_FROM_PREFIX "${CMAKE_INSTALL_PREFIX}" "${CMAKE_INSTALL_FULL_INCLUDEDIR}")

# The way from the programs to the library, and from the notifier's folder.
file(RELATIVE_PATH VARNEL_LIBRARIES_FROM_PROGRAMS
     "${CMAKE_INSTALL_FULL_BINDIR}" "${CMAKE_INSTALL_FULL_LIBDIR}")
file(RELATIVE_PATH VARNEL_LIBRARIES_FROM_NOTIFIER
     "${CMAKE_INSTALL_FULL_LIBEXECDIR}/${VARNEL_VERSIONED_NAME}" "${CMAKE_INSTALL_FULL_LIBDIR}")
