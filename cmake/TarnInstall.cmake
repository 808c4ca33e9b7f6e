# SPDX-License-Identifier: Apache-2.0
# What `cmake --install` brings: the libraries, the public headers, the CMake package `tarn` and
# the pkg-config modules. The installed tree may be moved: every path in it is relative, and the
# libraries find one another beside themselves ($ORIGIN).
include(CMakePackageConfigHelpers)

# The core is installed because the others are linked to it; its header is no public one.
set(TARN_INSTALLED tarn_core tarn_statistics tarn_rng tarn_sycl)
install(DIRECTORY rng/include/ service/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
install(FILES statistics/include/tarn_rvx.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})
if(TARN_SYCL STREQUAL "lumen")
  # Below a folder of its own, so that it never hides another SYCL's headers.
  list(APPEND TARN_INSTALLED tarn_lumen)
  install(DIRECTORY lumen/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/tarn/lumen)
endif()
install(TARGETS ${TARN_INSTALLED} EXPORT tarn_targets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})

set(TARN_PACKAGE_DIR ${CMAKE_INSTALL_LIBDIR}/cmake/tarn)
install(EXPORT tarn_targets NAMESPACE tarn:: FILE tarn-targets.cmake
        DESTINATION ${TARN_PACKAGE_DIR})
configure_package_config_file(cmake/tarn-config.cmake.in "${PROJECT_BINARY_DIR}/tarn-config.cmake"
                              INSTALL_DESTINATION ${TARN_PACKAGE_DIR})
# Below 1.0 a new minor version may break its users.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/tarn-config-version.cmake"
                                 COMPATIBILITY SameMinorVersion)
install(FILES "${PROJECT_BINARY_DIR}/tarn-config.cmake"
              "${PROJECT_BINARY_DIR}/tarn-config-version.cmake"
        DESTINATION ${TARN_PACKAGE_DIR})

# tarn_pkg_config(NAME DESCRIPTION CFLAGS LIBS): a .pc file that finds its prefix from its own
# place.
function(tarn_pkg_config name description cflags libs)
  file(RELATIVE_PATH up "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig" "${CMAKE_INSTALL_PREFIX}")
  string(REGEX REPLACE "/$" "" up "${up}")
  configure_file(cmake/module.pc.in "${PROJECT_BINARY_DIR}/${name}.pc" @ONLY)
  install(FILES "${PROJECT_BINARY_DIR}/${name}.pc"
          DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
endfunction()

tarn_pkg_config(tarn_statistics "Streams of random words and variates on the host, for C and C++"
                "-I\${includedir}" "-ltarn_vlx")
if(TARN_SYCL STREQUAL "lumen")
  tarn_pkg_config(tarn_rng "Random numbers for SYCL devices, with an embedded SYCL runtime"
                  "-I\${includedir} -I\${includedir}/tarn/lumen" "-ltarn_rng -ltarn_lumen")
else()
  # The SYCL compiler in use brings its own headers and libraries.
  tarn_pkg_config(tarn_rng "Random numbers for SYCL devices" "-I\${includedir}" "-ltarn_rng")
endif()
