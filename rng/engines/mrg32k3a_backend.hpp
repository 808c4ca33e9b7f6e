// SPDX-License-Identifier: Apache-2.0
// mrg32k3a on GPU queues: the serial sequence, whose state travels by value, or sub-sequences with
// their states in shared memory. The two give different sequences.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng/continuous.hpp>
#include <sycl/sycl.hpp>

#include "engines/mrg32k3a_kernels.hpp"
#include "frame/checks.hpp"
#include "frame/device_road.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail {

/// Generators 2^76 steps apart, read in turn. Their records are shared memory without a lock:
/// kernels on them have to be ordered by the caller's queue or dependencies, and the host may skip
/// them only after they have ended. Copies wait for the last one.
class mrg32k3a_sub_sequences {
 public:
  using record = tag_rvx_sycl_brng_mrg32k3a_stream_t;
  static constexpr std::uint32_t optimal_number = 40960;

  /// `number` generators, the first of which stands at `first`. A number of 0 is kept as such and
  /// has the records of 40960. Raise device_bad_alloc.
  mrg32k3a_sub_sequences(const sycl::queue& queue, std::uint32_t number, const record& first);
  mrg32k3a_sub_sequences(const sycl::queue& queue, const mrg32k3a_sub_sequences& other);
  mrg32k3a_sub_sequences(const mrg32k3a_sub_sequences&) = delete;
  mrg32k3a_sub_sequences& operator=(const mrg32k3a_sub_sequences&) = delete;
  /// Waits for the last kernel, so that it does not lose the records under its feet.
  ~mrg32k3a_sub_sequences();

  /// How many generators there are, never 0.
  std::uint32_t size() const { return number_ == 0 ? optimal_number : number_; }

  /// Moves each generator past those of the next `n` results that are its own. The place in the
  /// round is left as it is, other than by drawing, and a number of 0 moves nothing; kept, since
  /// results depend on it.
  void skip(std::uint64_t n);

  /// Draws into r, as snapshot_backend::generate does.
  template <typename T, typename Functor, typename Out>
  sycl::event generate(sycl::queue& queue, std::int64_t n, Out r, const Functor& functor,
                       const std::vector<sycl::event>& dependencies);

 private:
  sycl::event submit(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                     std::int64_t n, const kernel_launch& kernel);

  std::uint32_t number_;
  std::uint32_t position_ = 0;  // the generator of the next result
  shared_array<record> records_;
  sycl::event last_;
};

/// Raises invalid_argument for a family without a sub-sequence kernel.
[[noreturn]] void refuse_sub_sequence_distribution();

template <>
class engine_base_impl_backend<mrg32k3a, device_type::gpu> : public engine_base_impl<mrg32k3a> {
 public:
  explicit engine_base_impl_backend(owned_stream made) : engine_base_impl(std::move(made)) {}

  template <typename T, typename Distribution, typename Out>
  sycl::event generate(sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
                       const std::vector<sycl::event>& dependencies);

  std::unique_ptr<mrg32k3a_sub_sequences> sub_sequences;  // null in the default mode
};

/// A call in the default mode on its way to engine_func.
template <typename T, typename Functor, typename Out>
struct mrg32k3a_serial_call {
  engine_func_call<mrg32k3a, T, Functor, Out> call;
  std::uint64_t group_size;

  static void launch(sycl::handler& group, const void* context, const void* record) {
    const auto& self = *static_cast<const mrg32k3a_serial_call*>(context);
    const std::uint64_t items =
        mrg32k3a_work_items(static_cast<std::uint64_t>(self.call.n), self.group_size);
    group.parallel_for(sycl::nd_range<1>(static_cast<std::size_t>(items),
                                         static_cast<std::size_t>(self.group_size)),
                       self.call.kernel(group, record));
  }
};

/// A call in a sub-sequence mode on its way to engine_func_sub_seq.
template <typename T, typename Functor, typename Out>
struct mrg32k3a_sub_seq_call {
  Out r;
  Functor functor;
  std::uint64_t n;
  std::uint32_t streams_number;
  std::uint32_t position;
  tag_rvx_sycl_brng_mrg32k3a_stream_t* streams;

  static void launch(sycl::handler& group, const void* context, const void*) {
    const auto& call = *static_cast<const mrg32k3a_sub_seq_call*>(context);
    auto out = bind_output(group, call.r);
    const engine_func_sub_seq<mrg32k3a, T, typename Functor::source, Functor, decltype(out)> kernel{
        out,
        call.functor,
        call.streams,
        call.n,
        call.streams_number,
        call.position,
        rule_of<mrg32k3a>(call.functor)};
    group.parallel_for(sycl::range<1>(call.streams_number), kernel);
  }
};

template <typename T, typename Functor, typename Out>
sycl::event mrg32k3a_sub_sequences::generate(sycl::queue& queue, std::int64_t n, Out r,
                                             const Functor& functor,
                                             const std::vector<sycl::event>& dependencies) {
  using call_type = mrg32k3a_sub_seq_call<T, Functor, Out>;
  const call_type call{r,      functor,   static_cast<std::uint64_t>(n),
                       size(), position_, records_.get()};
  return submit(queue, dependencies, n, {&call_type::launch, &call, 0});
}

template <typename T, typename Distribution, typename Out>
sycl::event engine_base_impl_backend<mrg32k3a, device_type::gpu>::generate(
    sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
    const std::vector<sycl::event>& dependencies) {
  using functor = typename Distribution::functor;
  if (sub_sequences != nullptr) {
    if constexpr (runs_in_sub_sequences<typename public_distribution<Distribution>::type>) {
      return sub_sequences->generate<T, functor, Out>(queue, n, r, distribution.kernel,
                                                      dependencies);
    } else {
      refuse_sub_sequence_distribution();
    }
  }
  using call_type = mrg32k3a_serial_call<T, functor, Out>;
  const std::size_t group_size =
      queue.get_device().get_info<sycl::info::device::max_work_group_size>();
  const call_type call{{n, r, distribution.kernel}, group_size};
  return submit_with_snapshot(
      queue, dependencies, stream.get(), words_taken<functor>(n),
      {&call_type::launch, &call, sizeof(tag_rvx_sycl_brng_mrg32k3a_stream_t)});
}

}  // namespace kestrel::tarn::rng::detail
