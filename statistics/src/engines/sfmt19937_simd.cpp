// SPDX-License-Identifier: Apache-2.0
// Runs of SFMT19937, one 128-bit word at a time on each target. What bounds the speed is that a
// word needs the one before it. Of that one, d, only d << 18 is wanted, in each of four parts; and
// since a part has less than 36 bits, it is also w << 18, where w is d without its own part that
// was shifted so. Thus a word waits for nothing nearer than the word two places before it, and for
// w.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/sfmt19937_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/sfmt19937.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::sfmt19937::HWY_NAMESPACE {

#if HWY_TARGET == HWY_SCALAR

struct quad {
  std::uint32_t part[4];
};

HWY_INLINE quad load(const std::uint32_t* from) {
  return {{from[0], from[1], from[2], from[3]}};
}

HWY_INLINE void store(const quad& a, std::uint32_t* to) {
  for (int i = 0; i < 4; ++i)
    to[i] = a.part[i];
}

HWY_INLINE quad add(const quad& a, const quad& b) {
  quad r;
  for (int i = 0; i < 4; ++i)
    r.part[i] = a.part[i] ^ b.part[i];
  return r;
}

HWY_INLINE quad old_part(const quad& a, const quad& b) {
  quad r;
  for (int i = 0; i < 4; ++i) {
    const std::uint32_t up = a.part[i] << 8 | (i == 0 ? 0 : a.part[i - 1] >> 24);
    r.part[i] = a.part[i] ^ up ^ (b.part[i] >> 11 & mask[i]);
  }
  return r;
}

HWY_INLINE quad byte_down(const quad& a) {
  quad r;
  for (int i = 0; i < 4; ++i)
    r.part[i] = a.part[i] >> 8 | (i == 3 ? 0 : a.part[i + 1] << 24);
  return r;
}

HWY_INLINE quad parts_up(const quad& a) {
  return {{a.part[0] << 18, a.part[1] << 18, a.part[2] << 18, a.part[3] << 18}};
}

#else

namespace hn = hwy::HWY_NAMESPACE;

using d32 = hn::FixedTag<std::uint32_t, 4>;
using quad = hn::Vec<d32>;

HWY_INLINE quad load(const std::uint32_t* from) {
  return hn::LoadU(d32(), from);
}

HWY_INLINE void store(quad a, std::uint32_t* to) {
  hn::StoreU(a, d32(), to);
}

HWY_INLINE quad add(quad a, quad b) {
  return hn::Xor(a, b);
}

HWY_INLINE quad old_part(quad a, quad b) {
  const d32 d;
  return hn::Xor3(a, hn::ShiftLeftBytes<1>(d, a),
                  hn::And(hn::ShiftRight<11>(b), hn::LoadU(d, mask)));
}

HWY_INLINE quad byte_down(quad a) {
  return hn::ShiftRightBytes<1>(d32(), a);
}

HWY_INLINE quad parts_up(quad a) {
  return hn::ShiftLeft<18>(a);
}

#endif

void next_blocks(const std::uint32_t* from, std::size_t blocks, std::uint32_t* to) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  quad c = load(from + words - 8), d = load(from + words - 4), w = d;
  const auto advance = [&](const std::uint32_t* a, const std::uint32_t* b, std::uint32_t* r) {
    const quad next_w = add(old_part(load(a), load(b)), byte_down(c));
    c = d;
    d = add(next_w, parts_up(w));
    w = next_w;
    store(d, r);
  };
  constexpr std::size_t ahead = 4 * middle, behind = words - ahead;
  std::size_t i = 0;
  for (; i < behind; i += 4)
    advance(from + i, from + ahead + i, to + i);
  for (; i < words; i += 4)
    advance(from + i, to + i - behind, to + i);
  for (; i < blocks * words; i += 4)
    advance(to + i - words, to + i - behind, to + i);
}

}  // namespace tarn::statistics::sfmt19937::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::sfmt19937 {

HWY_EXPORT(next_blocks);

void next_blocks(const std::uint32_t* from, std::size_t blocks, std::uint32_t* to) {
  TARN_SIMD_CALL(next_blocks)(from, blocks, to);
}

}  // namespace tarn::statistics::sfmt19937
#endif
