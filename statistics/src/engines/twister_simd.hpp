// SPDX-License-Identifier: Apache-2.0
// The twist and the tempering of Mersenne twisters with SIMD, once for each target of the source
// that includes this. Vectors lie side by side in a sequence without wrap, so their loads need no
// alignment and no case at the end of a block. A shape has `words` and `middle` of the recurrence,
// `lower_bits` (the split of two words that are joined) and `first_shift` of the tempering.
#include <cstddef>
#include <cstdint>

#include <hwy/highway.h>

#include "engines/block_record.hpp"
#include "engines/twister.hpp"

#if defined(TARN_TWISTER_SIMD_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_TWISTER_SIMD_HPP
#undef TARN_TWISTER_SIMD_HPP
#else
#define TARN_TWISTER_SIMD_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Continues words[0 .. Shape::words) by `count` words, rounded up to whole steps.
template <class Shape>
void extend_twister(const twister_constants& constants, std::uint32_t* words, std::size_t count) {
  static_assert(Shape::words - Shape::middle >= block_step, "a step reads what is there before it");
  const hn::CappedTag<std::uint32_t, block_step> d;
  const auto upper = hn::Set(d, ~std::uint32_t{0} << Shape::lower_bits);
  const auto lower = hn::Not(upper);
  const auto matrix = hn::Set(d, constants.matrix);
  const auto one = hn::Set(d, 1);
  const std::uint32_t* const end = words + whole_steps(count);
  for (; words != end; words += hn::Lanes(d)) {
    const auto first = hn::LoadU(d, words);
    const auto second = hn::LoadU(d, words + 1);
    const auto middle = hn::LoadU(d, words + Shape::middle);
    const auto joined = hn::OrAnd(hn::And(upper, first), lower, second);
    const auto odd = hn::Sub(hn::Zero(d), hn::And(second, one));  // all bits of odd lanes
    hn::StoreU(hn::Xor3(middle, hn::ShiftRight<1>(joined), hn::And(odd, matrix)), d,
               words + Shape::words);
  }
}

template <class Shape, class Lanes>
HWY_INLINE void temper_lanes(Lanes d, const twister_constants& constants,
                             const std::uint32_t* HWY_RESTRICT words,
                             std::uint32_t* HWY_RESTRICT out) {
  auto z = hn::LoadU(d, words);
  z = hn::Xor(z, hn::ShiftRight<Shape::first_shift>(z));
  z = hn::Xor(z, hn::And(hn::ShiftLeft<7>(z), hn::Set(d, constants.mask_b)));
  z = hn::Xor(z, hn::And(hn::ShiftLeft<15>(z), hn::Set(d, constants.mask_c)));
  z = hn::Xor(z, hn::ShiftRight<18>(z));
  hn::StoreU(z, d, out);
}

// Writes n tempered words.
template <class Shape>
void temper(const twister_constants& constants, const std::uint32_t* HWY_RESTRICT words,
            std::size_t n, std::uint32_t* HWY_RESTRICT out) {
  const hn::CappedTag<std::uint32_t, block_step> d;
  const hn::CappedTag<std::uint32_t, 1> one_lane;
  const std::size_t step = hn::Lanes(d);
  for (; n >= step; n -= step, words += step, out += step)
    temper_lanes<Shape>(d, constants, words, out);
  for (; n != 0; --n)
    temper_lanes<Shape>(one_lane, constants, words++, out++);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
