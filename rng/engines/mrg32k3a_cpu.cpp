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

template <typename... Arguments>
detail::owned_impl<mrg32k3a> impl_on_gpu(sycl::queue& queue, Arguments... arguments) {
  if (!queue.get_device().is_gpu()) {
    throw unsupported_device("rng", "mrg32k3a", queue.get_device());
  }
  return detail::owned_impl<mrg32k3a>(detail::gpu::create_engine<mrg32k3a>(queue, arguments...));
}

}  // namespace

mrg32k3a::mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::optimal mode)
    : engine_base(std::move(queue_)) {
  impl = impl_on_gpu(queue, seed, mode);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::custom mode)
    : engine_base(std::move(queue_)) {
  impl = impl_on_gpu(queue, seed, mode);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
                   mrg32k3a_mode::optimal mode)
    : engine_base(std::move(queue_)) {
  impl = impl_on_gpu(queue, detail::count_of(seed), seed.begin(), mode);
}

mrg32k3a::mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
                   mrg32k3a_mode::custom mode)
    : engine_base(std::move(queue_)) {
  impl = impl_on_gpu(queue, detail::count_of(seed), seed.begin(), mode);
}

}  // namespace kestrel::tarn::rng
