// SPDX-License-Identifier: Apache-2.0
// Candidates of PTPE.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/ptpe_simd.cpp"
#include <limits>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/ptpe.hpp"
#include "distributions/tent-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

class ptpe_shape : public tent_shape {
 public:
  HWY_INLINE explicit ptpe_shape(const ptpe& setup)
      : tent_shape(setup, std::numeric_limits<double>::infinity()) {}

  // None: the ratio itself costs little more than bounds of its logarithm, and few need it.
  HWY_INLINE verdict squeeze(double_vector, double_vector) const {
    return {hn::FirstN(doubles(), 0), hn::FirstN(doubles(), 0)};
  }
};

std::size_t attempt_ptpe(const ptpe& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<ptpe_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_ptpe);

std::size_t ptpe::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_ptpe)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
