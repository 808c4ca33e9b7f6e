# SPDX-License-Identifier: Apache-2.0
# Two Debian packages from one build, by CPack: the libraries that programs need when they run, and
# what programs are built with. docs/packages.md tells what is in them and why.
#
# Debian keeps libraries in a folder for each architecture, which the prefix of the build need not
# have; the packages therefore have install rules of their own, which `cmake --install` leaves out.
# The other scripts are in cmake/debian.
find_program(TARN_DPKG_SHLIBDEPS dpkg-shlibdeps)  # names the packages that libraries come from
find_program(TARN_FILE file)                      # by which CPack tells libraries from other files
mark_as_advanced(TARN_DPKG_SHLIBDEPS TARN_FILE)
set(TARN_PACKAGES OFF)
# Another SYCL is not Debian's, so that no package can name it.
if(NOT PROJECT_IS_TOP_LEVEL OR NOT TARN_SYCL STREQUAL "lumen"
   OR NOT TARN_DPKG_SHLIBDEPS OR NOT TARN_FILE OR NOT CMAKE_LIBRARY_ARCHITECTURE)
  return()
endif()
set(TARN_PACKAGES ON)

include(cmake/debian/maintainer.cmake)
set(runtime libtarn${TARN_SOVERSION})
set(development libtarn-dev)

tarn_install(lib/${CMAKE_LIBRARY_ARCHITECTURE} debian_runtime debian_development EXCLUDE_FROM_ALL)

# CPack leaves the rest of the papers to cmake/debian/finish.cmake.
configure_file(cmake/debian/copyright "${PROJECT_BINARY_DIR}/install/copyright" @ONLY)
foreach(package runtime development)
  set(papers DESTINATION share/doc/${${package}} COMPONENT debian_${package} EXCLUDE_FROM_ALL)
  install(FILES "${PROJECT_BINARY_DIR}/install/copyright" ${papers})
  install(FILES CHANGELOG.md RENAME changelog ${papers})
  install(FILES cmake/debian/${package}.lintian-overrides RENAME ${${package}}
          DESTINATION share/lintian/overrides COMPONENT debian_${package} EXCLUDE_FROM_ALL)
endforeach()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "")  # each package has its own
set(CPACK_VERBATIM_VARIABLES ON)
set(CPACK_PACKAGE_CONTACT "${maintainer}")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL debian_runtime debian_development)
set(CPACK_COMPONENTS_GROUPING IGNORE)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_PRE_BUILD_SCRIPTS "${PROJECT_SOURCE_DIR}/cmake/debian/finish.cmake")
set(CPACK_TARN_PACKAGES ${runtime} ${development})

set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
set(CPACK_DEBIAN_PACKAGE_SOURCE tarn)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(full_version ${PROJECT_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE})

set(CPACK_DEBIAN_DEBIAN_RUNTIME_PACKAGE_NAME ${runtime})
set(CPACK_DEBIAN_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
# For packages of programs that link the libraries: a later version of the same soname will do.
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS_POLICY ">=")
set(CPACK_DEBIAN_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA "${PROJECT_SOURCE_DIR}/cmake/debian/triggers")
# The loaders of native devices' drivers are looked for at run time, and nothing else is lost without them.
set(CPACK_DEBIAN_DEBIAN_RUNTIME_PACKAGE_SUGGESTS "ocl-icd-libopencl1 | libopencl1, libze1")
set(CPACK_COMPONENT_DEBIAN_RUNTIME_DESCRIPTION
"random numbers for heterogeneous machines - shared libraries
Engines (pseudo-random, quasi-random and nondeterministic) times
distributions, drawn by one call on processors and GPUs through SYCL, or
as streams from C and Fortran. One seed gives the same words on every
device and for every number of threads.
.
This package has the libraries that programs need when they run.")

set(CPACK_DEBIAN_DEBIAN_DEVELOPMENT_PACKAGE_NAME ${development})
set(CPACK_DEBIAN_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
# tarn_level_zero.h has types of libze-dev; all other headers need the language's own alone.
set(CPACK_DEBIAN_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "${runtime} (= ${full_version}), libze-dev")
set(CPACK_DEBIAN_DEBIAN_DEVELOPMENT_PACKAGE_SUGGESTS "cmake, gfortran, pkg-config")
set(CPACK_COMPONENT_DEBIAN_DEVELOPMENT_DESCRIPTION
"random numbers for heterogeneous machines - development files
Engines (pseudo-random, quasi-random and nondeterministic) times
distributions, drawn by one call on processors and GPUs through SYCL, or
as streams from C and Fortran.
.
This package has the headers, with those of the embedded SYCL runtime, and
the files for CMake and pkg-config.")

include(CPack)
