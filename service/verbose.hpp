// SPDX-License-Identifier: Apache-2.0
// Verbose reporting of public calls: what the library itself uses besides
// kestrel/tarn/gpu/verbose.hpp, the clocks around calls into buffers.
#pragma once

#include "kestrel/tarn/gpu/verbose.hpp"

namespace kestrel::tarn::gpu {

/// In mode 2, waits for earlier work on the buffer; in every mode enters a reported call and
/// starts the clock by storing the negated time.
template <typename T>
void verbose_buffer_start(double* seconds, sycl::buffer<T, 1>& buffer);

/// The counterpart: leaves the reported call; `*seconds` then holds the elapsed time.
template <typename T>
void verbose_buffer_end(double* seconds, sycl::buffer<T, 1>& buffer);

}  // namespace kestrel::tarn::gpu
