// SPDX-License-Identifier: Apache-2.0
// 32-bit words of an engine for programs that judge bit streams.
//
// A word of 32 bits is taken as it is. Of mcg59 bits 27 to 58 are taken, the fair ones. Two words
// of mcg31m1 make one, the upper 16 of the 31 bits of each, the first word below: so no bit of the
// 32 is made up, and none of the worst is left out.
//
// Layouts: `single` is one stream. The others are 64 streams read in turn, a word of each:
//   skip, skip_odd  one sequence, each stream a fixed count of words behind the one before
//   leapfrog        streams k of stride 64, so that what comes is the single stream again
//   family          members 0 to 63 of the engine's set, seeded alike
//   key             keys {k, seed}, which differ in six bits at most
//   seeds           seeds 64 seed + k: nothing guarantees that these do not overlap
// and `stride` is one leapfrogged stream, every 64th word, alone: what one worker of 64 sees.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace tarn::quality {

enum class layout { single, skip, skip_odd, leapfrog, stride, family, key, seeds };

struct row {
  std::string engine;
  std::int64_t code;
  int word_bits;
  std::string name;  // of the layout
  layout how;
  std::uint64_t high, low;  // distance of `skip`
  std::string run;
};

// The rows of layouts.def.
const std::vector<row>& rows();

// The words of one row for one seed.
class word_source {
 public:
  static constexpr std::size_t streams = 64;

  // Raises std::runtime_error where the library refuses to make or to move a stream.
  word_source(const row& wanted, std::uint32_t seed);

  // The next words, a whole number of turns: as many as `chunk` from each stream.
  static constexpr std::size_t chunk = 1024;
  const std::vector<std::uint32_t>& next();

 private:
  using stream = std::unique_ptr<void, void (*)(void*)>;

  void draw(const stream& from, std::uint32_t* out);

  int word_bits_;
  std::vector<stream> streams_;
  std::vector<std::uint32_t> raw_, words_;
};

}  // namespace tarn::quality
