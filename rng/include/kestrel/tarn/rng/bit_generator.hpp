// SPDX-License-Identifier: Apache-2.0
// An engine as a uniform random bit generator of the C++ standard ([rand.req.urng]): it drives
// std::shuffle, std::sample and the standard distributions.
#pragma once

#include <cstdint>
#include <memory>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/engines.hpp>

namespace kestrel::tarn::rng {

namespace detail {

struct TARN_EXPORT read_ahead;

/// The least and the greatest word: all 32 bits, but for engines whose words are residues.
template <typename Engine>
struct word_range {
  static constexpr std::uint32_t least = 0;
  static constexpr std::uint32_t greatest = 0xFFFFFFFF;
};
template <>
struct word_range<mcg31m1> {
  static constexpr std::uint32_t least = 1;
  static constexpr std::uint32_t greatest = 0x7FFFFFFE;  // 2^31 - 2
};
template <>
struct word_range<mrg32k3a> {
  static constexpr std::uint32_t least = 1;
  static constexpr std::uint32_t greatest = 4294967087;  // 2^32 - 209
};

}  // namespace detail

/// A view of `engine` that hands out its words one by one:
///
///     std::shuffle(cards.begin(), cards.end(), rng::bit_generator(engine));
///
/// \tparam Engine  any engine. Of mcg59 a word gives the 32 bits of uniform_bits, of all others the
///                 word of bits. The words of sobol and niederreiter are quasi-random: they suit
///                 what takes one word for one coordinate, and neither shuffles nor anything that
///                 rejects words.
///
/// Words are the next ones of the engine's serial sequence, read from its host stream on the
/// calling thread, on a queue of either kind; no kernel runs. An engine of many generators, such as
/// mrg32k3a in a sub-sequence mode, has no such sequence and is refused.
///
/// The view reads ahead in blocks of 1024 words. When it is released or destroyed, the engine
/// stands exactly behind the last word handed out, so that views and calls of generate, in turn,
/// share one sequence. Sequences that end (sobol, niederreiter) are not read ahead.
///
/// Complexity: a word is a load and a compare; a block costs a copy of the engine's state besides,
/// and a release the words used of the last block once more. Of an engine that is not read ahead
/// each word is a call.
///
/// Lifetime: the engine has to outlive the view and to stay in place. Between the first word and
/// release() nobody else may use the engine; of several views on it, one at a time. A view belongs
/// to one thread at a time.
template <typename Engine>
class TARN_EXPORT bit_generator {
 public:
  /// The type of a word.
  using result_type = std::uint32_t;

  /// Draws nothing yet.
  explicit bit_generator(Engine& engine);
  bit_generator(const bit_generator&) = delete;
  bit_generator& operator=(const bit_generator&) = delete;
  /// As release().
  ~bit_generator();

  /// The least value of a word: 1 for mcg31m1 and mrg32k3a, otherwise 0.
  static constexpr result_type min() { return detail::word_range<Engine>::least; }
  /// The greatest value of a word: 2^31 - 2 for mcg31m1, 2^32 - 209 for mrg32k3a, otherwise
  /// 2^32 - 1.
  static constexpr result_type max() { return detail::word_range<Engine>::greatest; }

  /// The next word, in [min(), max()].
  ///
  /// Raises unsupported_device if the engine has no road on the device of its queue, and
  /// computation_error behind the end of a finite sequence, when an outer source fails, without
  /// memory, or for an engine of many generators. The engine then stands behind the words handed
  /// out before.
  result_type operator()() {
    if (next_ == end_) {
      read_block();
    }
    return *next_++;
  }

  /// Moves the engine to the end of the words handed out; it may be used by others then. The view
  /// goes on from wherever the engine stands at the next word.
  void release() noexcept;

 private:
  void read_block();

  Engine& engine_;
  std::unique_ptr<detail::read_ahead> ahead_;
  const std::uint32_t* next_ = nullptr;
  const std::uint32_t* end_ = nullptr;
};

}  // namespace kestrel::tarn::rng
