// SPDX-License-Identifier: Apache-2.0
// The kernel of philox4x32x10 and uniform<float> in both output forms. check_engine_stores.cmake
// reads what nvcc makes of them.
#include "distributions/uniform.hpp"
#include "engines/philox4x32x10.hpp"
#include "frame/engine_func.hpp"

namespace detail = kestrel::tarn::rng::detail;

template <typename Out>
using kernel = detail::engine_func<kestrel::tarn::rng::philox4x32x10, float, float,
                                   detail::gpu::uniform_std<float, float>, Out>;

using output = sycl::accessor<float, 1, sycl::access_mode::write>;

// Launches bring the kernels about.
void launch(sycl::handler& group, const kernel<float*>& pointer, const kernel<output>& buffer) {
  group.parallel_for(sycl::range<1>(1), pointer);
  group.parallel_for(sycl::range<1>(1), buffer);
}
