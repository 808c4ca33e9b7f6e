// SPDX-License-Identifier: Apache-2.0
// Kernels around those that judge candidates: uniforms into columns, accepted values to the front,
// standard variates to their place.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/candidates_simd.cpp"
#include <limits>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/candidates-inl.hpp"
#include "simd/map-inl.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

void split_pairs(const double* HWY_RESTRICT interleaved, std::size_t n, candidates& to) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const real_tag d;
  hn::Vec<real_tag> u0, u1;
  for (std::size_t i = 0; i < n; i += hn::Lanes(d)) {
    hn::LoadInterleaved2(d, interleaved + 2 * i, u0, u1);
    hn::Store(u0, d, to.uniform[0] + i);
    hn::Store(u1, d, to.uniform[1] + i);
  }
}

void split_triples(const double* HWY_RESTRICT interleaved, std::size_t n, candidates& to) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const real_tag d;
  hn::Vec<real_tag> u0, u1, u2;
  for (std::size_t i = 0; i < n; i += hn::Lanes(d)) {
    hn::LoadInterleaved3(d, interleaved + 3 * i, u0, u1, u2);
    hn::Store(u0, d, to.uniform[0] + i);
    hn::Store(u1, d, to.uniform[1] + i);
    hn::Store(u2, d, to.uniform[2] + i);
  }
}

std::size_t keep_accepted(candidates& block, std::size_t n) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const real_tag d;
  std::size_t kept = 0;
  for (std::size_t i = 0; i < n; i += hn::Lanes(d)) {
    const auto value = hn::Load(d, block.value + i);
    const auto keep = hn::And(hn::Ge(value, hn::Zero(d)), hn::FirstN(d, n - i));
    // Never beyond what has been read: no more values were kept than read.
    hn::StoreU(compressed(d, value, keep), d, block.value + kept);
    kept += hn::CountTrue(d, keep);
  }
  return kept;
}

template <class Real>
HWY_INLINE void map_in_place(const double* x, std::size_t n, const affine_place<Real>& where,
                             Real* out) {
  const real_tag d;
  const hn::Rebind<Real, real_tag> d_out;
  const auto place = hn::Set(d, static_cast<double>(where.place));
  const auto scale = hn::Set(d, static_cast<double>(where.scale));
  const auto greatest = hn::Set(d, static_cast<double>(std::numeric_limits<Real>::max()));
  map_all(d_out, x, n, false, out, [&](auto v) {
    const auto y = hn::Add(hn::Mul(scale, v), place);
    const auto finite = hn::IfThenElse(hn::Lt(y, greatest), y, greatest);
    if constexpr (sizeof(Real) == sizeof(float))
      return hn::DemoteTo(d_out, finite);
    else
      return finite;
  });
}

void put_floats_in_place(const double* x, std::size_t n, const affine_place<float>& where,
                         float* out) {
  map_in_place(x, n, where, out);
}

void put_doubles_in_place(const double* x, std::size_t n, const affine_place<double>& where,
                          double* out) {
  map_in_place(x, n, where, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(split_pairs);
HWY_EXPORT(split_triples);
HWY_EXPORT(keep_accepted);
HWY_EXPORT(put_floats_in_place);
HWY_EXPORT(put_doubles_in_place);

void split_uniforms(const double* interleaved, std::size_t n, std::size_t width, candidates& to) {
  if (width == 2)
    TARN_SIMD_CALL(split_pairs)(interleaved, n, to);
  else
    TARN_SIMD_CALL(split_triples)(interleaved, n, to);
}

std::size_t keep_accepted(candidates& block, std::size_t n) {
  return TARN_SIMD_CALL(keep_accepted)(block, n);
}

void put_in_place(const double* x, std::size_t n, const affine_place<float>& where, float* out) {
  TARN_SIMD_CALL(put_floats_in_place)(x, n, where, out);
}

void put_in_place(const double* x, std::size_t n, const affine_place<double>& where, double* out) {
  TARN_SIMD_CALL(put_doubles_in_place)(x, n, where, out);
}

}  // namespace tarn::statistics
#endif
