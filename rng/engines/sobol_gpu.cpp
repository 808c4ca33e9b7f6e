// SPDX-License-Identifier: Apache-2.0
// sobol on GPU queues: the image, the exported level and, through it, the kernels.
#include <algorithm>
#include <utility>

#include <kestrel/tarn/exceptions.hpp>

#include "distributions/all.hpp"
#include "engines/sobol_backend.hpp"
#include "frame/compound_road.hpp"
#include "frame/device_road.hpp"
#include "frame/state.hpp"

namespace kestrel::tarn::rng::detail {

namespace {

using backend = engine_base_impl_backend<sobol, device_type::gpu>;

/// Null for an implementation made on a CPU queue.
backend* on_gpu(engine_base_impl<sobol>* engine) {
  return dynamic_cast<backend*>(engine);
}

}  // namespace

sobol_image::sobol_image(const sycl::queue& queue, rvx_stream stream)
    : dimensions(sobol_record(stream).dimensions()),
      directions(queue, std::size_t{dimensions} * sobol_directions, "sobol"),
      point(queue, dimensions, "sobol") {
  read(stream);
}

void sobol_image::read(rvx_stream stream) {
  const sobol_record record(stream);
  index = record.index();
  offset = record.offset();
  for (std::size_t d = 0; d < dimensions; ++d) {
    std::copy_n(record.directions(d), sobol_directions, directions.get() + d * sobol_directions);
  }
  std::copy_n(record.point(), dimensions, point.get());
}

std::uint64_t sobol_image::remaining() const {
  constexpr std::uint64_t end = std::uint64_t{1} << 32;
  return index == 0 ? 0 : (end - index) * dimensions - taken();
}

backend::engine_base_impl_backend(const sycl::queue& queue, owned_stream made)
    : engine_base_impl(std::move(made)),
      image_(std::make_unique<sobol_image>(queue, stream.get())) {}

backend::~engine_base_impl_backend() {
  last_event_.wait();
}

bool backend::runs_on_devices() const {
  return sobol_record(stream.get()).marker() == sobol_runs_on_devices;
}

// The sequence ends with point 2^32 - 1. To ask for index + words / dimensions <= 2^32 would let
// through what ends inside a point 2^32, for which there are no direction words; the host refuses
// that as well.
void backend::check_period(std::uint64_t words) const {
  if (words > image_->remaining()) {
    throw computation_error("rng", "sobol", "generator period is exceeded");
  }
}

sycl::event backend::submit(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                            std::uint64_t n, const kernel_launch& kernel) {
  const sobol_walk walk{image_->directions.get(), image_->point.get(),
                        image_->dimensions,       image_->index,
                        image_->taken(),          n};
  last_event_ = queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    group.depends_on(last_event_);
    kernel.launch(group, kernel.context, &walk);
  });
  return last_event_;
}

void backend::move(sycl::queue& queue, std::uint64_t words) {
  const std::uint32_t dimensions = image_->dimensions;
  const std::uint64_t from_point = image_->taken() + words;
  const auto rest = static_cast<std::uint32_t>(from_point % dimensions);
  const std::uint32_t index = image_->index + static_cast<std::uint32_t>(from_point / dimensions);
  if (index != image_->index) {
    const sobol_skip_func kernel{image_->directions.get(), image_->point.get(), image_->index,
                                 index};
    last_event_ = queue.submit([&](sycl::handler& group) {
      group.depends_on(last_event_);
      group.parallel_for(sycl::range<1>(dimensions), kernel);
    });
  }
  image_->index = index;
  image_->offset = rest == 0 ? 0 : dimensions - rest;
}

void backend::skip(sycl::queue& queue, std::uint64_t words) {
  check_period(words);
  move(queue, words);
}

void backend::store() {
  last_event_.wait();
  const sobol_record record(stream.get());
  record.index() = image_->index;
  record.offset() = image_->offset;
  std::copy_n(image_->point.get(), image_->dimensions, record.point());
}

void backend::load(const sycl::queue& queue) {
  last_event_.wait();
  if (sobol_record(stream.get()).dimensions() == image_->dimensions) {
    image_->read(stream.get());
  } else {
    image_ = std::make_unique<sobol_image>(queue, stream.get());
  }
}

template <>
void image_to_stream(engine_base_impl<sobol>* engine, const char*) {
  if (backend* const resident = on_gpu(engine)) {
    resident->store();
  }
}

template <>
void image_from_stream(sycl::queue& queue, engine_base_impl<sobol>* engine) {
  if (backend* const resident = on_gpu(engine)) {
    resident->load(queue);
  }
}

namespace gpu {

using engine = sobol;
using impl = engine_base_impl<engine>;

template <>
impl* create_engine(sycl::queue& queue, impl* other) {
  image_to_stream(other, "sobol");
  return wrap_stream<engine>(queue, copy_stream(other->stream.get()));
}

template <>
void skip_ahead(sycl::queue& queue, impl* moved, std::uint64_t num_to_skip) {
  if (backend* const resident = on_gpu(moved)) {
    resident->skip(queue, num_to_skip);
  } else {
    skip_stream(moved->stream.get(), num_to_skip);
  }
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
