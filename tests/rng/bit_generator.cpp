// SPDX-License-Identifier: Apache-2.0
// Every engine as a uniform random bit generator: its words, the count of words that it takes from
// the engine, what drives standard algorithms, and what is refused.
#include <algorithm>
#include <cstdint>
#include <numeric>
#include <random>
#include <string>
#include <tarn_serv.h>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

using words = std::vector<std::uint32_t>;
constexpr std::int64_t block = 1024;

/// [rand.req.urng], as a C++17 type trait.
template <typename Generator, typename Result = typename Generator::result_type>
constexpr bool is_bit_generator() {
  static_assert(std::is_unsigned_v<Result>);
  static_assert(std::is_same_v<decltype(std::declval<Generator&>()()), Result>);
  static_assert(std::is_same_v<decltype(Generator::min()), Result>);
  static_assert(std::is_same_v<decltype(Generator::max()), Result>);
  static_assert(Generator::min() < Generator::max());
  // A copy would hand out the same words and give them back twice.
  static_assert(!std::is_copy_constructible_v<Generator> && !std::is_copy_assignable_v<Generator>);
  static_assert(!std::is_move_constructible_v<Generator> && !std::is_move_assignable_v<Generator>);
  static_assert(std::is_nothrow_destructible_v<Generator>);
  return true;
}
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  static_assert(is_bit_generator<rng::bit_generator<rng::name>>());
#include "engines/engines.def"

/// What the engine's own calls give: fair bits where it has them.
template <typename Engine>
words own_words(Engine& engine, std::int64_t n) {
  if constexpr (rng::detail::engine_row<Engine>::uniform_bits) {
    return draw(rng::uniform_bits<std::uint32_t>(), engine, n);
  } else {
    return draw(rng::bits<std::uint32_t>(), engine, n);
  }
}

template <typename Generator>
words taken(Generator& view, std::int64_t n) {
  words values(static_cast<std::size_t>(n), marker<std::uint32_t>());
  for (std::uint32_t& value : values) {
    value = view();
  }
  return values;
}

/// Calls `call(engine_case, queue)` for the engines that give the same words for the same seed, on
/// every queue that they have a road on.
template <typename Call>
void for_every_repeating_engine(const Call& call) {
  int engines = 0;
  int queues = 0;
  for_every_engine([&](const auto& on) {
    if (on.repeats()) {
      ++engines;
      for (const named_queue& device : all_queues()) {
        if (device.queue.get_device().is_cpu() || on.gpu) {
          SCOPED_TRACE(device.name);
          ++queues;
          call(on, device.queue);
        }
      }
    }
  });
  EXPECT_EQ(engines, 12);
  EXPECT_GT(queues, 12);  // philox4x32x10 at least has a device road
}

/// The first words of an engine of the case's seed.
template <typename Case>
words serial(const Case& on, const sycl::queue& queue, std::int64_t n) {
  auto engine = on.make(queue);
  return own_words(engine, n);
}
words part(const words& all, std::int64_t first, std::int64_t n) {
  return words(all.begin() + first, all.begin() + first + n);
}

TEST(view, gives_the_words_of_the_engine_in_order) {
  for_every_repeating_engine([](const auto& on, const sycl::queue& queue) {
    constexpr std::int64_t n = 3 * block + 5;
    auto engine = on.make(queue);
    rng::bit_generator view(engine);
    EXPECT_EQ(taken(view, n), serial(on, queue, n));
  });
}

TEST(view, leaves_the_engine_behind_the_last_word) {
  for_every_repeating_engine([](const auto& on, const sycl::queue& queue) {
    const words all = serial(on, queue, 3 * block + 20);
    for (const std::int64_t n :
         {std::int64_t{0}, std::int64_t{1}, std::int64_t{2}, std::int64_t{623}, block - 1, block,
          block + 1, 2 * block - 1, 2 * block, 2 * block + 700, 3 * block - 1, 3 * block}) {
      auto engine = on.make(queue);
      own_words(engine, 5);
      {
        rng::bit_generator view(engine);
        ASSERT_EQ(taken(view, n), part(all, 5, n)) << n;
      }
      ASSERT_EQ(own_words(engine, 9), part(all, 5 + n, 9)) << "behind " << n;
    }
  });
}

TEST(view, shares_one_sequence_with_calls) {
  for_every_repeating_engine([](const auto& on, const sycl::queue& queue) {
    const words all = serial(on, queue, 4 * block);
    auto engine = on.make(queue);
    rng::bit_generator view(engine);
    std::int64_t at = 0;
    for (const std::int64_t n : {std::int64_t{3}, block, std::int64_t{0}, block + 17}) {
      ASSERT_EQ(taken(view, n), part(all, at, n));
      view.release();
      at += n;
      ASSERT_EQ(own_words(engine, 7), part(all, at, 7));
      at += 7;
      view.release();  // there is nothing to give back
    }
    EXPECT_EQ(own_words(engine, 9), part(all, at, 9));
  });
}

TEST(view, follows_another_one) {
  for_every_repeating_engine([](const auto& on, const sycl::queue& queue) {
    const words all = serial(on, queue, block + 60);
    auto engine = on.make(queue);
    rng::bit_generator first(engine);
    rng::bit_generator second(engine);
    EXPECT_EQ(taken(first, 10), part(all, 0, 10));
    first.release();
    EXPECT_EQ(taken(second, block + 20), part(all, 10, block + 20));
    second.release();
    EXPECT_EQ(taken(first, 10), part(all, block + 30, 10));
  });
}

TEST(view, keeps_inside_its_bounds) {
  for_every_engine([](const auto& on) {
    using view_type = rng::bit_generator<typename std::decay_t<decltype(on)>::Engine>;
    auto engine = on.make(cpu_queue());
    view_type view(engine);
    const words values = taken(view, 100000);
    const auto [least, greatest] = std::minmax_element(values.begin(), values.end());
    EXPECT_GE(*least, view_type::min());
    EXPECT_LE(*greatest, view_type::max());
    // 100,000 fair words leave a thousandth at either end empty with probability e^-100.
    const double width = double(view_type::max()) - double(view_type::min());
    EXPECT_LT(*least, double(view_type::min()) + width / 1000);
    EXPECT_GT(*greatest, double(view_type::max()) - width / 1000);
  });
}

// The first word of mcg31m1 is its seed.
TEST(bounds, of_mcg31m1_are_words_of_it) {
  for (const std::uint32_t seed : {1u, 0x7FFFFFFEu}) {
    rng::mcg31m1 engine(cpu_queue(), seed);
    rng::bit_generator view(engine);
    EXPECT_EQ(view(), seed);
  }
  using view_type = rng::bit_generator<rng::mcg31m1>;
  EXPECT_EQ(view_type::min(), 1u);
  EXPECT_EQ(view_type::max(), 0x7FFFFFFEu);
}

// Seeds {0, s, 0, 0, 1, 0} make the next x equal to 1403580 s modulo 4294967087 and the next y 0:
// the word is that x, or the modulus where x is 0.
TEST(bounds, of_mrg32k3a_are_words_of_it) {
  using view_type = rng::bit_generator<rng::mrg32k3a>;
  constexpr std::uint32_t inverse = 3747216340;  // 1403580 times it is 1
  static_assert(std::uint64_t{1403580} * inverse % 4294967087 == 1);
  rng::mrg32k3a least(cpu_queue(), {0, inverse, 0, 0, 1, 0});
  rng::mrg32k3a greatest(cpu_queue(), {0, 0, 1, 0, 1, 0});
  EXPECT_EQ(view_type(least)(), view_type::min());
  EXPECT_EQ(view_type(greatest)(), view_type::max());
  EXPECT_EQ(view_type::max(), 4294967087u);
}

/// A generator over words drawn before, of the range of another one; counts what is used.
template <typename View>
struct model_generator {
  using result_type = std::uint32_t;
  static constexpr result_type min() { return View::min(); }
  static constexpr result_type max() { return View::max(); }
  result_type operator()() { return all.at(used++); }

  words all;
  std::size_t used = 0;
};

/// Runs `use(generator)` on a view and on the model: the results are equal, and the engine is moved
/// by what the model used.
template <typename Use>
void expect_like_the_model(const Use& use) {
  for_every_repeating_engine([&](const auto& on, const sycl::queue& queue) {
    using view_type = rng::bit_generator<typename std::decay_t<decltype(on)>::Engine>;
    auto engine = on.make(queue);
    model_generator<view_type> model{serial(on, queue, 20 * block)};
    const auto expected = use(model);
    EXPECT_EQ(use(view_type(engine)), expected);
    EXPECT_GT(model.used, 0u);
    EXPECT_EQ(own_words(engine, 5), part(model.all, static_cast<std::int64_t>(model.used), 5));
  });
}

std::vector<int> ascending() {
  std::vector<int> values(3000);
  std::iota(values.begin(), values.end(), 0);
  return values;
}

// One walk over the engines for all uses: each instantiates for every engine anew.
TEST(algorithms, and_distributions_are_driven) {
  expect_like_the_model([](auto&& generator) {
    std::vector<int> values = ascending();
    std::shuffle(values.begin(), values.end(), generator);
    EXPECT_NE(values, ascending());
    std::vector<int> sorted = values;
    std::sort(sorted.begin(), sorted.end());
    EXPECT_EQ(sorted, ascending());

    std::uniform_int_distribution<int> nine(-3, 5);
    std::vector<int> counts(9);
    for (int i = 0; i < 2000; ++i) {
      ++counts.at(static_cast<std::size_t>(nine(generator) + 3));
    }
    EXPECT_GT(*std::min_element(counts.begin(), counts.end()), 0);

    std::normal_distribution<double> normal(2.0, 0.5);
    std::vector<double> reals(1000);
    std::generate(reals.begin(), reals.end(), [&] { return normal(generator); });
    return std::make_tuple(values, counts, reals);
  });
}

TEST(nondeterministic, shuffles_and_never_repeats) {
  rng::nondeterministic engine(cpu_queue());
  std::vector<int> values = ascending();
  std::shuffle(values.begin(), values.end(), rng::bit_generator(engine));
  EXPECT_NE(values, ascending());
  EXPECT_TRUE(std::is_permutation(values.begin(), values.end(), ascending().begin()));
  rng::bit_generator view(engine);
  const words first = taken(view, 8);
  view.release();
  EXPECT_NE(taken(view, 8), first);
}

/// Counts reports of bad arguments instead of printing them while it lives.
class counted_reports {
 public:
  counted_reports() {
    count = 0;
    tarn_serv_set_xerbla_interface(
        reinterpret_cast<void*>(+[](const char*, const int*, int) { ++count; }), 0);
  }
  counted_reports(const counted_reports&) = delete;
  counted_reports& operator=(const counted_reports&) = delete;
  ~counted_reports() { tarn_serv_set_xerbla_interface(nullptr, 1); }

  static inline int count = 0;
};

const std::string no_words =
    "kestrel::tarn::rng::bit_generator: computation error: words could not be drawn";

template <typename Engine>
void expect_end() {
  constexpr std::uint32_t dimensions = 7;
  const counted_reports reports;
  Engine engine(cpu_queue(), dimensions);
  rng::skip_ahead(engine, dimensions * std::uint64_t{0xFFFFFFFF} - 5);
  Engine same = engine;
  rng::bit_generator view(engine);
  EXPECT_EQ(taken(view, 3), own_words(same, 3));
  view.release();
  EXPECT_EQ(own_words(engine, 1), own_words(same, 1));
  EXPECT_EQ(taken(view, 1), own_words(same, 1));
  EXPECT_EQ(reports.count, 0);
  for (int i = 1; i <= 2; ++i) {
    EXPECT_EQ(message_of<tarn::computation_error>([&] { view(); }), no_words);
    EXPECT_EQ(reports.count, i);
  }
  view.release();
  EXPECT_EQ(image_of(engine), image_of(same));
}

TEST(end_of_the_sequence, raises_of_sobol) {
  expect_end<rng::sobol>();
}
TEST(end_of_the_sequence, raises_of_niederreiter) {
  expect_end<rng::niederreiter>();
}

std::string unsupported(const sycl::queue& queue) {
  return "kestrel::tarn::rng::bit_generator: unsupported device: " +
         queue.get_device().get_info<sycl::info::device::name>();
}

// An engine can come to stand on a queue that its constructor would have refused.
TEST(devices, without_a_road_are_refused_and_no_word_is_lost) {
  for_every_engine([](const auto& on) {
    const words all = on.repeats() ? serial(on, cpu_queue(), block + 9) : words();
    std::vector<sycl::queue> refused;
    refused.reserve(2);
    refused.push_back(accelerator_queue());
    if (!on.gpu) {
      refused.push_back(gpu_queue());
    }
    for (const sycl::queue& other : refused) {
      const auto refusal = [&](auto& view) {
        return message_of<tarn::unsupported_device>([&] { view(); });
      };
      auto engine = on.make(cpu_queue());
      rng::bit_generator view(engine);
      engine.get_queue() = other;
      EXPECT_EQ(refusal(view), unsupported(other));
      engine.get_queue() = cpu_queue();
      const words first = taken(view, block);
      engine.get_queue() = other;
      EXPECT_EQ(refusal(view), unsupported(other));
      EXPECT_EQ(refusal(view), unsupported(other));
      engine.get_queue() = cpu_queue();
      const words rest = taken(view, 9);
      if (on.repeats()) {
        EXPECT_EQ(first, part(all, 0, block));
        EXPECT_EQ(rest, part(all, block, 9));
      }
    }
  });
}

// An engine of many generators has no sequence that a stream could stand for.
TEST(views, of_many_generators_are_refused) {
  rng::mrg32k3a split(gpu_queue(), 7, rng::mrg32k3a_mode::custom(64));
  rng::bit_generator of_split(split);
  EXPECT_EQ(message_of<tarn::computation_error>([&] { of_split(); }),
            "kestrel::tarn::rng::bit_generator: computation error:  does not support mrg32k3a with "
            "sub-sequence parallelization");
  rng::mt2203 family(gpu_queue(), 7);
  rng::bit_generator of_family(family);
  EXPECT_EQ(message_of<tarn::computation_error>([&] { of_family(); }),
            "kestrel::tarn::rng::bit_generator: computation error:  does not support multi-state "
            "mt2203");
}

TEST(streams, that_are_not_in_order_raise_and_no_word_is_lost) {
  const counted_reports reports;
  rng::philox4x32x10 engine(cpu_queue(), 7);
  rng::philox4x32x10 same = engine;
  auto* mark =
      static_cast<std::uint8_t*>(rng::detail::engine_access::impl(engine)->stream.get()) + 4;
  rng::bit_generator view(engine);
  *mark = 0;
  EXPECT_EQ(message_of<tarn::computation_error>([&] { view(); }),
            "kestrel::tarn::rng::engine initialization: computation error: initialization failure");
  *mark = 1;
  EXPECT_EQ(taken(view, 5), own_words(same, 5));
  view.release();
  EXPECT_EQ(own_words(engine, 5), own_words(same, 5));
}

}  // namespace
