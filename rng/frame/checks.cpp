// SPDX-License-Identifier: Apache-2.0
// The checks of a call's count and output, once for all combinations.
#include "frame/checks.hpp"

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace kestrel::tarn::rng::detail {

void check_output(std::int64_t n, const void* r) {
  if (n < 0) {
    throw invalid_argument("rng", "generate", "n");
  }
  if (r == nullptr) {
    throw invalid_argument("rng", "generate", "r");
  }
}

void check_output(std::int64_t n, std::size_t buffer_size, std::int64_t values) {
  // Divided, not multiplied: n * values may not fit. A buffer smaller than n is always too small.
  const auto holds = static_cast<std::int64_t>(buffer_size);
  if (n < 0 || n > holds / std::max<std::int64_t>(values, 1)) {
    throw invalid_argument("rng", "generate", "n");
  }
}

void check_rates(std::size_t rates, std::int64_t n) {
  if (static_cast<std::int64_t>(rates) != n) {
    throw invalid_argument("rng", "poisson_v", "lambda size should be equal to n");
  }
}

device_type road_of(const sycl::queue& queue) {
  const sycl::device device = queue.get_device();
  if (device.is_cpu()) {
    return device_type::cpu;
  }
  if (device.is_gpu()) {
    return device_type::gpu;
  }
  refuse_device(queue);
}

void refuse_device(const sycl::queue& queue) {
  throw unsupported_device("rng", "generate", queue.get_device());
}

void refuse_on_gpu(const char* family, const char* method) {
  throw unimplemented(
      "rng", "generate",
      std::string(family) + " distribution with " + method + " method on a GPU device");
}

}  // namespace kestrel::tarn::rng::detail
