// SPDX-License-Identifier: Apache-2.0
// mt2203 on GPU queues: the generators' memory, the exported level and, through it, the kernels.
#include <algorithm>

#include <kestrel/tarn/exceptions.hpp>

#include "distributions/all.hpp"
#include "engines/mt2203_backend.hpp"
#include "frame/compound_road.hpp"
#include "frame/device_road.hpp"
#include "frame/state.hpp"

namespace kestrel::tarn::rng::detail {

mt2203_image::mt2203_image(const sycl::queue& queue, std::size_t num_states)
    : states_(queue, num_states * mt2203_shape::image, "mt2203"),
      matrix_a_(queue, num_states, "mt2203"),
      mask_b_(queue, num_states, "mt2203"),
      mask_c_(queue, num_states, "mt2203"),
      num_states_(static_cast<std::uint32_t>(num_states)) {}

mt2203_image::mt2203_image(const sycl::queue& queue, const std::vector<owned_stream>& streams)
    : mt2203_image(queue, streams.size()) {
  for (std::size_t i = 0; i < streams.size(); ++i) {
    set(i, streams[i].get());
  }
}

mt2203_image::mt2203_image(const sycl::queue& queue, rvx_stream stream)
    : mt2203_image(queue, std::size_t{1}) {
  load(stream);
}

mt2203_image::mt2203_image(const sycl::queue& queue, const mt2203_image& other)
    : mt2203_image(queue, std::size_t{other.num_states_}) {
  const std::size_t n = num_states_;
  std::copy_n(other.states_.get(), n * mt2203_shape::image, states_.get());
  std::copy_n(other.matrix_a_.get(), n, matrix_a_.get());
  std::copy_n(other.mask_b_.get(), n, mask_b_.get());
  std::copy_n(other.mask_c_.get(), n, mask_c_.get());
  mid_block_ = other.mid_block_;
}

void mt2203_image::set(std::size_t i, rvx_stream stream) {
  const mt2203_record& record = twister_record_of<mt2203>(stream);
  matrix_a_[i] = record.constants.matrix;
  mask_b_[i] = record.constants.mask_b;
  mask_c_[i] = record.constants.mask_c;
  twister_image_from(record.block, record.constants.matrix,
                     states_.get() + i * mt2203_shape::image);
  mid_block_ = record.block.in_mid_block();
}

void mt2203_image::load(rvx_stream stream) {
  num_states_ = 1;
  set(0, stream);
}

void mt2203_image::save(rvx_stream stream) const {
  twister_record_from(states_.get(), twister_record_of<mt2203>(stream).block);
}

template <>
void image_to_stream(engine_base_impl<mt2203>* engine, const char* service) {
  auto* backend = twister_backend_of(engine);
  if (backend == nullptr) {
    return;
  }
  if (backend->image.group_count() > 1) {
    throw computation_error("rng", service, " does not support multi-state mt2203");
  }
  backend->settled_image().save(engine->stream.get());
}

template <>
void image_from_stream(sycl::queue&, engine_base_impl<mt2203>* engine) {
  if (auto* backend = twister_backend_of(engine)) {
    backend->settled_image().load(engine->stream.get());
  }
}

namespace gpu {

using engine = mt2203;
using impl = engine_base_impl<engine>;
using backend = engine_base_impl_backend<engine, device_type::gpu>;

/// A generator for each compute unit: members 0, 1, 2, ... of the family, from the same seed.
template <typename... Seed>
impl* create_family(sycl::queue& queue, Seed... seed) {
  const auto units = queue.get_device().get_info<sycl::info::device::max_compute_units>();
  std::vector<owned_stream> streams;
  for (std::uint32_t i = 0; i < units; ++i) {
    streams.push_back(new_stream(engine_row<engine>::code | i, seed...));
  }
  mt2203_image image(queue, streams);
  return new backend(std::move(streams.front()), std::move(image));
}

template <>
impl* create_engine<engine>(sycl::queue& queue, std::uint64_t seed) {
  return create_family(queue, seed);
}

template <>
impl* create_engine<engine>(sycl::queue& queue, std::int64_t n, const std::uint32_t* seed) {
  return create_family(queue, n, seed);
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                        std::uint32_t engine_idx) {
  return wrap_stream<Engine>(queue, new_stream(engine_row<Engine>::code | engine_idx, seed));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                        const std::uint32_t* seed, std::uint32_t engine_idx) {
  return wrap_stream<Engine>(queue, new_stream(engine_row<Engine>::code | engine_idx, n, seed));
}

template <>
impl* create_engine(sycl::queue& queue, impl* other) {
  return copy_twister(queue, other);
}

template impl* create_engine<engine>(sycl::queue&, std::uint64_t, std::uint32_t);
template impl* create_engine<engine>(sycl::queue&, std::int64_t, const std::uint32_t*,
                                     std::uint32_t);
template impl* create_engine<engine>(sycl::queue&, void*);
template void delete_engine<engine>(sycl::queue&, impl*);

#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_IF_##gpu(TARN_DEVICE_ROAD_##road(engine, result, TARN_UNWRAP type))
#include "distributions/distributions.def"

}  // namespace gpu

}  // namespace kestrel::tarn::rng::detail
