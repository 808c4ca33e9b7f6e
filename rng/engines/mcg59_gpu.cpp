// SPDX-License-Identifier: Apache-2.0
// mcg59 on GPU queues: the exported level and, through it, the kernels.
#include "distributions/all.hpp"
#include "engines/mcg59.hpp"
#include "frame/compound_road.hpp"
#include "frame/device_road.hpp"

namespace kestrel::tarn::rng::detail::gpu {

using engine = mcg59;
using impl = engine_base_impl<engine>;

template impl* create_engine<engine>(sycl::queue&, std::uint64_t);
template impl* create_engine<engine>(sycl::queue&, impl*);
template impl* create_engine<engine>(void*);
template void delete_engine<engine>(sycl::queue&, impl*);
template void skip_ahead<engine>(sycl::queue&, impl*, std::uint64_t);
template void leapfrog<engine>(sycl::queue&, impl*, std::uint64_t, std::uint64_t);

#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_IF_##gpu(TARN_DEVICE_ROAD_##road(engine, result, TARN_UNWRAP type))
#include "distributions/distributions.def"

}  // namespace kestrel::tarn::rng::detail::gpu
