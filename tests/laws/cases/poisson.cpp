// SPDX-License-Identifier: Apache-2.0
// Rates on both sides of every change of method: 1, 10, 27, 30, 100 and powers of two, and far
// away.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

const double rates[] = {1e-6, 0.01,  0.06,  0.063, 0.5,  0.99, 1,    1.01, 4,
                        9.99, 10.01, 26.9,  27.1,  29.9, 30,   30.1, 63,   65,
                        99.9, 100,   100.1, 1000,  1e5,  1e7,  2e9};

// A normal variate with corrections is a Poisson one up to a stated distance. Measured without
// chance (law_inversions.cpp) it stays below what 2^18 points of a net can show, 1e-5 at a rate of
// 4 and 2e-4 at 1000; the bound leaves it that room.
grain approximate() {
  grain g = integer_resolution();
  g.tolerance = 3e-4;
  return g;
}

// A rate for each result: four of them in turn, a result of four values here.
specimen vector_of(const double* four) {
  specimen s = routine("iRngPoissonV", rvxiRngPoissonV, 0, poisson(four[0]), approximate(), four);
  s.width = 4;
  s.parameters.clear();
  s.views.clear();
  for (std::size_t i = 0; i < 4; ++i) {
    s.parameters += (i == 0 ? "" : ", ") + std::to_string(four[i]);
    s.views.push_back(
        {poisson(four[i]), approximate(), [i](const double* result) { return result[i]; }});
  }
  s.draw = [four](rvx_stream stream, std::size_t n, void* r) {
    std::vector<double> lambda(4 * n);
    for (std::size_t i = 0; i < lambda.size(); ++i)
      lambda[i] = four[i % 4];
    return rvxiRngPoissonV(0, stream, static_cast<std::int64_t>(4 * n),
                           static_cast<std::int32_t*>(r), lambda.data());
  };
  return s;
}

}  // namespace

std::vector<specimen> poisson_cases() {
  std::vector<specimen> all;
  for (const double lambda : rates) {
    all.push_back(routine("iRngPoisson", rvxiRngPoisson, RVX_RNG_METHOD_POISSON_PTPE,
                          poisson(lambda), integer_resolution(), lambda));
    all.push_back(routine("iRngPoisson", rvxiRngPoisson, RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF,
                          poisson(lambda), approximate(), lambda));
  }
  static const double rows[][4] = {{1e-6, 0.01, 0.06, 0.063}, {0.5, 0.99, 1, 1.01},
                                   {4, 9.99, 10.01, 26.9},    {27.1, 29.9, 30, 30.1},
                                   {63, 65, 99.9, 100},       {100.1, 1000, 1e5, 1e7},
                                   {2e9, 1e-3, 5, 200},       {1, 2, 4, 8},
                                   {16, 32, 64, 128},         {256, 512, 1024, 2048},
                                   {4096, 8192, 16384, 3e4},  {0.125, 0.25, 0.3, 0.7}};
  for (const auto& row : rows)
    all.push_back(vector_of(row));
  return all;
}

}  // namespace laws
