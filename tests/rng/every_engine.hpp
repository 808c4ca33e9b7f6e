// SPDX-License-Identifier: Apache-2.0
// Every engine of the list, as a type and with its row, on each kind of device that it has a road
// for: for typed suites and for walks. And the streams that engines stand on.
#pragma once

#include <cstdint>
#include <string>
#include <tarn_rvx.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "frame/rows.hpp"
#include "queues.hpp"

namespace tarn_test {

using rng::detail::device_type;

/// An engine on a kind of device that it has a road for.
template <typename Engine_, device_type device = device_type::cpu>
struct engine_case : rng::detail::engine_row<Engine_> {
  using Engine = Engine_;
  static constexpr bool on_gpu = device == device_type::gpu;
  static constexpr std::uint32_t seed = 7;

  /// Whether the same seed gives the same words.
  static constexpr bool repeats() { return engine_case::code != RVX_BRNG_NONDETERM; }
  static sycl::queue queue() { return on_gpu ? gpu_queue() : cpu_queue(); }

  /// An engine of this seed, a count of dimensions for the quasi-random ones.
  static Engine make(const sycl::queue& on, std::uint32_t seed_ = seed) {
    if constexpr (std::is_same_v<Engine, rng::nondeterministic>) {
      return Engine(on);
    } else if constexpr (std::is_same_v<Engine, rng::mt2203>) {
      return Engine(on, seed_, 0);  // without an index a GPU has several generators
    } else {
      return Engine(on, seed_);
    }
  }
  static Engine make() { return make(queue()); }
};

/// The lists of typed suites; rows begin with a comma.
template <typename Nothing, typename... Cases>
struct case_list {
  using type = testing::Types<Cases...>;
};
#define TARN_CASES_OF(name, on_gpus) \
  , engine_case<rng::name> TARN_IF_##on_gpus(, engine_case<rng::name, device_type::gpu>)

// clang-format off
using every_case = case_list<void
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                     \
  TARN_CASES_OF(name, gpu)
#include "engines/engines.def"
>::type;

using skipping_cases = case_list<void
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                     \
  TARN_IF_##skip(TARN_CASES_OF(name, gpu))
#include "engines/engines.def"
>::type;

using list_skipping_cases = case_list<void
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                     \
  TARN_IF_##skip_list(TARN_CASES_OF(name, gpu))
#include "engines/engines.def"
>::type;

using leaping_cases = case_list<void
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                     \
  TARN_IF_##leapfrog(TARN_CASES_OF(name, gpu))
#include "engines/engines.def"
>::type;
// clang-format on

/// Names the cases of a typed suite.
struct case_name {
  template <typename Case>
  static std::string GetName(int) {
    return std::string(Case::name) + (Case::on_gpu ? "_on_gpu" : "_on_cpu");
  }
};

/// How many cases of a list are on CPU queues: each engine once.
template <typename... Cases>
constexpr int on_cpu(testing::Types<Cases...>) {
  return (0 + ... + (Cases::on_gpu ? 0 : 1));
}

/// A typed suite's fixture.
template <typename Case>
class over_cases : public testing::Test {};

/// Calls `call(engine_case)` for each row, on CPU queues.
template <typename Call>
void for_every_engine(const Call& call) {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {                                                                                          \
    SCOPED_TRACE(#name);                                                                     \
    call(engine_case<rng::name>{});                                                          \
  }
#include "engines/engines.def"
}

/// One value for one word on every engine.
template <typename Engine>
std::vector<double> next(Engine& engine, std::int64_t n) {
  return draw(rng::uniform<double>(-1.0, 1.0), engine, n);
}

/// What a CPU engine of this case's seed gives, `first` words in.
template <typename Case>
std::vector<double> serial(std::int64_t first, std::int64_t n) {
  auto engine = Case::make(cpu_queue());
  next(engine, first);
  return next(engine, n);
}

/// Expects that `engine` goes on with the values that stand `first` words in: those of the serial
/// sequence, and values of the range from a source that has no sequence.
template <typename Case>
void expect_next(typename Case::Engine& engine, std::int64_t first, std::int64_t n) {
  const std::vector<double> values = next(engine, n);
  if (Case::repeats()) {
    EXPECT_EQ(values, serial<Case>(first, n));
  }
  for (const double value : values) {
    EXPECT_TRUE(value >= -1.0 && value <= 1.0) << value;
  }
}

using image = std::vector<std::uint8_t>;

template <typename Engine>
image image_of(Engine& engine) {
  image bytes(static_cast<std::size_t>(kestrel::tarn::rng::get_state_size(engine)));
  kestrel::tarn::rng::save_state(engine, bytes.data());
  return bytes;
}

/// A stream of the statistics library, made without the random-number library.
class plain_stream {
 public:
  plain_stream(std::int64_t code, std::uint64_t seed) {
    EXPECT_EQ(rvxNewStream(&handle_, code, seed), 0);
  }
  plain_stream(std::int64_t code, const std::vector<std::uint32_t>& words) {
    const auto n = static_cast<std::int64_t>(words.size());
    EXPECT_EQ(rvxNewStreamEx(&handle_, code, n, words.data()), 0);
  }
  plain_stream(const plain_stream&) = delete;
  plain_stream& operator=(const plain_stream&) = delete;
  ~plain_stream() { EXPECT_EQ(rvxDeleteStream(&handle_), 0); }

  operator rvx_stream() const { return handle_; }

  image bytes() const {
    image saved(static_cast<std::size_t>(rvxGetStreamSize(handle_)));
    EXPECT_EQ(rvxSaveStreamM(handle_, saved.data()), 0);
    return saved;
  }

 private:
  rvx_stream handle_ = nullptr;
};

}  // namespace tarn_test
