// SPDX-License-Identifier: Apache-2.0
// Every engine of the list, as a type and with its row; and the streams that engines stand on.
#pragma once

#include <cstdint>
#include <string>
#include <tarn_rvx.h>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

namespace tarn_test {

template <typename Engine_>
struct engine_case {
  using Engine = Engine_;
  const char* name;
  std::int64_t code;
  bool gpu, device_road;  // meant for GPU queues; and its device road is there
  bool skips, skips_lists, leaps;
  bool uniform_bits;

  bool repeats() const { return code != RVX_BRNG_NONDETERM; }  // the same words for the same seed

  /// An engine of this seed, a count of dimensions for the quasi-random ones.
  static Engine make(const sycl::queue& queue) {
    if constexpr (std::is_same_v<Engine, kestrel::tarn::rng::nondeterministic>) {
      return Engine(queue);
    } else {
      return Engine(queue, seed);
    }
  }
  static constexpr std::uint32_t seed = 7;
};

/// Calls `call(engine_case)` for each row.
template <typename Call>
void for_every_engine(const Call& call) {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog,       \
                    uniform_bits, built)                                                           \
  {                                                                                                \
    SCOPED_TRACE(#name);                                                                           \
    call(engine_case<kestrel::tarn::rng::name>{#name, code, gpu == 1, built == 1, skip == 1,       \
                                               skip_list == 1, leapfrog == 1, uniform_bits == 1}); \
  }
#include "engines/engines.def"
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
