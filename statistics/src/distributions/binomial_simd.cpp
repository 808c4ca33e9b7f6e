// SPDX-License-Identifier: Apache-2.0
// Candidates of BTPE.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "distributions/binomial_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "distributions/binomial.hpp"
#include "distributions/tent-inl.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

class btpe_shape : public tent_shape {
 public:
  HWY_INLINE explicit btpe_shape(const btpe& setup)
      : tent_shape(setup, setup.n),
        center_(setup.near.center),
        half_inverse_npq_(0.5 / setup.npq),
        greatest_k_(setup.npq / 2 - 1) {}

  // Normal bounds of the logarithm of the ratio, for |k| < npq / 2 - 1.
  HWY_INLINE verdict squeeze(double_vector y, double_vector w) const {
    const auto k = hn::Abs(hn::Sub(y, every(center_)));
    const auto inverse = every(2 * half_inverse_npq_);
    const auto cubic = hn::Mul(
        hn::Add(hn::Mul(k, hn::Add(hn::Mul(k, every(1.0 / 3)), every(0.625))), every(1.0 / 6)),
        inverse);
    const auto rho = hn::Mul(hn::Mul(k, inverse), hn::Add(cubic, every(0.5)));
    const auto t = hn::Mul(hn::Mul(k, k), every(-half_inverse_npq_));
    const auto log_w = vector_log(w);
    const truths valid = hn::Lt(k, every(greatest_k_));
    return {hn::And(valid, hn::Lt(log_w, hn::Sub(t, rho))),
            hn::And(valid, hn::Gt(log_w, hn::Add(t, rho)))};
  }

 private:
  double center_, half_inverse_npq_, greatest_k_;
};

std::size_t attempt_btpe(const btpe& setup, const double* uniforms, std::size_t count,
                         std::int32_t* out) {
  return accept<btpe_shape>(setup, uniforms, count, out);
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics {

HWY_EXPORT(attempt_btpe);

std::size_t btpe::attempt(const double* uniforms, std::size_t count, std::int32_t* out) const {
  return TARN_SIMD_CALL(attempt_btpe)(*this, uniforms, count, out);
}

}  // namespace tarn::statistics
#endif
