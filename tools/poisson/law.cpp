// SPDX-License-Identifier: Apache-2.0
// From the incomplete gamma function and the inverse error function; on either side of the median
// from the smaller of the two tails.
#include "law.hpp"

#include <cmath>

#include <boost/math/constants/constants.hpp>
#include <boost/math/special_functions/erf.hpp>
#include <boost/math/special_functions/gamma.hpp>

namespace poisson {

namespace bm = boost::math;

namespace {

const real root_two = bm::constants::root_two<real>();

// z with Phi(-z) = tail. Where nothing is left of the tail, it lies beyond all deviates.
real deviate_of_tail(real tail) {
  return tail > 0 ? root_two * bm::erfc_inv(2 * tail) : 2 * greatest_deviate;
}

}  // namespace

real normal_density(real z) {
  return std::exp(-z * z / 2) / bm::constants::root_two_pi<real>();
}

real normal_cdf(real z) {
  return bm::erfc(-z / root_two) / 2;
}

real deviate(real x, real lambda) {
  const real below = bm::gamma_q(x + 1, lambda);
  return below < 0.5L ? -deviate_of_tail(below) : deviate_of_tail(bm::gamma_p(x + 1, lambda));
}

real inverse(real z, real lambda) {
  const real tail = normal_cdf(-std::fabs(z));
  real low = -1, high = lambda + 20 * std::sqrt(lambda) + 50;
  for (int i = 0; i < 90; ++i) {
    const real x = (low + high) / 2;
    const bool below =
        z < 0 ? bm::gamma_q(x + 1, lambda) < tail : bm::gamma_p(x + 1, lambda) > tail;
    (below ? low : high) = x;
  }
  return (low + high) / 2;
}

}  // namespace poisson
