// SPDX-License-Identifier: Apache-2.0
// The hat of BTPE and PTPE (Kachitvichyanukul, Schmeiser): a triangle, which lies below the law and
// is accepted at sight, the two halves of a parallelogram around it, and two exponential tails.
#pragma once

namespace tarn::statistics {

// With the names of the papers.
struct tent {
  // Areas, summed: triangle, parallelogram, left tail, right tail. p1 is half the triangle's base
  // as well.
  double p1, p2, p3, p4;
  double xm, xl, xr;  // middle and ends of the base
  double c;           // height of the parallelogram's sides
  double lambda_l, lambda_r;
};

}  // namespace tarn::statistics
