// SPDX-License-Identifier: Apache-2.0
// sobol on GPU queues. Its direction words and the current point stay in memory that host and
// device share; index and offset stand on the host and move when a call is submitted. The stream
// keeps the state that it was made with until somebody asks for it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

#include "distributions/uniform.hpp"
#include "engines/sobol_kernels.hpp"
#include "frame/device_road.hpp"
#include "frame/distr_func_spec.hpp"
#include "frame/shared_array.hpp"
#include "frame/two_steps.hpp"

namespace kestrel::tarn::rng::detail {

/// The state of an engine on a device.
struct sobol_image {
  /// That of a stream. Raises device_bad_alloc.
  sobol_image(const sycl::queue& queue, rvx_stream stream);
  /// That of another stream of as many dimensions.
  void read(rvx_stream stream);

  /// Coordinates of the current point that have been delivered.
  std::uint32_t taken() const { return offset == 0 ? 0 : dimensions - offset; }
  /// Words that are left.
  std::uint64_t remaining() const;

  std::uint32_t dimensions;
  std::uint32_t index = 0;                 // as in sobol_record
  std::uint32_t offset = 0;                // as in sobol_record
  shared_array<std::uint32_t> directions;  // sobol_directions for each dimension
  shared_array<std::uint32_t> point;       // the current one
};

template <>
class engine_base_impl_backend<sobol, device_type::gpu> : public engine_base_impl<sobol> {
 public:
  /// Raises device_bad_alloc.
  engine_base_impl_backend(const sycl::queue& queue, owned_stream made);
  /// Waits for the last kernel, so that it does not lose the image under its feet.
  ~engine_base_impl_backend() override;

  /// As snapshot_backend::generate does. Raises computation_error ("sobol") before anything is
  /// submitted if fewer words are left than the call takes. A stream without the marker draws
  /// nothing, stays where it is and gives an event without a command.
  template <typename T, typename Distribution, typename Out>
  sycl::event generate(sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
                       const std::vector<sycl::event>& dependencies);

  /// Moves past `words` words. Raises computation_error ("sobol") if fewer are left.
  void skip(sycl::queue& queue, std::uint64_t words);

  /// From the image to the stream, when the last kernel has run, and from the stream to a new
  /// image.
  void store();
  void load(const sycl::queue& queue);

  /// Whether the stream has the marker.
  bool runs_on_devices() const;

 private:
  void check_period(std::uint64_t words) const;
  /// Submits a kernel that makes `n` words from where the engine stands, which it leaves there.
  /// `kernel.launch` gets a sobol_walk for a record.
  sycl::event submit(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                     std::uint64_t n, const kernel_launch& kernel);
  /// Moves behind the kernels submitted so far.
  void move(sycl::queue& queue, std::uint64_t words);

  std::unique_ptr<sobol_image> image_;
  sycl::event last_event_;  // of the kernels that use the image
};

inline bool is_silent(const engine_base_impl_backend<sobol, device_type::gpu>& backend) {
  return !backend.runs_on_devices();
}

/// A call on its way to engine_func.
template <typename T, typename Functor, typename Out>
struct sobol_call {
  Out r;
  Functor functor;
  std::size_t group_size;

  static void launch(sycl::handler& group, const void* context, const void* record) {
    const auto& call = *static_cast<const sobol_call*>(context);
    const auto& walk = *static_cast<const sobol_walk*>(record);
    auto out = bind_output(group, call.r);
    const engine_func<sobol, T, typename Functor::source, Functor, decltype(out)> kernel{
        out, call.functor, walk, rule_of<sobol>(call.functor),
        sycl::local_accessor<std::uint32_t, 1>(sycl::range<1>(sobol_directions), group)};
    group.parallel_for(sycl::nd_range<1>(walk.dimensions * call.group_size, call.group_size),
                       kernel);
  }
};

/// The second step of a call on pairs, on its way to distr_func_spec.
template <typename T, typename Functor, typename Out>
struct sobol_pairs_call {
  const std::uint32_t* words;
  std::int64_t n;
  Out r;
  Functor functor;

  static void launch(sycl::handler& group, const void* context, const void*) {
    auto call = *static_cast<const sobol_pairs_call*>(context);
    launch_distr_func_spec<T>(group, call.words, call.n, call.r, call.functor);
  }
};

template <typename T, typename Distribution, typename Out>
sycl::event engine_base_impl_backend<sobol, device_type::gpu>::generate(
    sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
    const std::vector<sycl::event>& dependencies) {
  using functor = typename Distribution::functor;
  if (!runs_on_devices()) {
    return {};
  }
  const std::uint64_t taken = words_taken<functor>(n);
  check_period(taken);
  const std::size_t group_size =
      queue.get_device().get_info<sycl::info::device::max_work_group_size>();
  if constexpr (gpu::values_together < functor >> 1) {
    // Where an odd count leaves the last pair without its second word, the word behind takes part
    // and stays in the sequence; at the end it is 0. The host does the same.
    constexpr std::uint64_t together = gpu::values_together<functor>;
    const std::uint64_t drawn = (taken + together - 1) / together * together;
    using raw = gpu::bits_std<std::uint32_t>;
    using words_call = sobol_call<std::uint32_t, raw, std::uint32_t*>;
    using pairs_call = sobol_pairs_call<T, functor, Out>;
    const auto words = std::make_shared<drawn_words>(queue, drawn, "sobol");
    const words_call first{words->array.get(), raw{}, group_size};
    const pairs_call second{words->array.get(), n, r, distribution.kernel};
    words->last_kernel = submit(queue, dependencies, drawn, {&words_call::launch, &first, 0});
    move(queue, taken);
    return submit_second_step(queue, words, {&pairs_call::launch, &second, 0});
  } else {
    using call_type = sobol_call<T, functor, Out>;
    const call_type call{r, distribution.kernel, group_size};
    sycl::event event = submit(queue, dependencies, taken, {&call_type::launch, &call, 0});
    try {
      move(queue, taken);
    } catch (...) {
      event.wait();  // the caller may take from the kernel what it reads
      throw;
    }
    return event;
  }
}

}  // namespace kestrel::tarn::rng::detail
