// SPDX-License-Identifier: Apache-2.0
// Chi-square variates of few degrees of freedom by their definition: producers for blocks.hpp. The
// others are gamma variates.
#pragma once

#include <algorithm>
#include <cstddef>

#include "blocks.hpp"
#include "distributions/canonical.hpp"
#include "distributions/closed_forms.hpp"
#include "distributions/standard_normal.hpp"

namespace tarn::statistics {

// Sums of squares of `degrees` standard normals, one word each.
template <class Real>
struct sums_of_squares {
  std::size_t degrees;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    alignas(64) Real normal[block_words];
    const std::size_t block = block_words / degrees;
    while (n != 0) {
      const std::size_t count = std::min(n, block);
      draw_standard_normals(source, count * degrees, normal);
      const Real* x = normal;
      for (std::size_t i = 0; i < count; ++i) {
        Real sum = 0;
        for (std::size_t j = 0; j < degrees; ++j, ++x)
          sum += *x * *x;
        out[i] = sum;
      }
      out += count;
      n -= count;
    }
  }
};

// Two degrees are an exponential number: -2 ln of the product of `factors` uniforms, one word each.
// Nothing underflows: as many factors share a logarithm as have a normal product although words of
// 59 bits make the least of them 2^-59.
template <class Real>
struct logs_of_products {
  std::size_t factors;  // at most 8

  static constexpr std::size_t most_together = sizeof(Real) == sizeof(float) ? 2 : 8;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    const canonical<Real> uniforms(source, 0, 1);
    alignas(64) Real u[block_words], product[block_words];
    const std::size_t block = block_words / factors;
    while (n != 0) {
      const std::size_t count = std::min(n, block);
      uniforms.draw(source, count * factors, u);
      std::fill_n(out, count, Real(0));
      for (std::size_t first = 0; first < factors; first += most_together) {
        multiply(u + first, std::min(most_together, factors - first), count, product);
        exponential_form(product, count, placed<Real>(0, 2), false, product);
        for (std::size_t i = 0; i < count; ++i)
          out[i] += product[i];
      }
      out += count;
      n -= count;
    }
  }

 private:
  // The product of `together` numbers from each of n rows.
  void multiply(const Real* u, std::size_t together, std::size_t n, Real* product) const {
    for (std::size_t i = 0; i < n; ++i, u += factors) {
      product[i] = u[0];
      for (std::size_t j = 1; j < together; ++j)
        product[i] *= u[j];
    }
  }
};

}  // namespace tarn::statistics
