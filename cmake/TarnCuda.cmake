# SPDX-License-Identifier: Apache-2.0
# Kernels for CUDA devices: the compiler, the architectures, and how the house's rules are said to
# nvcc. No GPU is needed to build.
if(NOT TARN_SYCL STREQUAL "lumen")
  message(FATAL_ERROR "TARN_CUDA needs TARN_SYCL=lumen: another SYCL has CUDA devices of its own")
endif()
if(TARN_SANITIZE)
  message(FATAL_ERROR "TARN_CUDA and TARN_SANITIZE exclude each other: nvcc's code cannot be watched")
endif()

# Machine code for the GPU that is here, else for the two common generations of data centres.
if(NOT DEFINED CMAKE_CUDA_ARCHITECTURES)
  if(EXISTS /dev/nvidia0)
    set(CMAKE_CUDA_ARCHITECTURES native)
  else()
    set(CMAKE_CUDA_ARCHITECTURES 80 90)
  endif()
endif()
find_program(TARN_NVCC nvcc HINTS ENV CUDA_PATH ENV CUDA_HOME /usr/local/cuda PATH_SUFFIXES bin)
if(TARN_NVCC AND NOT CMAKE_CUDA_COMPILER)
  set(CMAKE_CUDA_COMPILER "${TARN_NVCC}")
endif()
set(CMAKE_CUDA_STANDARD 17)
set(CMAKE_CUDA_STANDARD_REQUIRED ON)
set(CMAKE_CUDA_EXTENSIONS OFF)
set(CMAKE_CUDA_VISIBILITY_PRESET hidden)
enable_language(CUDA)
find_package(CUDAToolkit REQUIRED)

add_compile_options(
  # Constexpr functions of the standard library, such as numeric_limits, in kernels.
  $<$<COMPILE_LANGUAGE:CUDA>:--expt-relaxed-constexpr>
  # Contraction is a decision of the source, on devices as on the host.
  $<$<COMPILE_LANGUAGE:CUDA>:--fmad=false>
  $<$<COMPILE_LANGUAGE:CUDA>:-Xcompiler=-ffp-contract=off>)
