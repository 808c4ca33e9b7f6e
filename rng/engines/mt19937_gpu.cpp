// SPDX-License-Identifier: Apache-2.0
// mt19937 on GPU queues: the state's memory, skips, the exported level and, through it, the
// kernels.
#include <algorithm>

#include "distributions/all.hpp"
#include "engines/mt19937_backend.hpp"
#include "frame/compound_road.hpp"
#include "frame/device_road.hpp"
#include "frame/state.hpp"

namespace kestrel::tarn::rng::detail {

mt19937_image::mt19937_image(const sycl::queue& queue, rvx_stream stream)
    : state_(queue, 2 * mt19937_shape::image, "mt19937") {
  load(stream);
}

mt19937_image::mt19937_image(const sycl::queue& queue, const mt19937_image& other)
    : state_(queue, 2 * mt19937_shape::image, "mt19937"),
      mid_block_(other.mid_block_),
      active_(other.active_) {
  std::copy_n(other.state_.get(), state_.size(), state_.get());
}

void mt19937_image::load(rvx_stream stream) {
  const auto& record = twister_record_of<mt19937>(stream);
  twister_image_from(record, mt19937_constants.matrix, state_.get());
  std::fill_n(state_.get() + mt19937_shape::image, mt19937_shape::image, 0u);
  mid_block_ = record.in_mid_block();
  active_ = 1;
}

void mt19937_image::save(rvx_stream stream) const {
  twister_record_from(groups().source(0), twister_record_of<mt19937>(stream));
}

template <>
void image_to_stream(engine_base_impl<mt19937>* engine, const char*) {
  if (auto* backend = twister_backend_of(engine)) {
    backend->settled_image().save(engine->stream.get());
  }
}

template <>
void image_from_stream(sycl::queue&, engine_base_impl<mt19937>* engine) {
  if (auto* backend = twister_backend_of(engine)) {
    backend->settled_image().load(engine->stream.get());
  }
}

namespace {

void launch_skip(sycl::handler& group, const void* context, const void*) {
  constexpr std::size_t team = mt19937_shape::team;
  mt19937_skip kernel = *static_cast<const mt19937_skip*>(context);
  kernel.image = sycl::local_accessor<std::uint32_t, 1>(mt19937_shape::image, group);
  group.parallel_for(sycl::nd_range<1>(team, team), kernel);
}

}  // namespace

namespace gpu {

using engine = mt19937;
using impl = engine_base_impl<engine>;

template <>
impl* create_engine(sycl::queue& queue, impl* other) {
  return copy_twister(queue, other);
}

/// The first half of the state moves, whichever half the next call reads: a skip after an odd
/// number of calls moves a state that no call reads again. Results depend on it.
template <>
void skip_ahead(sycl::queue& queue, impl* moved, std::uint64_t num_to_skip) {
  auto* backend = twister_backend_of(moved);
  if (backend == nullptr) {
    skip_stream(moved->stream.get(), num_to_skip);
    return;
  }
  constexpr std::uint64_t team = mt19937_shape::team;
  const mt19937_skip skip{{},
                          backend->image.first_half(),
                          num_to_skip / team,
                          static_cast<std::uint32_t>(num_to_skip % team)};
  backend->last_event = submit_in_order(queue, {}, backend->last_event, {&launch_skip, &skip, 0});
}

template impl* create_engine<engine>(sycl::queue&, std::uint64_t);
template impl* create_engine<engine>(sycl::queue&, std::int64_t, const std::uint32_t*);
template impl* create_engine<engine>(sycl::queue&, void*);
template void delete_engine<engine>(sycl::queue&, impl*);

#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_IF_##gpu(TARN_DEVICE_ROAD_##road(engine, result, TARN_UNWRAP type))
#include "distributions/distributions.def"

}  // namespace gpu

}  // namespace kestrel::tarn::rng::detail
