// SPDX-License-Identifier: Apache-2.0
// Kernels that the discrete families share.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::gpu {

/// Fills `n` elements with `value`, for parameters that leave no choice. `Out` is std::int32_t* or
/// a buffer of them. Asynchronous.
template <typename Out>
sycl::event fill_single_num(sycl::queue& queue, std::int64_t n, Out out, std::int32_t value);

}  // namespace kestrel::tarn::rng::detail::gpu
