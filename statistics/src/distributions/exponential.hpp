// SPDX-License-Identifier: Apache-2.0
// The exponential law and the others whose inverse is a closed formula: producers for blocks.hpp.
// All take one word a value but laplace, which takes two.
#pragma once

#include <algorithm>
#include <cstddef>
#include <limits>

#include "distributions/closed_forms.hpp"
#include "distributions/from_canonical.hpp"

namespace tarn::statistics {

template <class Real>
struct exponential {
  Real place, scale;
  bool accurate = false;  // no value below the place

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const placement<Real> to = placed(place, scale, accurate);
    turn_reals<Real>(source, 0, 1, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* at) {
                       exponential_form(u, count, to, around, at);
                     });
  }
};

template <class Real>
struct rayleigh {
  Real place, scale;
  bool accurate = false;  // no value below the place

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const placement<Real> to = placed(place, scale, accurate);
    turn_reals<Real>(source, 0, 1, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* at) {
                       rayleigh_form(u, count, to, around, at);
                     });
  }
};

template <class Real>
struct gumbel {
  Real place, scale;

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const placement<Real> to = placed(place, scale);
    turn_reals<Real>(source, 0, 1, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* at) {
                       gumbel_form(u, count, to, around, at);
                     });
  }
};

template <class Real>
struct weibull {
  Real shape, place, scale;
  bool accurate = false;

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const placement<Real> to = placed(place, scale, accurate);
    // Finite, so that 0 times it is 0.
    const Real exponent = std::min(1 / shape, std::numeric_limits<Real>::max());
    turn_reals<Real>(source, 0, 1, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* at) {
                       weibull_form(u, count, exponent, to, around, at);
                     });
  }
};

template <class Real>
struct cauchy {
  Real place, scale;

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const placement<Real> to = placed(place, scale);
    constexpr auto quarter_turn = static_cast<Real>(1.57079632679489661923);
    turn_reals<Real>(source, -quarter_turn, quarter_turn, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* at) {
                       cauchy_form(u, count, to, around, at);
                     });
  }
};

template <class Real>
struct laplace {
  Real place, scale;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    const placement<Real> to = placed(place, scale);
    turn_pairs<Real>(source, n, out,
                     [&](Real* u, std::size_t count, Real* at) { laplace_form(u, count, to, at); });
  }
};

}  // namespace tarn::statistics
