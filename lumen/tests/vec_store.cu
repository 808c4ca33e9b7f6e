// SPDX-License-Identifier: Apache-2.0
// Stores through pointers to vecs. check_vec_store.cmake reads what nvcc makes of them.
#include <sycl/sycl.hpp>

__global__ void store_float4(sycl::float4* to, float x) {
  to[threadIdx.x] = sycl::float4(x) * sycl::float4(1, 2, 3, 4);
}
__global__ void store_uint4(sycl::uint4* to, const sycl::uint4* from) {
  const sycl::uint4 x = from[threadIdx.x];
  to[threadIdx.x] = x + 1U;
}
__global__ void store_double4(sycl::double4* to, double x) {
  to[threadIdx.x] = sycl::double4(x, -x, 1, 2);
}
