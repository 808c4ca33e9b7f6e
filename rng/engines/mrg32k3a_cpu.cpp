// SPDX-License-Identifier: Apache-2.0
// Constructors of mrg32k3a. The two modes are ways of a GPU.
#include <initializer_list>
#include <utility>

#include "frame/engine_seeding.hpp"

namespace kestrel::tarn::rng {

mrg32k3a::mrg32k3a(sycl::queue queue_, std::uint32_t seed) : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mrg32k3a>(queue, seed);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed)
    : engine_base(std::move(queue_)) {
  impl = detail::impl_from<mrg32k3a>(queue, detail::count_of(seed), seed.begin());
}

namespace {

[[noreturn]] void refuse_mode(const sycl::queue& queue) {
  if (queue.get_device().is_gpu()) {
    throw unimplemented("rng", "mrg32k3a", "sub-sequence modes");
  }
  throw unsupported_device("rng", "mrg32k3a", queue.get_device());
}

}  // namespace

mrg32k3a::mrg32k3a(sycl::queue queue_, std::uint32_t, mrg32k3a_mode::optimal)
    : engine_base(std::move(queue_)) {
  refuse_mode(queue);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::uint32_t, mrg32k3a_mode::custom)
    : engine_base(std::move(queue_)) {
  refuse_mode(queue);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t>, mrg32k3a_mode::optimal)
    : engine_base(std::move(queue_)) {
  refuse_mode(queue);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t>, mrg32k3a_mode::custom)
    : engine_base(std::move(queue_)) {
  refuse_mode(queue);
}

}  // namespace kestrel::tarn::rng
