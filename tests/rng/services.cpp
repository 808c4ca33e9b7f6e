// SPDX-License-Identifier: Apache-2.0
// Services of every engine on a CPU queue: copies, moves, skips, leaps, saved states.
#include <cstdint>
#include <cstdio>
#include <string>
#include <tarn_serv.h>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "frame/rows.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

/// One value for one word on every engine.
template <typename Engine>
std::vector<double> next(Engine& engine, std::int64_t n) {
  return draw(rng::uniform<double>(-1.0, 1.0), engine, n);
}

/// What an engine of this seed gives, `first` words in.
template <typename Case>
std::vector<double> serial(const Case& on, std::int64_t first, std::int64_t n) {
  auto engine = on.make(cpu_queue());
  next(engine, first);
  return next(engine, n);
}

/// Calls `call(engine_case)` for the engines that give the same words for the same seed.
template <typename Call>
void for_every_repeating_engine(const Call& call) {
  int engines = 0;
  for_every_engine([&](const auto& on) {
    if (on.repeats()) {
      ++engines;
      call(on);
    }
  });
  EXPECT_EQ(engines, 12);
}

TEST(copies, go_on_alone) {
  for_every_repeating_engine([](const auto& on) {
    auto source = on.make(cpu_queue());
    next(source, 5);
    auto copy = source;
    EXPECT_EQ(next(source, 9), serial(on, 5, 9));
    EXPECT_EQ(next(copy, 3), serial(on, 5, 3));
    copy = source;
    next(source, 2);
    EXPECT_EQ(next(copy, 4), serial(on, 14, 4));
    auto& same = copy;
    copy = same;
    EXPECT_EQ(next(copy, 4), serial(on, 18, 4));
  });
}

TEST(moves, take_over) {
  for_every_repeating_engine([](const auto& on) {
    auto source = on.make(cpu_queue());
    next(source, 5);
    auto target = std::move(source);
    EXPECT_EQ(next(target, 3), serial(on, 5, 3));
    source = std::move(target);
    EXPECT_EQ(next(source, 3), serial(on, 8, 3));
  });
}

TEST(skips, equal_drawing) {
  int engines = 0;
#define TARN_SKIPPING(name)                                                 \
  {                                                                         \
    ++engines;                                                              \
    const engine_case<rng::name> on{};                                      \
    for (const std::uint64_t count : {0u, 1u, 3u, 4u, 17u, 1000u, 2600u}) { \
      auto engine = on.make(cpu_queue());                                   \
      next(engine, 6);                                                      \
      rng::skip_ahead(engine, count);                                       \
      ASSERT_EQ(next(engine, 30), serial(on, 6 + std::int64_t(count), 30))  \
          << #name << " by " << count;                                      \
    }                                                                       \
  }
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_IF_##skip(TARN_SKIPPING(name))
#include "engines/engines.def"
  EXPECT_EQ(engines, 10);
}

// 2^64 + 5 words: a skip by 5, and two by 2^63.
TEST(skips, by_a_list_are_by_a_number_in_64_bit_digits) {
  int engines = 0;
#define TARN_LIST_SKIPPING(name)                         \
  {                                                      \
    ++engines;                                           \
    const engine_case<rng::name> on{};                   \
    auto by_list = on.make(cpu_queue());                 \
    next(by_list, 3);                                    \
    auto by_numbers = by_list;                           \
    rng::skip_ahead(by_list, {5, 1});                    \
    rng::skip_ahead(by_numbers, 5);                      \
    rng::skip_ahead(by_numbers, std::uint64_t{1} << 63); \
    rng::skip_ahead(by_numbers, std::uint64_t{1} << 63); \
    const auto far = next(by_list, 20);                  \
    EXPECT_EQ(far, next(by_numbers, 20)) << #name;       \
    EXPECT_NE(far, serial(on, 8, 20)) << #name;          \
  }
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_IF_##skip_list(TARN_LIST_SKIPPING(name))
#include "engines/engines.def"
  EXPECT_EQ(engines, 3);
}

/// Every `stride`-th of the words from the sixth on, beginning with number `idx`.
template <typename Case>
std::vector<double> every(const Case& on, std::uint64_t idx, std::uint64_t stride, std::size_t n) {
  const auto all = serial(on, 6, static_cast<std::int64_t>(stride * n));
  std::vector<double> kept;
  for (std::size_t i = 0; i < n; ++i) {
    kept.push_back(all[idx + i * stride]);
  }
  return kept;
}

TEST(leaps, leave_every_so_many_words) {
  int engines = 0;
#define TARN_LEAPING(name)                                                         \
  {                                                                                \
    ++engines;                                                                     \
    const engine_case<rng::name> on{};                                             \
    for (const std::uint64_t stride : {1u, 2u, 5u, 1000u}) {                       \
      for (const std::uint64_t idx : {std::uint64_t{0}, stride / 2, stride - 1}) { \
        auto engine = on.make(cpu_queue());                                        \
        next(engine, 6);                                                           \
        rng::leapfrog(engine, idx, stride);                                        \
        ASSERT_EQ(next(engine, 9), every(on, idx, stride, 9))                      \
            << #name << " " << idx << " of " << stride;                            \
      }                                                                            \
    }                                                                              \
  }
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_IF_##leapfrog(TARN_LEAPING(name))
#include "engines/engines.def"
  EXPECT_EQ(engines, 3);
}

/// Keeps reports of bad arguments off standard error while it lives.
class silence {
 public:
  silence() {
    tarn_serv_set_xerbla_interface(reinterpret_cast<void*>(+[](const char*, const int*, int) {}),
                                   0);
  }
  silence(const silence&) = delete;
  silence& operator=(const silence&) = delete;
  ~silence() { tarn_serv_set_xerbla_interface(nullptr, 1); }
};

TEST(leaps, that_cannot_be_made_raise_an_empty_text) {
  const silence reports;
  rng::mcg59 engine(cpu_queue());
  const std::string message = "kestrel::tarn::rng::leapfrog: computation error";
  const auto refusal = [&](std::uint64_t idx, std::uint64_t stride) {
    return message_of<tarn::computation_error>([&] { rng::leapfrog(engine, idx, stride); });
  };
  EXPECT_EQ(refusal(5, 5), message);
  EXPECT_EQ(refusal(0, 0), message);
  EXPECT_EQ(refusal(~std::uint64_t{0}, 5), message);
  rng::mcg59 untouched(cpu_queue());
  EXPECT_EQ(next(engine, 4), next(untouched, 4));
}

TEST(skips, past_the_end_raise_an_empty_text) {
  const silence reports;
  rng::sobol engine(cpu_queue());
  EXPECT_EQ(
      message_of<tarn::computation_error>([&] { rng::skip_ahead(engine, std::uint64_t{1} << 40); }),
      "kestrel::tarn::rng::skip_ahead: computation error");
}

TEST(saved_states, go_on_where_they_were_saved) {
  for_every_engine([](const auto& on) {
    using Engine = typename std::decay_t<decltype(on)>::Engine;
    auto engine = on.make(cpu_queue());
    next(engine, 11);
    const image saved = image_of(engine);
    ASSERT_GE(saved.size(), 16u);  // a source without a state is a header alone
    const std::string file = testing::TempDir() + "tarn_state_of_" + on.name;
    rng::save_state(engine, file);
    auto from_memory = rng::load_state<Engine>(cpu_queue(), saved.data());
    auto from_file = rng::load_state<Engine>(cpu_queue(), file);
    std::remove(file.c_str());
    EXPECT_EQ(image_of(from_memory), saved);
    EXPECT_EQ(image_of(from_file), saved);
    const auto values = next(from_memory, 9);
    if (on.repeats()) {
      EXPECT_EQ(values, serial(on, 11, 9));
      EXPECT_EQ(next(from_file, 9), values);
    }
    for (const double value : values) {  // the words of a source without a sequence, too
      EXPECT_TRUE(value >= -1.0 && value <= 1.0) << value;
    }
  });
}

TEST(saved_states, of_another_engine_are_refused) {
  rng::mcg59 other(cpu_queue());
  const image saved = image_of(other);
  for_every_engine([&](const auto& on) {
    using Engine = typename std::decay_t<decltype(on)>::Engine;
    EXPECT_EQ(message_of<tarn::computation_error>(
                  [&] { rng::load_state<Engine>(cpu_queue(), saved.data()); }),
              on.code == RVX_BRNG_MCG59
                  ? "[nothing raised]"
                  : "kestrel::tarn::rng::load_state: computation error: failed to load state from "
                    "the memory");
  });
}

}  // namespace
