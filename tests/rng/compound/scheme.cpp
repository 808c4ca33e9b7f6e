// SPDX-License-Identifier: Apache-2.0
// The passes of rejection on GPUs with groups of 64 to 1024 work-items, with an engine that follows
// a script in place of a real one: how many candidates it is asked for, which of them come out and
// where, for chosen and for generated patterns, against the passes as plain loops.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <limits>
#include <memory>
#include <random>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "distributions/acceptance_rejection_generate.hpp"
#include "in_flight.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using namespace tarn_test;
using counts = std::vector<std::int64_t>;

constexpr std::int64_t small_call = 10000;  // from here on the capacity hangs on the device

std::size_t group_size(const sycl::queue& queue) {
  return queue.get_device().get_info<sycl::info::device::max_work_group_size>();
}

std::int64_t capacity_of(const sycl::queue& queue, std::int64_t n) {
  const auto size = static_cast<std::int64_t>(group_size(queue));
  return n < small_call ? 16384 : size * size;
}

bool serves_small_calls(const sycl::queue& queue) {
  return group_size(queue) >= 128;
}

/// Candidate number k of a sequence.
template <typename T>
using sequence = std::function<T(std::size_t)>;

/// A chosen beginning, and 7 for ever.
template <typename T>
sequence<T> chosen(const std::vector<T>& first) {
  return [=](std::size_t k) { return k < first.size() ? first[k] : T(7); };
}

/// A made-up one in which `accepted` of 256 are, some of them 0, by the finaliser of splitmix64
/// (Steele, Lea and Flood, OOPSLA 2014). Values have 20 bits: exact in a float, also behind `post`.
template <typename T>
sequence<T> made_up(std::uint64_t seed, unsigned accepted) {
  return [=](std::size_t k) {
    std::uint64_t h = (seed + k + 1) * 0x9E3779B97F4A7C15;
    h = (h ^ (h >> 30)) * 0xBF58476D1CE4E5B9;
    h = (h ^ (h >> 27)) * 0x94D049BB133111EB;
    h ^= h >> 31;
    if (h % 256 < accepted) {
      return h / 256 % 16 == 0 ? T(0) : static_cast<T>(h >> 44);
    }
    if constexpr (!std::is_integral_v<T>) {
      if (h / 256 % 4 == 0) {
        return std::numeric_limits<T>::quiet_NaN();
      }
    }
    return T(-1);
  };
}

template <typename T>
struct copy_candidates {
  const T* from;
  sycl::accessor<T, 1, sycl::access_mode::write> into;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const { into[item] = from[item[0]]; }
};

struct failing_draw : std::runtime_error {
  failing_draw() : std::runtime_error("a draw that fails") {}
};

/// Draws from a sequence and keeps what it was asked for.
template <typename T>
struct script {
  script(const sycl::queue& on, const sequence<T>& of) : queue(on), candidate(of) {}

  static sycl::event draw(void* context, std::int64_t count, sycl::buffer<T, 1>& into) {
    auto& self = *static_cast<script*>(context);
    self.asked.push_back(count);
    if (self.asked.size() == self.failing) {
      throw failing_draw();
    }
    const auto size = static_cast<std::size_t>(count);
    EXPECT_LE(size, into.size());
    self.blocks.push_back(std::make_unique<results<T>>(self.queue, size));
    T* const from = self.blocks.back()->get();
    for (std::size_t i = 0; i < size; ++i) {
      from[i] = self.candidate(self.taken++);
    }
    self.last = self.queue.submit([&](sycl::handler& group) {
      group.depends_on(self.held);
      const copy_candidates<T> kernel{from, {into, group}};
      group.parallel_for(sycl::range<1>(size), kernel);
    });
    return self.last;
  }

  sycl::queue queue;
  sequence<T> candidate;
  std::vector<std::unique_ptr<results<T>>> blocks;
  std::size_t taken = 0;
  std::size_t failing = 0;  // number of the draw that fails; 0: none
  counts asked;
  sycl::event held;  // before which no kernel of a draw runs
  sycl::event last;
};

/// Turns v into 2 v + 1, exactly, and counts how often.
template <typename T>
struct doubling {
  std::int64_t* calls;

  SYCL_EXTERNAL T operator()(T v) const {
    sycl::atomic_ref<std::int64_t, sycl::memory_order::relaxed, sycl::memory_scope::device>(*calls)
        .fetch_add(1);
    return v * 2 + 1;
  }
};

template <typename T>
struct outcome {
  std::vector<T> values;
  counts asked;
  std::int64_t consumed = 0;
};

/// The passes as loops.
template <typename T>
outcome<T> expected(const sequence<T>& candidate, std::int64_t n, std::int64_t capacity,
                    bool in_pairs) {
  outcome<T> made;
  std::size_t k = 0;
  const auto keep = [&](T v) {
    const bool kept = v >= 0;
    if (kept) {
      made.values.push_back(v * 2 + 1);
    }
    return kept;
  };
  while (static_cast<std::int64_t>(made.values.size()) < n) {
    const std::int64_t missing = n - static_cast<std::int64_t>(made.values.size());
    std::int64_t count = missing < capacity ? missing : capacity;
    if (in_pairs && count == 1) {  // two candidates for one place
      made.asked.push_back(2);
      made.consumed += 4;
      const T first = candidate(k++), second = candidate(k++);
      keep(first >= 0 ? first : second);
      continue;
    }
    count -= in_pairs ? count % 2 : 0;
    made.asked.push_back(count);
    made.consumed += 2 * count;
    for (std::int64_t i = 0; i < count; ++i) {
      keep(candidate(k++));
    }
  }
  return made;
}

/// Memory for n results with guards on both sides, and a count of results made.
template <typename T>
struct guarded {
  guarded(const sycl::queue& queue, std::int64_t n)
      : size(static_cast<std::size_t>(n)), memory(queue, size + 2 * guard_size), calls(queue, 1) {
    *calls.get() = 0;
  }
  T* out() const { return memory.get() + guard_size; }
  std::vector<T> values() const { return {out(), out() + size}; }
  /// Whether what lies outside the first `written` results has kept its marker.
  bool untouched_behind(std::size_t written) const {
    const auto all = memory.values();
    for (std::size_t i = 0; i < all.size(); ++i) {
      const bool result = i >= guard_size && i < guard_size + written;
      if (!result && !same_bits(all[i], marker<T>())) {
        return false;
      }
    }
    return true;
  }

  std::size_t size;
  results<T> memory;
  results<std::int64_t> calls;
};

template <typename T>
bool all_same(const std::vector<T>& x, const std::vector<T>& y) {
  return x.size() == y.size() && std::equal(x.begin(), x.end(), y.begin(), same_bits<T>);
}

/// Runs a script into memory or into a buffer and compares with the loops.
template <typename T>
void expect_as_loops(sycl::queue queue, const sequence<T>& candidate, std::int64_t n, bool in_pairs,
                     bool into_buffer) {
  SCOPED_TRACE("groups of " + std::to_string(group_size(queue)) + ", n " + std::to_string(n) +
               (in_pairs ? ", in pairs" : "") + (into_buffer ? ", into a buffer" : ""));
  const outcome<T> loops = expected<T>(candidate, n, capacity_of(queue, n), in_pairs);
  script<T> engine(queue, candidate);
  guarded<T> on(queue, n);
  const gpu::candidate_step<T> step{&engine, &script<T>::draw};
  const doubling<T> post{on.calls.get()};
  sycl::event last;
  std::int64_t consumed = -1;
  if (into_buffer) {
    sycl::buffer<T, 1> buffer(on.out(), sycl::range<1>(on.size + guard_size));
    gpu::rejection_passes<T, doubling<T>, sycl::buffer<T, 1>> passes(queue, step, post, buffer);
    last = passes.run(n, in_pairs);
    consumed = passes.consumed();
  } else {
    gpu::rejection_passes<T, doubling<T>, T*> passes(queue, step, post, on.out());
    last = passes.run(n, in_pairs);
    consumed = passes.consumed();
  }
  EXPECT_EQ(last.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::complete);
  EXPECT_EQ(engine.asked, loops.asked);
  EXPECT_EQ(consumed, loops.consumed);
  EXPECT_EQ(consumed, static_cast<std::int64_t>(2 * engine.taken));
  EXPECT_TRUE(all_same(on.values(), loops.values));
  EXPECT_TRUE(on.untouched_behind(on.size));
  EXPECT_EQ(*on.calls.get(), n) << "post is for those that are accepted";
}

template <typename T>
class rejection : public testing::Test {};
using candidate_types = testing::Types<std::int32_t, float, double>;
TYPED_TEST_SUITE(rejection, candidate_types);
TARN_REPORTS_CUDA(rejection)

TEST(rejection_shapes, of_the_devices_are_all_there) {
  std::vector<std::size_t> sizes;
  for (const sycl::queue& queue : host_run_gpu_queues()) {
    sizes.push_back(group_size(queue));
  }
  EXPECT_EQ(sizes, (std::vector<std::size_t>{64, 128, 250, 256, 1024}));
}

TYPED_TEST(rejection, of_no_results_asks_for_nothing) {
  for (sycl::queue queue : gpu_queues()) {
    script<TypeParam> engine(queue, chosen<TypeParam>({}));
    guarded<TypeParam> on(queue, 0);
    gpu::rejection_passes<TypeParam, doubling<TypeParam>, TypeParam*> passes(
        queue, {&engine, &script<TypeParam>::draw}, {on.calls.get()}, on.out());
    for (const bool in_pairs : {false, true}) {
      EXPECT_EQ(passes.run(0, in_pairs), sycl::event());
      EXPECT_EQ(passes.run(-1, in_pairs), sycl::event());
    }
    EXPECT_EQ(passes.consumed(), 0);
    EXPECT_EQ(engine.asked, counts());
    EXPECT_TRUE(on.untouched_behind(0));
  }
}

// On both sides of the two capacities: 16384 candidates for calls below 10000 results, the square
// of the group size for others.
TYPED_TEST(rejection, fills_calls_of_every_size_in_the_order_of_the_candidates) {
  for (const sycl::queue& queue : gpu_queues()) {
    const std::int64_t square = capacity_of(queue, small_call);
    std::vector<std::int64_t> sizes = {small_call, 16385};
    if (serves_small_calls(queue)) {
      sizes.insert(sizes.end(), {1, 2, 3, 127, 4999, small_call - 1});
    }
    if (square >= small_call && square < 100000) {  // those of the largest groups are of a million
      sizes.insert(sizes.end(), {16384, square + 1, 2 * square + 77});
    }
    for (const std::int64_t n : sizes) {
      for (const bool in_pairs : {false, true}) {
        for (const bool all : {false, true}) {
          const auto candidate = all ? chosen<TypeParam>({}) : made_up<TypeParam>(square + n, 250);
          expect_as_loops<TypeParam>(queue, candidate, n, in_pairs, (n % 2 == 0) == all);
        }
      }
    }
  }
}

// A pass never has more candidates than results are missing.
TYPED_TEST(rejection, ends_passes_at_the_capacity) {
  for (const sycl::queue& queue : gpu_queues()) {
    if (group_size(queue) == 128) {
      const auto all = expected<TypeParam>(chosen<TypeParam>({}), 40000, 16384, false);
      EXPECT_EQ(all.asked, (counts{16384, 16384, 7232}));
      expect_as_loops<TypeParam>(queue, chosen<TypeParam>({}), 40000, false, false);
      expect_as_loops<TypeParam>(queue, made_up<TypeParam>(3, 128), 40001, true, true);
    }
  }
}

TYPED_TEST(rejection, goes_on_behind_passes_without_a_survivor) {
  for (sycl::queue queue : gpu_queues()) {
    for (const std::int64_t n : {std::int64_t{5}, small_call}) {
      if (n < small_call && !serves_small_calls(queue)) {
        continue;
      }
      const auto size = static_cast<std::size_t>(n);
      const std::vector<TypeParam> rejected(2 * size, TypeParam(-1));
      script<TypeParam> engine(queue, chosen<TypeParam>(rejected));
      guarded<TypeParam> on(queue, n);
      const std::int64_t capacity = capacity_of(queue, n);
      if (n <= capacity) {
        gpu::rejection_passes<TypeParam, doubling<TypeParam>, TypeParam*> passes(
            queue, {&engine, &script<TypeParam>::draw}, {on.calls.get()}, on.out());
        passes.run(n, false);
        EXPECT_EQ(engine.asked, counts(3, n));
        EXPECT_EQ(passes.consumed(), 6 * n);
        EXPECT_EQ(on.values(), std::vector<TypeParam>(size, TypeParam(15)));
      }
      expect_as_loops<TypeParam>(queue, chosen<TypeParam>(rejected), n, false, true);
    }
  }
}

TYPED_TEST(rejection, takes_zeros_and_leaves_what_is_not_a_number) {
  if constexpr (!std::is_integral_v<TypeParam>) {
    const auto nan = std::numeric_limits<TypeParam>::quiet_NaN();
    const TypeParam infinite = std::numeric_limits<TypeParam>::infinity();
    const TypeParam least = -std::numeric_limits<TypeParam>::denorm_min();
    for (sycl::queue queue : gpu_queues()) {
      if (!serves_small_calls(queue)) {
        continue;
      }
      // NaN first: were it moved to its place, it would lie before the output.
      const std::vector<TypeParam> some = {nan, -0.0, nan, 0, -nan, -1, infinite, least, 3, nan};
      for (const bool in_pairs : {false, true}) {
        for (const std::int64_t n : {1, 2, 4, 10, 11}) {
          expect_as_loops<TypeParam>(queue, chosen<TypeParam>(some), n, in_pairs, n % 2 == 0);
        }
      }
    }
  }
}

/// Leaves the sign of a zero.
template <typename T>
struct identity {
  SYCL_EXTERNAL T operator()(T v) const { return v; }
};

TYPED_TEST(rejection, moves_values_as_they_are) {
  for (sycl::queue queue : gpu_queues()) {
    if (!serves_small_calls(queue)) {
      continue;
    }
    const std::vector<TypeParam> first = {TypeParam(-1), TypeParam(-0.0), TypeParam(0),
                                          std::numeric_limits<TypeParam>::max()};
    script<TypeParam> engine(queue, chosen<TypeParam>(first));
    guarded<TypeParam> on(queue, 4);
    gpu::rejection_passes<TypeParam, identity<TypeParam>, TypeParam*> passes(
        queue, {&engine, &script<TypeParam>::draw}, {}, on.out());
    passes.run(4, false);
    EXPECT_TRUE(all_same(on.values(), {first[1], first[2], first[3], TypeParam(7)}));
    EXPECT_EQ(engine.asked, (counts{4, 1}));
  }
}

// Candidates that are made two at a time: a single result takes the first that is accepted.
TYPED_TEST(rejection, in_pairs_draws_a_last_result_by_itself) {
  const TypeParam no(-1);
  struct single {
    std::vector<TypeParam> first;
    std::int64_t n;
    counts asked;
    std::vector<TypeParam> values;
  };
  const std::vector<single> cases = {{{4, 5}, 1, {2}, {9}},
                                     {{no, 5}, 1, {2}, {11}},
                                     {{0, no}, 1, {2}, {1}},
                                     {{no, no, no, no, no, 3}, 1, {2, 2, 2}, {7}},
                                     {{1, 2, 3, 4}, 3, {2, 2}, {3, 5, 7}},
                                     {{1, no, no, 2, no, 6, 7}, 3, {2, 2, 2}, {3, 5, 13}},
                                     {{no, no, 1, 2, 3, no}, 2, {2, 2}, {3, 5}},
                                     {{1, 2, no, 3, no, no, no, 4}, 4, {4, 2, 2}, {3, 5, 7, 9}},
                                     {{1, 2, 3, 4}, 4, {4}, {3, 5, 7, 9}}};
  for (sycl::queue queue : gpu_queues()) {
    if (!serves_small_calls(queue)) {
      continue;
    }
    for (std::size_t i = 0; i < cases.size(); ++i) {
      SCOPED_TRACE("case " + std::to_string(i));
      const auto loops = expected<TypeParam>(chosen(cases[i].first), cases[i].n, 16384, true);
      EXPECT_EQ(loops.asked, cases[i].asked);
      EXPECT_EQ(loops.values, cases[i].values);
      expect_as_loops<TypeParam>(queue, chosen(cases[i].first), cases[i].n, true, i % 2 == 0);
    }
  }
}

TYPED_TEST(rejection, of_generated_patterns_is_that_of_the_loops) {
  std::mt19937_64 random(2024);
  const auto below = [&](std::uint64_t most) { return random() % most; };
  for (const sycl::queue& queue : gpu_queues()) {
    if (!serves_small_calls(queue) || group_size(queue) > 256) {
      continue;
    }
    for (int i = 0; i < 12; ++i) {
      const std::uint64_t seed = random();
      const auto accepted = static_cast<unsigned>(8 + below(249));
      const auto n = static_cast<std::int64_t>(1 + (i == 0 ? 10000 + below(30000) : below(3000)));
      SCOPED_TRACE("seed " + std::to_string(seed) + ", accepted " + std::to_string(accepted));
      expect_as_loops<TypeParam>(queue, made_up<TypeParam>(seed, accepted), n, below(2) == 0,
                                 below(2) == 0);
    }
  }
}

// The totals of 16384 / 64 groups do not fit one group: the device does not serve such calls, and
// what it had begun has ended when that is said.
TYPED_TEST(rejection, of_small_calls_is_refused_by_devices_of_small_groups) {
  int refused = 0;
  for (sycl::queue queue : gpu_queues()) {
    if (serves_small_calls(queue)) {
      continue;
    }
    for (const std::int64_t n : {std::int64_t{1}, std::int64_t{2}, small_call - 1}) {
      script<TypeParam> engine(queue, chosen<TypeParam>({}));
      guarded<TypeParam> on(queue, n);
      gate shut(queue);
      engine.held = shut.closed;
      gpu::rejection_passes<TypeParam, doubling<TypeParam>, TypeParam*> passes(
          queue, {&engine, &script<TypeParam>::draw}, {on.calls.get()}, on.out());
      shut.open_during([&] { EXPECT_THROW(passes.run(n, false), sycl::exception); });
      EXPECT_EQ(engine.asked, counts{n});
      EXPECT_EQ(*on.calls.get(), 0);
      queue.wait_and_throw();
      EXPECT_TRUE(on.untouched_behind(0));
      ++refused;
    }
    expect_as_loops<TypeParam>(queue, made_up<TypeParam>(1, 200), small_call, false, false);
  }
  EXPECT_EQ(refused, 3);
}

// Results of finished passes stay; nothing else is written, and nothing runs any more.
TYPED_TEST(rejection, that_fails_in_a_draw_keeps_the_passes_before) {
  for (sycl::queue queue : gpu_queues()) {
    const std::int64_t n = serves_small_calls(queue) ? 901 : small_call + 1;
    for (const bool in_pairs : {false, true}) {
      const auto candidate = made_up<TypeParam>(11, 130);
      const auto whole = expected<TypeParam>(candidate, n, capacity_of(queue, n), in_pairs);
      ASSERT_GT(whole.asked.size(), 4u);
      for (std::size_t failing = 1; failing <= 4; ++failing) {
        SCOPED_TRACE("draw " + std::to_string(failing));
        std::size_t drawn = 0, made = 0;
        for (std::size_t i = 0; i + 1 < failing; ++i) {
          drawn += static_cast<std::size_t>(whole.asked[i]);
        }
        for (std::size_t k = 0; k < drawn; ++k) {
          made += candidate(k) >= 0 ? 1 : 0;
        }
        guarded<TypeParam> on(queue, n);
        script<TypeParam> engine(queue, candidate);
        engine.failing = failing;
        const gpu::candidate_step<TypeParam> step{&engine, &script<TypeParam>::draw};
        if (failing % 2 == 0) {
          gpu::rejection_passes<TypeParam, doubling<TypeParam>, TypeParam*> passes(
              queue, step, {on.calls.get()}, on.out());
          EXPECT_THROW(passes.run(n, in_pairs), failing_draw);
          EXPECT_EQ(passes.consumed(), static_cast<std::int64_t>(2 * drawn));
        } else {
          sycl::buffer<TypeParam, 1> buffer(on.out(), sycl::range<1>(on.size));
          gpu::rejection_passes<TypeParam, doubling<TypeParam>, sycl::buffer<TypeParam, 1>> passes(
              queue, step, {on.calls.get()}, buffer);
          EXPECT_THROW(passes.run(n, in_pairs), failing_draw);
        }
        EXPECT_EQ(engine.taken, drawn);
        EXPECT_EQ(*on.calls.get(), static_cast<std::int64_t>(made));
        auto results_made = on.values();
        results_made.resize(made);
        EXPECT_TRUE(all_same(
            results_made,
            {whole.values.begin(), whole.values.begin() + static_cast<std::ptrdiff_t>(made)}));
        EXPECT_TRUE(on.untouched_behind(made));
      }
    }
  }
}

// The last result of an odd rest in pairs: the draw that fails is one for it alone.
TYPED_TEST(rejection, that_fails_in_the_draw_of_the_last_result_keeps_the_others) {
  for (sycl::queue queue : gpu_queues()) {
    if (!serves_small_calls(queue)) {
      continue;
    }
    const TypeParam no(-1);
    script<TypeParam> engine(queue, chosen<TypeParam>({1, 2, no, no}));
    engine.failing = 3;
    guarded<TypeParam> on(queue, 3);
    gpu::rejection_passes<TypeParam, doubling<TypeParam>, TypeParam*> passes(
        queue, {&engine, &script<TypeParam>::draw}, {on.calls.get()}, on.out());
    EXPECT_THROW(passes.run(3, true), failing_draw);
    EXPECT_EQ(engine.asked, (counts{2, 2, 2}));
    EXPECT_EQ(on.out()[0], TypeParam(3));
    EXPECT_EQ(on.out()[1], TypeParam(5));
    EXPECT_TRUE(on.untouched_behind(2));
  }
}

}  // namespace
