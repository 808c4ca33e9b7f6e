// SPDX-License-Identifier: Apache-2.0
// Moments of a law that exist for all laws and can be tested at any sample size: those of variates
// clamped to the interval between two quantiles. Heavy tails leave the raw fourth moment of a
// million values to the single greatest one (or to nobody, as with Cauchy's law); what lies beyond
// the interval is counted instead.
#pragma once

#include <array>

#include "law.hpp"

namespace laws {

struct clamped_moments {
  double low, high;       // the interval, with the probability `tail` on either side
  double centre, spread;  // mean and standard deviation of the clamped variate; spread may be 0
  // Of the powers 1 to 4 of z = (clamped variate - centre) / spread: expectation, variance, and the
  // greatest distance from the expectation.
  std::array<double, 4> mean, variance, reach;

  double standard(double x) const {
    return ((x < low ? low : x > high ? high : x) - centre) / spread;
  }
};

clamped_moments clamp(const law& of, double tail);

}  // namespace laws
