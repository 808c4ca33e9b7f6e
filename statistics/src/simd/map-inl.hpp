// SPDX-License-Identifier: Apache-2.0
// The loop of all kernels that turn one array into another, number by number. For sources that are
// compiled once per target: include after <hwy/highway.h>, inside no namespace.
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "simd/target.hpp"

#if defined(TARN_MAP_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_MAP_INL_HPP
#undef TARN_MAP_INL_HPP
#else
#define TARN_MAP_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// out[i] = turn(in[i]) for whole vectors of D and, through a padded one, for the rest; in place if
// out is in.
template <bool Streaming, class D, class From, class Turn>
HWY_INLINE void map_loop(D d, const From* in, std::size_t n, hn::TFromD<D>* out, const Turn& turn) {
  using to = hn::TFromD<D>;
  const hn::Rebind<From, D> d_in;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes) {
    const auto result = turn(hn::LoadU(d_in, in + i));
    if constexpr (Streaming)
      hn::Stream(result, d, out + i);
    else
      hn::StoreU(result, d, out + i);
  }
  if (const std::size_t rest = n - i; rest != 0) {
    HWY_ALIGN From padded[HWY_MAX_BYTES / sizeof(to)] = {};
    HWY_ALIGN to results[HWY_MAX_BYTES / sizeof(to)];
    std::memcpy(padded, in + i, rest * sizeof(From));
    hn::Store(turn(hn::Load(d_in, padded)), d, results);
    std::memcpy(out + i, results, rest * sizeof(to));
  }
}

template <class D, class From, class Turn>
HWY_INLINE void map_all(D d, const From* in, std::size_t n, bool streaming, hn::TFromD<D>* out,
                        const Turn& turn) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::size_t vector_bytes = hn::Lanes(d) * sizeof(hn::TFromD<D>);
  if (streaming && reinterpret_cast<std::uintptr_t>(out) % vector_bytes == 0)
    map_loop<true>(d, in, n, out, turn);
  else
    map_loop<false>(d, in, n, out, turn);
}

template <class D>
struct two_vectors {
  hn::Vec<D> first, second;
};

// The first and the second numbers of a vector of pairs each. One permutation for each where the
// target has it; the interleaved load of Highway 1.0 takes several.
template <class D>
HWY_INLINE two_vectors<D> pairs_at(D d, const hn::TFromD<D>* in) {
#if HWY_TARGET == HWY_SCALAR
  return {hn::Load(d, in), hn::Load(d, in + 1)};
#else
  const auto front = hn::LoadU(d, in), back = hn::LoadU(d, in + hn::Lanes(d));
  return {hn::ConcatEven(d, back, front), hn::ConcatOdd(d, back, front)};
#endif
}

// turn(first, second, to) for vectors of the first and of the second numbers of n pairs; it writes
// `width` values of each pair. In place if out is in.
template <std::size_t width, class D, class Turn>
HWY_INLINE void map_pairs(D d, const hn::TFromD<D>* in, std::size_t n, hn::TFromD<D>* out,
                          const Turn& turn) {
  using real = hn::TFromD<D>;
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::size_t lanes = hn::Lanes(d);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes) {
    const auto [first, second] = pairs_at(d, in + 2 * i);
    turn(first, second, out + width * i);
  }
  if (const std::size_t rest = n - i; rest != 0) {
    HWY_ALIGN real padded[2 * HWY_MAX_BYTES / sizeof(real)] = {};
    HWY_ALIGN real results[2 * HWY_MAX_BYTES / sizeof(real)];
    std::memcpy(padded, in + 2 * i, 2 * rest * sizeof(real));
    const auto [first, second] = pairs_at(d, padded);
    turn(first, second, results);
    std::memcpy(out + width * i, results, width * rest * sizeof(real));
  }
}

// The same of pairs that stand in two arrays, which have room for whole vectors; out is neither.
template <std::size_t width, class D, class Turn>
HWY_INLINE void map_two(D d, const hn::TFromD<D>* first, const hn::TFromD<D>* second, std::size_t n,
                        hn::TFromD<D>* out, const Turn& turn) {
  using real = hn::TFromD<D>;
  const std::size_t lanes = hn::Lanes(d);
  std::size_t i = 0;
  for (; i + lanes <= n; i += lanes)
    turn(hn::LoadU(d, first + i), hn::LoadU(d, second + i), out + width * i);
  if (const std::size_t rest = n - i; rest != 0) {
    HWY_ALIGN real results[2 * HWY_MAX_BYTES / sizeof(real)];
    turn(hn::LoadU(d, first + i), hn::LoadU(d, second + i), results);
    std::memcpy(out + width * i, results, width * rest * sizeof(real));
  }
}

// max(x, least), then min: of two zeros, or beside one that is not a number, the second operand, as
// the instructions of x86 choose. The scalar functions of Highway choose otherwise.
template <class D>
HWY_INLINE hn::Vec<D> clamped(D d, hn::Vec<D> x, hn::TFromD<D> least, hn::TFromD<D> greatest) {
  const auto low = hn::Set(d, least);
  const auto high = hn::Set(d, greatest);
#if HWY_TARGET == HWY_SCALAR
  const auto raised = hn::IfThenElse(hn::Gt(x, low), x, low);
  return hn::IfThenElse(hn::Lt(raised, high), raised, high);
#else
  return hn::Min(hn::Max(x, low), high);
#endif
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
