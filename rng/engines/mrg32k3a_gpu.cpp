// SPDX-License-Identifier: Apache-2.0
// mrg32k3a on GPU queues: the sub-sequences, the exported level and, through it, the kernels.
#include <algorithm>
#include <cstring>
#include <limits>

#include <kestrel/tarn/exceptions.hpp>

#include "distributions/all.hpp"
#include "engines/mrg32k3a_backend.hpp"
#include "frame/compound_road.hpp"
#include "frame/device_road.hpp"
#include "frame/state.hpp"

namespace kestrel::tarn::rng::detail {

namespace {

using record = mrg32k3a_sub_sequences::record;
using backend = engine_base_impl_backend<mrg32k3a, device_type::gpu>;

/// A kernel's skip reads its count as a signed number.
void skip_far(record* state, std::uint64_t n) {
  constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
  if (n > static_cast<std::uint64_t>(most)) {
    mrg32k3a_skip(state, most);
    mrg32k3a_skip(state, 1);
    n -= std::uint64_t{1} << 63;
  }
  mrg32k3a_skip(state, static_cast<std::int64_t>(n));
}

/// Null in the default mode, and for an implementation made on a CPU queue.
mrg32k3a_sub_sequences* sub_sequences_of(engine_base_impl<mrg32k3a>* engine) {
  auto* on_gpu = dynamic_cast<backend*>(engine);
  return on_gpu == nullptr ? nullptr : on_gpu->sub_sequences.get();
}

}  // namespace

mrg32k3a_sub_sequences::mrg32k3a_sub_sequences(const sycl::queue& queue, std::uint32_t number,
                                               const record& first)
    : number_(number), records_(queue, size(), "mrg32k3a") {
  records_[0] = first;
  for (std::uint32_t i = 1; i < size(); ++i) {
    records_[i] = records_[i - 1];
    mrg32k3a_jump(&records_[i], mrg32k3a_sub_sequence_jump);
  }
}

mrg32k3a_sub_sequences::mrg32k3a_sub_sequences(const sycl::queue& queue,
                                               const mrg32k3a_sub_sequences& other)
    : number_(other.number_), position_(other.position_), records_(queue, size(), "mrg32k3a") {
  sycl::event last = other.last_;
  last.wait();
  std::copy_n(other.records_.get(), size(), records_.get());
}

mrg32k3a_sub_sequences::~mrg32k3a_sub_sequences() {
  last_.wait();
}

void mrg32k3a_sub_sequences::skip(std::uint64_t n) {
  for (std::uint32_t i = 0; i < number_; ++i) {
    const std::uint64_t first = mrg32k3a_first_result(i, position_, number_);
    skip_far(&records_[i], mrg32k3a_results_from(first, n, number_));
  }
}

sycl::event mrg32k3a_sub_sequences::submit(sycl::queue& queue,
                                           const std::vector<sycl::event>& dependencies,
                                           std::int64_t n, const kernel_launch& kernel) {
  last_ = queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    kernel.launch(group, kernel.context, nullptr);
  });
  const std::uint64_t turned = position_ + static_cast<std::uint64_t>(n) % size();
  position_ = static_cast<std::uint32_t>(turned % size());
  return last_;
}

void refuse_sub_sequence_distribution() {
  throw invalid_argument("rng", "generate",
                         "mrg32k3a with optimal/custom modes doesn't support this distribution");
}

template <>
void check_mode(engine_base_impl<mrg32k3a>* engine, bool runs_in_sub_sequences) {
  if (!runs_in_sub_sequences && sub_sequences_of(engine) != nullptr) {
    refuse_sub_sequence_distribution();
  }
}

template <>
void image_to_stream(engine_base_impl<mrg32k3a>* engine, const char* service) {
  if (sub_sequences_of(engine) != nullptr) {
    throw computation_error("rng", service,
                            " does not support mrg32k3a with sub-sequence parallelization");
  }
}

namespace gpu {

using engine = mrg32k3a;
using impl = engine_base_impl<engine>;

/// An engine of `number` sub-sequences, the first of which is the stream's.
impl* wrap_sub_sequences(const sycl::queue& queue, owned_stream stream, std::uint32_t number) {
  auto made = std::make_unique<backend>(std::move(stream));
  record first;
  std::memcpy(&first, state_record(made->stream.get()), sizeof first);
  made->sub_sequences = std::make_unique<mrg32k3a_sub_sequences>(queue, number, first);
  return made.release();
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                        mrg32k3a_mode::optimal) {
  return wrap_sub_sequences(queue, new_stream(engine_row<Engine>::code, seed),
                            mrg32k3a_sub_sequences::optimal_number);
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                        mrg32k3a_mode::custom mode) {
  return wrap_sub_sequences(queue, new_stream(engine_row<Engine>::code, seed), mode.count);
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                        const std::uint32_t* seed, mrg32k3a_mode::optimal) {
  return wrap_sub_sequences(queue, new_stream(engine_row<Engine>::code, n, seed),
                            mrg32k3a_sub_sequences::optimal_number);
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                        const std::uint32_t* seed, mrg32k3a_mode::custom mode) {
  return wrap_sub_sequences(queue, new_stream(engine_row<Engine>::code, n, seed), mode.count);
}

template <>
impl* create_engine(sycl::queue& queue, impl* other) {
  auto copy = std::make_unique<backend>(copy_stream(other->stream.get()));
  if (const auto* source = sub_sequences_of(other)) {
    copy->sub_sequences = std::make_unique<mrg32k3a_sub_sequences>(queue, *source);
  }
  return copy.release();
}

template <>
void skip_ahead(sycl::queue&, impl* moved, std::uint64_t num_to_skip) {
  if (auto* sub_sequences = sub_sequences_of(moved)) {
    sub_sequences->skip(num_to_skip);
  } else {
    skip_stream(moved->stream.get(), num_to_skip);
  }
}

template <>
void skip_ahead(sycl::queue&, impl* moved, std::initializer_list<std::uint64_t> num_to_skip) {
  if (sub_sequences_of(moved) != nullptr) {
    throw computation_error("rng", "skip_ahead",
                            "mrg32k3a engine with sub-sequence parallelization");
  }
  skip_stream(moved->stream.get(), num_to_skip);
}

template impl* create_engine<engine>(sycl::queue&, std::uint64_t);
template impl* create_engine<engine>(sycl::queue&, std::int64_t, const std::uint32_t*);
template impl* create_engine<engine>(sycl::queue&, std::uint64_t, mrg32k3a_mode::optimal);
template impl* create_engine<engine>(sycl::queue&, std::uint64_t, mrg32k3a_mode::custom);
template impl* create_engine<engine>(sycl::queue&, std::int64_t, const std::uint32_t*,
                                     mrg32k3a_mode::optimal);
template impl* create_engine<engine>(sycl::queue&, std::int64_t, const std::uint32_t*,
                                     mrg32k3a_mode::custom);
template impl* create_engine<engine>(void*);
template void delete_engine<engine>(sycl::queue&, impl*);

#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_IF_##gpu(TARN_DEVICE_ROAD_##road(engine, result, TARN_UNWRAP type))
#include "distributions/distributions.def"

}  // namespace gpu

}  // namespace kestrel::tarn::rng::detail
