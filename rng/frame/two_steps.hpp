// SPDX-License-Identifier: Apache-2.0
// Calls in two steps, for engines whose work-items cannot give the words of a result together: a
// first kernel draws words into memory of the call's own, a second one makes results of them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include <sycl/sycl.hpp>

#include "frame/kernel_launch.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail {

/// The words between the two kernels.
using drawn_words = call_memory<std::uint32_t, sycl::usm::alloc::device>;

/// Submits the second kernel behind the first, `words->last_kernel`, and behind it a task of the
/// host that lets go of the words, so that the caller need not wait. Returns the event of the
/// second kernel.
sycl::event submit_second_step(sycl::queue& queue, const std::shared_ptr<drawn_words>& words,
                               const kernel_launch& kernel);

}  // namespace kestrel::tarn::rng::detail
