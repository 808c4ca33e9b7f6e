// SPDX-License-Identifier: Apache-2.0
// The kernels of chi_square that make a result of several variates drawn before: the sum of squares
// of normals, and minus twice the logarithm of a product of uniforms.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::gpu {

///@{
/// `n` results, the i-th of the `each` variates from scratch[i * each] on, which no kernel writes
/// any more: standard normals, or uniforms of [0, 1). `Out` is T* or sycl::buffer<T, 1>.
/// Asynchronous.
template <typename T, typename Out>
sycl::event chi_square_gauss_post_process(sycl::queue& queue, std::int64_t n, std::int32_t each,
                                          const T* scratch, Out out);
template <typename T, typename Out>
sycl::event chi_square_ln_post_process(sycl::queue& queue, std::int64_t n, std::int32_t each,
                                       const T* scratch, Out out);
///@}

}  // namespace kestrel::tarn::rng::detail::gpu
