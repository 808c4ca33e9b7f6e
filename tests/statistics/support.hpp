// SPDX-License-Identifier: Apache-2.0
// Shared by the tests of the statistics library: streams set to any state, results between guard
// zones, recorded reports, and the proof that a forced SIMD target really ran.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "plain_philox.hpp"
#include "raw_entries.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace support {

// The philox record as it stands at byte 16 of a stream.
struct record {
  std::uint32_t key[2], ctr[4], idx;
};
static_assert(sizeof(record) == 28);

class stream {
 public:
  explicit stream(std::uint64_t seed = 0) {
    EXPECT_EQ(rvxNewStream(&handle_, RVX_BRNG_PHILOX4X32X10, seed), 0);
  }
  ~stream() { EXPECT_EQ(rvxDeleteStream(&handle_), 0); }
  stream(const stream&) = delete;
  stream& operator=(const stream&) = delete;

  operator rvx_stream() const { return handle_; }

  record state() const {
    record r;
    std::memcpy(&r, static_cast<const char*>(handle_) + 16, sizeof r);
    return r;
  }
  void set(const record& r) { std::memcpy(static_cast<char*>(handle_) + 16, &r, sizeof r); }
  void set(plain::two key, plain::u128 ctr, std::uint32_t idx) {
    record r{{key[0], key[1]}, {}, idx};
    for (unsigned i = 0; i < 4; ++i)
      r.ctr[i] = static_cast<std::uint32_t>(ctr >> (32 * i));
    set(r);
  }

  // Where the stream stands, read by the rule: the next word has the index 4 * ctr - idx.
  plain::stream position() const {
    const record r = state();
    plain::u128 ctr = 0;
    for (unsigned i = 4; i-- > 0;)
      ctr = ctr << 32 | r.ctr[i];
    return {{r.key[0], r.key[1]}, ctr - (r.idx + 3) / 4, (4 - r.idx % 4) % 4};
  }

 private:
  rvx_stream handle_ = nullptr;
};

inline bool same_position(const stream& s, const plain::stream& p) {
  const plain::stream q = s.position();
  return s.state().idx <= 3 && q.key == p.key && q.block == p.block && q.word == p.word;
}

// n results, filled with a marker, between two guard zones.
template <class Value>
class results {
 public:
  explicit results(std::size_t n) : n_(n), all_((n + 2 * guard) * sizeof(Value), marker) {}

  Value* data() { return reinterpret_cast<Value*>(all_.data()) + guard; }
  Value operator[](std::size_t i) const {
    Value v;
    std::memcpy(&v, all_.data() + (guard + i) * sizeof v, sizeof v);
    return v;
  }
  bool guards_intact() const {
    return intact(0, guard * sizeof(Value)) && intact((n_ + guard) * sizeof(Value), all_.size());
  }
  bool untouched() const { return intact(0, all_.size()); }
  bool operator==(const results& other) const { return all_ == other.all_; }

 private:
  static constexpr std::size_t guard = 32;
  static constexpr unsigned char marker = 0xA5;

  bool intact(std::size_t first, std::size_t last) const {
    return std::all_of(all_.begin() + static_cast<std::ptrdiff_t>(first),
                       all_.begin() + static_cast<std::ptrdiff_t>(last),
                       [](unsigned char byte) { return byte == marker; });
  }

  std::size_t n_;
  std::vector<unsigned char> all_;
};

// Reports of bad arguments while the object lives.
class reports {
 public:
  using list = std::vector<std::pair<std::string, int>>;

  reports() {
    seen().clear();
    tarn_serv_set_xerbla_interface(reinterpret_cast<void*>(&record_one), 1);
  }
  ~reports() { tarn_serv_set_xerbla_interface(nullptr, 1); }

  list take() { return std::exchange(seen(), {}); }

 private:
  static list& seen() {
    static list all;
    return all;
  }
  static void record_one(const char* name, const int* position, int name_length) {
    seen().emplace_back(std::string(name, static_cast<std::size_t>(name_length)), *position);
  }
};

// Cases that run once for each SIMD target, forced by the environment. Skipped where the
// processor lacks the target; failed when the kernels of another target ran.
class on_simd_target : public testing::Test {
 protected:
  void SetUp() override {
    const char* wish = std::getenv("TARN_SIMD_TARGET");
    target_ = wish == nullptr ? "" : wish;
    __builtin_cpu_init();
    const bool runs = target_ == "AVX3_DL" ? __builtin_cpu_supports("avx512vbmi2") &&
                                                 __builtin_cpu_supports("vpclmulqdq") &&
                                                 __builtin_cpu_supports("vaes")
                      : target_ == "AVX3" ? __builtin_cpu_supports("avx512f") &&
                                                __builtin_cpu_supports("avx512vl") &&
                                                __builtin_cpu_supports("avx512bw") &&
                                                __builtin_cpu_supports("avx512dq") &&
                                                __builtin_cpu_supports("avx512cd")
                      : target_ == "AVX2"  ? __builtin_cpu_supports("avx2") != 0
                      : target_ == "SSE4"  ? __builtin_cpu_supports("sse4.2") != 0
                      : target_ == "SSSE3" ? __builtin_cpu_supports("ssse3") != 0
                                           : true;
    if (!runs)
      GTEST_SKIP() << "this processor has no " << target_;
  }
  void TearDown() override {
    if (!IsSkipped() && !target_.empty()) {
      EXPECT_EQ(__rvxGetSimdTarget(), target_);
    }
  }

 private:
  std::string target_;
};

// Words of a small generator for test data (SplitMix64, Steele, Lea, Flood 2014).
class test_data {
 public:
  explicit test_data(std::uint64_t seed) : state_(seed) {}
  std::uint64_t operator()() {
    std::uint64_t z = state_ += 0x9E3779B97F4A7C15;
    z = (z ^ z >> 30) * 0xBF58476D1CE4E5B9;
    z = (z ^ z >> 27) * 0x94D049BB133111EB;
    return z ^ z >> 31;
  }
  std::size_t below(std::size_t bound) { return static_cast<std::size_t>((*this)() % bound); }

 private:
  std::uint64_t state_;
};

}  // namespace support
