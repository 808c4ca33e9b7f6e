// SPDX-License-Identifier: Apache-2.0
// What every header of lumen starts from: the version macros of SYCL 2020, the inline namespace
// that gives the ABI its name, symbol visibility and the annotation of device functions.
#pragma once

#define SYCL_LANGUAGE_VERSION 202012L
#define SYCL_IMPLEMENTATION_LUMEN 1

#define LUMEN_NAMESPACE_BEGIN \
  namespace sycl {            \
  inline namespace lumen_1 {
#define LUMEN_NAMESPACE_END \
  }                         \
  }

// The library hides everything by default; this marks what its users link against.
#define LUMEN_EXPORT __attribute__((visibility("default")))

// Functions that kernels may call. Empty where host code runs the kernels.
#if defined(__CUDACC__)
#define SYCL_EXTERNAL __host__ __device__
#else
#define SYCL_EXTERNAL
#endif
