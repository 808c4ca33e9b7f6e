// SPDX-License-Identifier: Apache-2.0
// Rejection on a device, where no work-item may loop until its own result is accepted: in passes. A
// pass draws one candidate for each result that is missing, numbers the survivors by prefix sums
// and moves them to the output in the order of the candidates. So results depend on the engine's
// sequence and on where the passes end, and on nothing else; the latter follows from the count and,
// from 10000 results on, from the device's largest work-group.
//
// A candidate takes two words. It is accepted if it is 0 or more: rejected ones are -1, and a real
// that is not a number is rejected as well.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/kernel_functor.hpp"
#include "frame/engine_backend.hpp"
#include "frame/kernel_launch.hpp"
#include "frame/pass_count.hpp"

namespace kestrel::tarn::rng::detail::gpu {

template <typename T>
SYCL_EXTERNAL bool is_accepted(T candidate) {
  return candidate >= 0;
}

/// What the passes ask of an engine and a functor: `count` candidates into the first elements of
/// the buffer. Returns the event of the kernel that writes them.
template <typename T>
struct candidate_step {
  void* context;
  sycl::event (*draw)(void* context, std::int64_t count, sycl::buffer<T, 1>& candidates);
};

/// The buffers of a call, and the steps on them that know neither the engine nor the output.
/// T is std::int32_t, float or double.
template <typename T>
class survivor_search {
 public:
  /// For calls of `n` results. The groups whose totals are summed have to fit one work-group:
  /// devices with work-groups below 128 cannot serve passes of calls of less than 10000 results,
  /// and refuse the launch.
  survivor_search(const sycl::queue& queue, std::int64_t n);

  /// Most candidates of a pass.
  std::int64_t capacity() const { return capacity_; }

  /// Submits, after `drawn`, what numbers the survivors among the first `count` candidates from 1
  /// on in position_buffer. Returns the last event.
  sycl::event number(sycl::queue& queue, std::int64_t count, const sycl::event& drawn);

  /// How many there are. Waits for the kernels.
  std::int64_t survivors();

  sycl::buffer<T, 1> candidate_buffer;
  sycl::buffer<std::int64_t, 1> position_buffer;

 private:
  survivor_search(std::size_t group_size, std::int64_t capacity);

  std::size_t group_size_;
  std::int64_t capacity_;
  std::size_t groups_;
  sycl::buffer<std::int64_t, 1> group_total_buffer_;
};

/// Moves the survivors among the candidates to their places behind the first `generated` results.
/// Out is a pointer or a write accessor.
template <typename T, typename Post, typename Out>
struct compact_survivors {
  sycl::accessor<T, 1, sycl::access_mode::read> candidates;
  sycl::accessor<std::int64_t, 1, sycl::access_mode::read> positions;
  Out out;
  Post post;
  std::int64_t generated;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    const T candidate = candidates[item];
    if (is_accepted(candidate)) {
      out[static_cast<std::size_t>(generated + positions[item] - 1)] = post(candidate);
    }
  }
};

/// Stores one result.
template <typename T, typename Post, typename Out>
struct store_survivor {
  T candidate;
  Out out;
  Post post;
  std::int64_t place;

  SYCL_EXTERNAL void operator()() const { out[static_cast<std::size_t>(place)] = post(candidate); }
};

/// The last kernel of the passes so far: none runs any more when it goes, so that a call which ends
/// by an exception leaves nothing behind that uses its memory.
struct last_pass {
  last_pass() = default;
  last_pass(const last_pass&) = delete;
  last_pass& operator=(const last_pass&) = delete;
  ~last_pass() { event.wait(); }

  sycl::event event;
};

/// A call in passes. `Out` is T* or sycl::buffer<T, 1>.
template <typename T, typename Post, typename Out>
class rejection_passes {
 public:
  rejection_passes(sycl::queue& queue, const candidate_step<T>& step, const Post& post, Out out)
      : queue_(queue), step_(step), post_(post), out_(out) {}

  /// Makes `n` results and returns the event of the last kernel, which has run; for none an event
  /// without a command. `in_pairs`: candidates are only drawn two at a time, so that passes have
  /// even counts and the last result of an odd rest is drawn by itself. There is no bound to the
  /// passes. An exception leaves the results of finished passes in place.
  sycl::event run(std::int64_t n, bool in_pairs);

  /// Words drawn so far.
  std::int64_t consumed() const { return consumed_; }

 private:
  /// Returns how many of `count` candidates have survived.
  std::int64_t pass(survivor_search<T>& search, std::int64_t generated, std::int64_t count);
  /// Result number `place`: the first of two candidates that is accepted, or the second.
  void draw_last(std::int64_t place);
  void draw(std::int64_t count, sycl::buffer<T, 1>& candidates);

  sycl::queue& queue_;
  candidate_step<T> step_;
  Post post_;
  Out out_;
  std::int64_t consumed_ = 0;
  pass_count passes_;
  last_pass last_;
};

template <typename T, typename Post, typename Out>
sycl::event rejection_passes<T, Post, Out>::run(std::int64_t n, bool in_pairs) {
  if (n < 1) {
    return {};
  }
  survivor_search<T> search(queue_, n);
  std::int64_t generated = 0;
  while (generated < n) {
    // Never more candidates than results are missing, so that every survivor has a place.
    const std::int64_t missing = std::min(search.capacity(), n - generated);
    const std::int64_t count = in_pairs ? missing - missing % 2 : missing;
    if (count == 0) {
      draw_last(generated);
      break;
    }
    generated += pass(search, generated, count);
  }
  return last_.event;
}

template <typename T, typename Post, typename Out>
std::int64_t rejection_passes<T, Post, Out>::pass(survivor_search<T>& search,
                                                  std::int64_t generated, std::int64_t count) {
  draw(count, search.candidate_buffer);
  last_.event = search.number(queue_, count, last_.event);
  const sycl::event numbered = last_.event;
  last_.event = queue_.submit([&](sycl::handler& group) {
    group.depends_on(numbered);
    auto out = bind_output(group, out_);
    const compact_survivors<T, Post, decltype(out)> kernel{
        {search.candidate_buffer, group}, {search.position_buffer, group}, out, post_, generated};
    group.parallel_for(sycl::range<1>(static_cast<std::size_t>(count)), kernel);
  });
  last_.event.wait_and_throw();
  return search.survivors();
}

template <typename T, typename Post, typename Out>
void rejection_passes<T, Post, Out>::draw_last(std::int64_t place) {
  sycl::buffer<T, 1> pair{sycl::range<1>(2)};
  T accepted = -1;
  while (!is_accepted(accepted)) {
    draw(2, pair);
    last_.event.wait_and_throw();
    const sycl::host_accessor candidates(pair, sycl::read_only);
    accepted = is_accepted(candidates[0]) ? candidates[0] : candidates[1];
  }
  last_.event = queue_.submit([&](sycl::handler& group) {
    auto out = bind_output(group, out_);
    group.single_task(store_survivor<T, Post, decltype(out)>{accepted, out, post_, place});
  });
  last_.event.wait_and_throw();
}

template <typename T, typename Post, typename Out>
void rejection_passes<T, Post, Out>::draw(std::int64_t count, sycl::buffer<T, 1>& candidates) {
  passes_.next();
  last_.event = step_.draw(step_.context, count, candidates);
  consumed_ += 2 * count;
}

/// Draws `n` results of a rejecting family into `out`, T* or sycl::buffer<T, 1>. `Distr` holds the
/// functor of the candidates in `kernel` and what turns an accepted one into a result in `post`;
/// its `consumed` becomes the count of words drawn. The call is over on return. Raises what the
/// engine and the runtime raise; the engine then stands behind the passes submitted.
template <typename T, typename Engine, typename Distr, typename Out>
sycl::event acceptance_rejection_scheme(sycl::queue& queue, Distr& distr,
                                        engine_base_impl<Engine>* engine, std::int64_t n, Out out) {
  struct drawing {
    sycl::queue& queue;
    Distr& distr;
    engine_base_impl_backend<Engine, device_type::gpu>& engine;

    static sycl::event draw(void* context, std::int64_t count, sycl::buffer<T, 1>& candidates) {
      const auto& self = *static_cast<const drawing*>(context);
      return self.engine.template generate<T, Distr, sycl::buffer<T, 1>&>(
          self.queue, count, candidates, self.distr, {});
    }
  };
  using functor = typename Distr::functor;
  static_assert(words_per_result<functor> == 2);
  drawing on{queue, distr,
             static_cast<engine_base_impl_backend<Engine, device_type::gpu>&>(*engine)};
  rejection_passes<T, typename Distr::post_type, Out> passes(queue, {&on, &drawing::draw},
                                                             distr.post, out);
  const sycl::event last = passes.run(n, is_whole<functor>);
  distr.consumed = passes.consumed();
  return last;
}

}  // namespace kestrel::tarn::rng::detail::gpu

/// The part of the scheme that knows no engine, for candidates of type T and what is done to those
/// accepted: `kind` is template or extern template. To be used in namespace detail::gpu.
#define TARN_ACCEPTANCE_REJECTION(kind, T, post) \
  kind class rejection_passes<T, post, T*>;      \
  kind class rejection_passes<T, post, sycl::buffer<T, 1>>;
