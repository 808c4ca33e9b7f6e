# SPDX-License-Identifier: Apache-2.0
# What `cmake --install` brings: the libraries, the public headers, the Fortran modules, the CMake
# package `tarn` and the pkg-config modules. The installed tree may be moved: every path in it is
# relative, and the libraries find one another beside themselves ($ORIGIN).
include(CMakePackageConfigHelpers)

# The core is installed because the others are linked to it; its header is no public one.
set(TARN_INSTALLED tarn_core tarn_statistics tarn_rng tarn_sycl)
if(TARN_SYCL STREQUAL "lumen")
  list(APPEND TARN_INSTALLED tarn_lumen)
endif()

# Below 1.0 a new minor version may break its users.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/tarn-config-version.cmake"
                                 COMPATIBILITY SameMinorVersion)

# tarn_pkg_config(NAME DESCRIPTION CFLAGS LIBS): a .pc file that finds its prefix from its own
# place. For tarn_install, whose variables it uses.
function(tarn_pkg_config name description cflags libs)
  file(RELATIVE_PATH up "/prefix/${libdir}/pkgconfig" /prefix)
  string(REGEX REPLACE "/$" "" up "${up}")
  configure_file(cmake/module.pc.in "${made}/${name}.pc" @ONLY)
  install(FILES "${made}/${name}.pc" DESTINATION ${libdir}/pkgconfig ${development})
endfunction()

# tarn_install(LIBDIR RUNTIME DEVELOPMENT [EXCLUDE_FROM_ALL]): the rules for one place of the
# libraries below the prefix. Component RUNTIME is what programs need when they run, DEVELOPMENT
# what they need to be built.
function(tarn_install libdir runtime_component development_component)
  set(made "${PROJECT_BINARY_DIR}/install/${development_component}")
  set(development COMPONENT ${development_component} ${ARGN})

  install(TARGETS ${TARN_INSTALLED} EXPORT ${development_component}
          LIBRARY DESTINATION ${libdir} COMPONENT ${runtime_component}
                  NAMELINK_COMPONENT ${development_component} ${ARGN})

  install(DIRECTORY rng/include/ service/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} ${development})
  install(FILES statistics/include/tarn_rvx.h offload/include/tarn_rvx_offload.h
                "${PROJECT_BINARY_DIR}/include/tarn_version.h"
          DESTINATION ${CMAKE_INSTALL_INCLUDEDIR} ${development})
  # Sources: a compiler of Fortran reads no modules but its own.
  set(fortran_dir ${CMAKE_INSTALL_INCLUDEDIR}/tarn/fortran)
  install(FILES statistics/fortran/tarn_rvx.f90 offload/fortran/tarn_rvx_offload.f90
          DESTINATION ${fortran_dir} ${development})
  if(TARN_SYCL STREQUAL "lumen")
    # Below a folder of its own, so that it never hides another SYCL's headers.
    install(DIRECTORY lumen/include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/tarn/lumen ${development})
  endif()

  set(package_dir ${libdir}/cmake/tarn)
  install(EXPORT ${development_component} NAMESPACE tarn:: FILE tarn-targets.cmake
          DESTINATION ${package_dir} ${development})
  configure_package_config_file(cmake/tarn-config.cmake.in "${made}/tarn-config.cmake"
                                INSTALL_DESTINATION ${package_dir} PATH_VARS fortran_dir)
  install(FILES "${made}/tarn-config.cmake" "${PROJECT_BINARY_DIR}/tarn-config-version.cmake"
          DESTINATION ${package_dir} ${development})

  tarn_pkg_config(tarn_statistics "Streams of random words and variates on the host, for C and C++"
                  "-I\${includedir}" "-ltarn_vlx")
  if(TARN_SYCL STREQUAL "lumen")
    tarn_pkg_config(tarn_rng "Random numbers for SYCL devices, with an embedded SYCL runtime"
                    "-I\${includedir} -I\${includedir}/tarn/lumen" "-ltarn_rng -ltarn_lumen")
  else()
    # The SYCL compiler in use brings its own headers and libraries.
    tarn_pkg_config(tarn_rng "Random numbers for SYCL devices" "-I\${includedir}" "-ltarn_rng")
  endif()
endfunction()

tarn_install(${CMAKE_INSTALL_LIBDIR} tarn_runtime tarn_development)
