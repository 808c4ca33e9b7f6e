// SPDX-License-Identifier: Apache-2.0
// Every row of the list of engines as a test parameter.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "any_stream.hpp"

namespace support {

struct engine_case {
  const char* name;
  std::int64_t code;  // of the member to test
  std::vector<std::uint32_t> seed;
  std::size_t parts;  // 32-bit numbers of a word
  bool skips, skips_lists, leapfrogs;
  std::size_t block;  // words after which the engine's work repeats: where edges are

  any_stream make() const { return any_stream(code, seed); }
};

inline void PrintTo(const engine_case& c, std::ostream* out) {
  *out << c.name;
}

namespace rows {

enum kind {
  mcg31m1,
  r250,
  mrg32k3a,
  mcg59,
  wichmann_hill,
  sobol,
  niederreiter,
  mt19937,
  mt2203,
  sfmt19937,
  nondeterministic,
  ars5,
  philox4x32x10
};

// What a row does not tell: seeds, members and block lengths that are worth testing.
inline std::vector<std::uint32_t> seed(kind engine) {
  switch (engine) {
    case sobol:
      return {7};
    case niederreiter:
      return {5};
    case nondeterministic:
      return {};
    default:
      return {20261, 4242, 77};
  }
}
inline std::size_t block(kind engine) {
  switch (engine) {
    case mt19937:
    case sfmt19937:
      return 624;
    case mt2203:
      return 69;
    case r250:
      return 250;
    case sobol:
      return 7;
    case niederreiter:
      return 5;
    default:
      return 4;
  }
}
inline std::int64_t member(kind engine) {
  return engine == mt2203 ? 4711 : engine == wichmann_hill ? 200 : 0;
}

}  // namespace rows

inline std::vector<engine_case> every_engine() {
  return {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {#name,                                                                                    \
   code + rows::member(rows::name),                                                          \
   rows::seed(rows::name),                                                                   \
   (word_bits + 31) / 32,                                                                    \
   skip != 0,                                                                                \
   skip_list != 0,                                                                           \
   leapfrog != 0,                                                                            \
   rows::block(rows::name)},
#include "rng/engines/engines.def"
  };
}

template <class Test>
std::string engine_name(const testing::TestParamInfo<Test>& info) {
  return info.param.name;
}

}  // namespace support
