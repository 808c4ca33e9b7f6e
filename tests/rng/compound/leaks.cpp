// SPDX-License-Identifier: Apache-2.0
// What a rejecting or compound call takes of memory it gives back: when it ends, when an allocation
// fails, when a pass raises. Its records, tables and scratch go when the last kernel has run.
#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <dlfcn.h>
#include <iterator>
#include <new>
#include <string>
#include <thread>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "compound_cases.hpp"
#include "device_engines.hpp"
#include "every_engine.hpp"
#include "failing_memory.hpp"
#include "in_flight.hpp"
#include "message.hpp"

namespace {

// Arrays of shared memory that were taken while it was watched, on any thread.
std::atomic<bool> watched{false};
std::atomic<int> left{0};        // arrays until the failing one; 0: none fails
std::atomic<void*> arrays[256];  // those that are there
std::atomic<int> given_back{0};
std::atomic<int> gone_early{0};     // of those: before the results of the call were there
bool (*results_there)() = nullptr;  // whether they are

/// Puts `now` in the place of `before`; whether there was such a place.
bool replace(void* before, void* now) {
  return std::any_of(std::begin(arrays), std::end(arrays), [&](std::atomic<void*>& place) {
    void* expected = before;
    return place.compare_exchange_strong(expected, now);
  });
}

bool all_arrays_are_gone() {
  return std::all_of(std::begin(arrays), std::end(arrays),
                     [](const std::atomic<void*>& place) { return place == nullptr; });
}

template <typename Function>
Function* next_of(const char* name, Function*) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

// The function that the runtime takes shared memory from, put before that of the C library.
[[gnu::visibility("default")]] int posix_memalign(void** pointer, std::size_t alignment,
                                                  std::size_t bytes) noexcept {
  static const auto next = next_of("posix_memalign", &posix_memalign);
  if (!watched) {
    return next(pointer, alignment, bytes);
  }
  if (left != 0 && --left == 0) {
    return ENOMEM;
  }
  const int status = next(pointer, alignment, bytes);
  if (status == 0 && !replace(nullptr, *pointer)) {
    std::abort();  // more arrays at a time than any call has
  }
  return status;
}

// The runtime's own, with a look at the results.
void sycl::free(void* pointer, const sycl::context& context) {
  using function = void(void*, const sycl::context&);
  static const auto next = [] {
    Dl_info own;
    dladdr(reinterpret_cast<void*>(static_cast<function*>(&sycl::free)), &own);
    return next_of(own.dli_sname, static_cast<function*>(nullptr));
  }();
  if (pointer != nullptr && replace(pointer, nullptr)) {
    ++given_back;
    gone_early += results_there != nullptr && !results_there() ? 1 : 0;
  }
  next(pointer, context);
}

namespace {

namespace tarn = kestrel::tarn;
using namespace tarn_test;

/// Watches shared memory while it lives.
struct watch {
  explicit watch(int failing = 0) {
    given_back = gone_early = 0;
    left = failing;
    watched = true;
  }
  watch(const watch&) = delete;
  watch& operator=(const watch&) = delete;
  ~watch() { watched = false; }
};

/// Waits until `settled()`: on a GPU queue a worker gives what belonged to a command back some time
/// after the command is complete. A leak is what never comes.
template <typename Settled>
bool settles(const Settled& settled) {
  for (int naps = 0; !settled() && naps < 50; ++naps) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return settled();
}

/// Runs `once` and expects that it gives all blocks and arrays back. A thread of the runtime keeps
/// what it has needed for its first work-group with a barrier, so there are more runs; a leak shows
/// in each of them.
template <typename Run>
void expect_all_given_back(const Run& once) {
  constexpr int runs = 24;
  bool no_blocks = false, no_arrays = false;
  for (int run = 0; run < runs && !(no_blocks && no_arrays) && !testing::Test::HasFailure();
       ++run) {
    const std::int64_t before = live_blocks();
    once();
    no_arrays = settles(all_arrays_are_gone);
    no_blocks = settles([&] { return live_blocks() <= before; });
  }
  EXPECT_TRUE(no_blocks) << "blocks are lost";
  EXPECT_TRUE(no_arrays) << "arrays of shared memory are lost";
}

/// An engine and memory for the results of a case, made outside of what is watched.
template <typename Engine, typename Distr>
struct prepared {
  prepared(const compound_case<Distr>& drawn_, std::int64_t n_,
           const sycl::queue& queue = gpu_queue())
      : drawn(drawn_),
        n(n_),
        engine(engine_case<Engine, rng::detail::device_type::gpu>::make(queue)),
        out(queue, static_cast<std::size_t>(n * drawn.width) + guard_size) {}

  void call() { rng::generate(drawn.distr, engine, n, out.get()).wait_and_throw(); }

  compound_case<Distr> drawn;
  std::int64_t n;
  Engine engine;
  results<typename Distr::result_type> out;
};

/// The first row of each family: types and layouts share the roads.
using family_distributions =
    testing::Types<rng::gamma<float>, rng::beta<float>, rng::chi_square<float>,
                   rng::gaussian_mv<float, rng::matrix_layout::full>, rng::poisson_v<>,
                   rng::binomial<>, rng::negative_binomial<>, rng::hypergeometric<>,
                   rng::multinomial<>>;

struct family_name {
  template <typename Distr>
  static std::string GetName(int) {
    return rng::detail::distribution_row<Distr>::family;
  }
};

template <typename Distr>
class compound_memory : public testing::Test {
 protected:
  /// Walks the roads of the family for n results.
  template <typename Visit>
  static void for_every_road(std::int64_t n, const Visit& visit) {
    int roads = 0;
    for (const auto& drawn : compound_cases<Distr>::all(n)) {
      SCOPED_TRACE(drawn.road);
      visit(drawn);
      ++roads;
    }
    EXPECT_GT(roads, 0);
  }
};
TYPED_TEST_SUITE(compound_memory, family_distributions, family_name);

template <typename Engine, typename Distr>
void expect_given_back(const compound_case<Distr>& drawn, std::int64_t n) {
  SCOPED_TRACE(rng::detail::engine_row<Engine>::name);
  prepared<Engine, Distr> on(drawn, n);
  on.call();  // an engine keeps its last event
  expect_all_given_back([&] {
    const watch watching;
    on.call();
  });
}

TYPED_TEST(compound_memory, is_given_back_behind_a_call) {
  for (const std::int64_t n : {1, 6}) {
    this->for_every_road(n, [&](const auto& drawn) {
      expect_given_back<rng::philox4x32x10>(drawn, n);
      expect_given_back<rng::mt19937>(drawn, n);
      expect_given_back<rng::mt2203>(drawn, n);
      expect_given_back<rng::sobol>(drawn, n);
    });
  }
}

/// Records, tables, scratch and copies of a call: one, but for formulas and single values.
template <typename Distr>
int arrays_expected(const compound_case<Distr>& drawn) {
  const std::string family = family_name::GetName<Distr>(0);
  const bool by_formula = family == "gaussian_mv" || family == "gamma" || family == "beta" ||
                          (family == "chi_square" && drawn.words == by_rejection);
  return by_formula || drawn.words == 0 ? 0 : 1;
}

/// Each array of shared memory of a call fails in turn; how many there are.
template <typename Engine, typename Distr>
int arrays_of(const compound_case<Distr>& drawn, std::int64_t n, bool stays) {
  const std::string name = rng::detail::engine_row<Engine>::name;
  const std::string refusal = "kestrel::tarn::rng::" + name + ": cannot allocate memory on " +
                              gpu_queue().get_device().get_info<sycl::info::device::name>();
  for (int number = 1;; ++number) {
    SCOPED_TRACE(name + ", array " + std::to_string(number));
    std::string message;
    expect_all_given_back([&] {
      prepared<Engine, Distr> on(drawn, n);
      {
        const watch watching(number);
        message = message_of<tarn::device_bad_alloc>([&] { on.call(); });
      }
      if (message == refusal && stays) {
        EXPECT_TRUE(on.out.untouched());
        expect_next<engine_case<Engine>>(on.engine, 0, 5);
      } else {
        next(on.engine, 5);
      }
    });
    if (message != refusal) {
      EXPECT_EQ(message, "[nothing raised]");
      return number - 1;
    }
  }
}

// With philox an array is there before anything is drawn; sobol has words of its own between the
// kernels of each pass.
TYPED_TEST(compound_memory, that_cannot_be_had_is_said_in_the_name_of_the_engine) {
  this->for_every_road(3, [&](const auto& drawn) {
    const int own = arrays_of<rng::philox4x32x10>(drawn, 3, true);
    EXPECT_EQ(own, arrays_expected(drawn));
    const int with_words = arrays_of<rng::sobol>(drawn, 3, false);
    EXPECT_GE(with_words, own + (drawn.words == by_rejection ? 1 : 0));
  });
}

/// Every block of a call fails once, alone and with all behind it: the call raises, or it does
/// without. A lost array shows as a lost block, its entry in the runtime's table.
template <typename Engine, typename Distr>
void expect_survival(const compound_case<Distr>& drawn, std::int64_t n) {
  for (const failing which : {failing::one, failing::all_from_there}) {
    bool happened = true;
    int number = 0;
    while (happened && !testing::Test::HasFailure()) {
      SCOPED_TRACE(std::string(rng::detail::engine_row<Engine>::name) + ", block " +
                   std::to_string(++number));
      expect_all_given_back([&] {
        prepared<Engine, Distr> on(drawn, n);
        bool passed = false;
        {
          failing_memory memory(number, which);
          try {
            rng::generate(on.drawn.distr, on.engine, n, on.out.get());
            passed = true;
          } catch (const std::bad_alloc&) {
          } catch (const tarn::computation_error&) {  // of a skip
          }
          memory.end();
          happened = memory.happened();
          on.engine.get_queue().wait_and_throw();
        }
        EXPECT_TRUE(passed || happened);
        EXPECT_TRUE(!passed || !on.out.untouched());
        next(on.engine, 5);  // it goes on from some place
      });
    }
    EXPECT_GT(number, 1) << "nothing was allocated";
  }
}

TYPED_TEST(compound_memory, of_blocks_that_fail_is_given_back) {
  this->for_every_road(2,
                       [&](const auto& drawn) { expect_survival<rng::philox4x32x10>(drawn, 2); });
}

// What a kernel reads is there until it has run: no array goes before all results are written.
TYPED_TEST(compound_memory, stays_until_the_results_are_there) {
  using T = typename TypeParam::result_type;
  constexpr std::int64_t n = 20001;
  this->for_every_road(n, [&](const auto& drawn) {
    if (drawn.words == 0) {
      return;  // some leave part of their rows alone
    }
    prepared<rng::philox4x32x10, TypeParam> on(drawn, n);
    static T* first;
    static T* last;
    first = on.out.get();
    last = first + n * drawn.width;
    results_there = [] {
      return std::none_of(first, last, [](const T& x) { return same_bits(x, marker<T>()); });
    };
    {
      const watch watching;
      on.call();
      EXPECT_TRUE(all_arrays_are_gone());
      EXPECT_EQ(gone_early, 0);
    }
    EXPECT_TRUE(results_there());
    results_there = nullptr;
    EXPECT_EQ(given_back, arrays_expected(drawn));
  });
}

// The groups of the second device are too small for calls below 10000 results.
TEST(compound_memory_of_small_groups, is_given_back_by_a_refused_call) {
  int refused = 0;
  for (const sycl::queue& queue : gpu_queues()) {
    if (queue.get_device().get_info<sycl::info::device::max_work_group_size>() >= 128) {
      continue;
    }
    for (const auto& drawn : compound_cases<rng::binomial<>>::all(100)) {
      if (drawn.words == by_rejection) {
        prepared<rng::philox4x32x10, rng::binomial<>> on(drawn, 100, queue);
        expect_all_given_back([&] {
          const watch watching;
          EXPECT_THROW(on.call(), sycl::exception);
          on.engine.get_queue().wait_and_throw();
        });
        EXPECT_TRUE(on.out.untouched());
        ++refused;
      }
    }
  }
  EXPECT_EQ(refused, 2);
}

/// A call whose first pass takes the last words of the sequence.
template <typename Distr>
void expect_end_between_passes(const compound_case<Distr>& drawn) {
  using T = typename Distr::result_type;
  constexpr std::int64_t n = 200;
  SCOPED_TRACE(drawn.road);
  expect_all_given_back([&] {
    prepared<rng::sobol, Distr> on(drawn, n);
    on.engine = rng::sobol(gpu_queue(), 1);
    rng::skip_ahead(on.engine, std::uint64_t{0xFFFFFFFF} - 2 * n);
    {
      const watch watching;
      EXPECT_EQ(message_of<tarn::computation_error>([&] { on.call(); }),
                "kestrel::tarn::rng::sobol: computation error: generator period is exceeded");
    }
    // The results of that pass are there, and nothing else.
    const auto values = on.out.values();
    const auto unwritten = [](const T& x) { return same_bits(x, marker<T>()); };
    const auto end = std::find_if(values.begin(), values.end(), unwritten);
    EXPECT_GT(end - values.begin(), n / 4);
    EXPECT_LT(end - values.begin(), n);
    EXPECT_TRUE(std::all_of(end, values.end(), unwritten));
    // The engine is behind it: at the end.
    EXPECT_EQ(message_of<tarn::computation_error>([&] { rng::skip_ahead(on.engine, 1); }),
              "kestrel::tarn::rng::sobol: computation error: generator period is exceeded");
  });
}

TEST(compound_memory_of_sobol, is_given_back_where_the_sequence_ends_between_passes) {
  for (const auto& drawn : compound_cases<rng::binomial<>>::all(200)) {
    if (drawn.words == by_rejection) {
      expect_end_between_passes(drawn);
    }
  }
  expect_end_between_passes(compound_cases<rng::gamma<double>>::all(200)[2]);
  expect_end_between_passes(compound_cases<rng::beta<float>>::all(200)[2]);
}

}  // namespace
