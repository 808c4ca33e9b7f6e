// SPDX-License-Identifier: Apache-2.0
// Rates on both sides of 32, where methods change, and of 20000, up to which long calls have a
// table of guides; from nearly always zero to the ends of the results.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

const double rates[] = {1e-6, 0.01, 0.06, 0.5, 0.99, 1,     4,     10,  27,  31.9,
                        32,   32.1, 64,   100, 1000, 19999, 20001, 1e5, 1e7, 2e9};

// A rate for each result: four of them in turn, a result of four values here.
specimen vector_of(const double* four) {
  specimen s =
      routine("iRngPoissonV", rvxiRngPoissonV, 0, poisson(four[0]), integer_resolution(), four);
  s.width = 4;
  s.parameters.clear();
  s.views.clear();
  for (std::size_t i = 0; i < 4; ++i) {
    s.parameters += (i == 0 ? "" : ", ") + std::to_string(four[i]);
    s.views.push_back(
        {poisson(four[i]), integer_resolution(), [i](const double* result) { return result[i]; }});
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
                          poisson(lambda), integer_resolution(), lambda));
  }
  static const double rows[][4] = {{1e-6, 0.01, 0.06, 0.99}, {0.5, 1, 1.01, 2.5},
                                   {4, 10, 15, 27},          {31.9, 32, 32.1, 40},
                                   {64, 100, 150, 300},      {1000, 1e4, 1e5, 1e7},
                                   {2e9, 1e-3, 5, 200},      {1, 2, 4, 8},
                                   {16, 32, 64, 128},        {256, 512, 1024, 2048},
                                   {4096, 8192, 16384, 3e4}, {0.125, 0.25, 0.3, 0.7}};
  for (const auto& row : rows)
    all.push_back(vector_of(row));
  return all;
}

}  // namespace laws
