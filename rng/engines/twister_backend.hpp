// SPDX-License-Identifier: Apache-2.0
// Mersenne twisters on GPU queues: their state lies in shared memory from call to call, and every
// kernel on it waits for the one before. The record in the host stream is behind; it is brought up
// to date for saving. `Image` holds the memory:
//   Image(queue, stream)    from the stream's record
//   Image(queue, other)     a deep copy; no kernel may run on the other
//   load(stream)            from the stream's record again
//   save(stream)            into the stream's record
//   groups(), group_count() what travels to the kernels, and how many work-groups there are
//   turn()                  called once a call has been submitted
//   mid_block()             whether the record that it was made from stood inside a block
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include <sycl/sycl.hpp>

#include "engines/twister_kernels.hpp"
#include "frame/device_road.hpp"
#include "frame/state.hpp"

namespace kestrel::tarn::rng::detail {

/// Submits a kernel that runs after `last` and after `dependencies`.
inline sycl::event submit_in_order(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                                   const sycl::event& last, const kernel_launch& kernel) {
  return queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    group.depends_on(last);
    kernel.launch(group, kernel.context, nullptr);
  });
}

/// A call on its way to engine_func_mt.
template <typename Engine, typename T, typename Functor, typename Out>
struct twister_call {
  using source = typename Functor::source;
  using shape = typename engine_traits<Engine>::shape;

  std::uint64_t n;
  std::uint64_t words;  // that the call takes from the sequence
  Out r;
  Functor functor;
  typename engine_traits<Engine>::groups groups;
  std::uint32_t group_count;

  template <bool mid_block>
  static void launch(sycl::handler& group, const void* context, const void*) {
    constexpr bool pairs = gpu::values_together < Functor >> 1;
    const auto& call = *static_cast<const twister_call*>(context);
    auto out = bind_output(group, call.r);
    const engine_func_mt<Engine, T, source, Functor, decltype(out), pairs, mid_block> kernel{
        out,
        sycl::local_accessor<std::uint32_t, 1>(sycl::range<1>(shape::image), group),
        slots(group, std::bool_constant<pairs>()),
        call.functor,
        call.groups,
        twister_plan_of<shape>(call.words, call.group_count),
        rule_of<Engine>(call.functor),
        call.n};
    group.parallel_for(
        sycl::nd_range<1>(std::size_t{call.group_count} * shape::team, std::size_t{shape::team}),
        kernel);
  }

 private:
  static twister_slots<source, false> slots(sycl::handler&, std::false_type) { return {}; }
  static twister_slots<source, true> slots(sycl::handler& group, std::true_type) {
    return {sycl::local_accessor<source, 1>(sycl::range<1>(shape::team), group)};
  }
};

template <typename Engine, typename Image>
class twister_backend : public engine_base_impl<Engine> {
 public:
  /// Raise device_bad_alloc.
  twister_backend(sycl::queue& queue, owned_stream made)
      : engine_base_impl<Engine>(std::move(made)), image(queue, this->stream.get()) {}
  twister_backend(owned_stream made, Image image_)
      : engine_base_impl<Engine>(std::move(made)), image(std::move(image_)) {}
  twister_backend(sycl::queue& queue, twister_backend& other)
      : engine_base_impl<Engine>(copy_stream(other.stream.get())),
        image(queue, other.settled_image()) {}
  /// Waits for the last kernel, so that it does not lose the image under its feet.
  ~twister_backend() override { last_event.wait(); }

  /// As snapshot_backend::generate. The image's turn comes when the call has been submitted.
  template <typename T, typename Distribution, typename Out>
  sycl::event generate(sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
                       const std::vector<sycl::event>& dependencies) {
    using functor = typename Distribution::functor;
    using call_type = twister_call<Engine, T, functor, Out>;
    const call_type call{
        static_cast<std::uint64_t>(n), words_taken<functor>(n), r,
        distribution.kernel,           image.groups(),          image.group_count()};
    const auto launch =
        image.mid_block() ? &call_type::template launch<true> : &call_type::template launch<false>;
    last_event = submit_in_order(queue, dependencies, last_event, {launch, &call, 0});
    image.turn();
    return last_event;
  }

  /// The image once its last kernel has run.
  Image& settled_image() {
    last_event.wait();
    return image;
  }

  Image image;
  sycl::event last_event;
};

/// The device backend of an implementation; null for one made on a CPU queue.
template <typename Engine>
auto* twister_backend_of(engine_base_impl<Engine>* engine) {
  return dynamic_cast<engine_base_impl_backend<Engine, device_type::gpu>*>(engine);
}

/// A deep copy; of an implementation made on a CPU queue one at the same place.
template <typename Engine>
engine_base_impl<Engine>* copy_twister(sycl::queue& queue, engine_base_impl<Engine>* other) {
  using backend = engine_base_impl_backend<Engine, device_type::gpu>;
  if (auto* source = twister_backend_of(other)) {
    return new backend(queue, *source);
  }
  return new backend(queue, copy_stream(other->stream.get()));
}

/// The record of a stream.
template <typename Engine>
typename engine_traits<Engine>::record& twister_record_of(rvx_stream stream) {
  return *static_cast<typename engine_traits<Engine>::record*>(
      const_cast<void*>(state_record(stream)));
}

}  // namespace kestrel::tarn::rng::detail
