// SPDX-License-Identifier: Apache-2.0
// Normal and lognormal variates: producers for blocks.hpp. normal_end tells the two apart.
#pragma once

#include <algorithm>
#include <cstddef>

#include "distributions/erfinv.hpp"
#include "distributions/from_canonical.hpp"
#include "distributions/normal_forms.hpp"

namespace tarn::statistics {

// By inversion, one word a value.
template <class Real>
struct normal_inversion {
  normal_end<Real> end;

  void operator()(const word_source& source, std::size_t n, Real* out, bool streaming) const {
    const normal_end<Real> scaled = end_of_erfinv(end);
    turn_reals<Real>(source, -1, 1, n, out, streaming,
                     [&](Real* u, std::size_t count, bool around, Real* to) {
                       erfinv(u, count, u);
                       end_normals(u, count, scaled, around, to);
                     });
  }
};

// By the sine of Box and Muller alone, two words a value.
template <class Real>
struct box_muller {
  normal_end<Real> end;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    turn_pairs<Real>(source, n, out, [&](Real* u, std::size_t count, Real* to) {
      box_muller_sines(u, count);
      end_normals(u, count, end, false, to);
    });
  }
};

// By sine and cosine, one word a value: two words give two values. A last single value takes the
// word behind its own as its partner, which stays in the stream.
template <class Real>
struct box_muller2 {
  normal_end<Real> end;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    const canonical<Real> reals(source, 0, 1);
    alignas(64) Real u[block_words];  // an even number: a last single one has room
    while (n != 0) {
      const std::size_t count = std::min(n, block_words);
      reals.draw(source, count, u);
      if (count % 2 != 0)
        u[count] = reals.peek(source);
      box_muller_pairs(u, (count + 1) / 2);
      end_normals(u, count, end, false, out);
      out += count;
      n -= count;
    }
  }
};

}  // namespace tarn::statistics
