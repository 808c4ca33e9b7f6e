// SPDX-License-Identifier: Apache-2.0
// Reals, integers and raw bits.
#include <algorithm>

#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add_reals(std::vector<specimen>& all) {
  // The last one has the width of a few hundred units in the last place of a float.
  const double ends[][2] = {{0, 1},        {-1, 1},    {-3, 5},       {100, 100.5},  {1e6, 2e6},
                            {-1e-3, 1e-4}, {0, 1e30},  {-1e30, 1e30}, {0, 1e-25},    {-7.25, -7},
                            {0.1, 0.3},    {0, 65536}, {-1e-3, 1e5},  {1, 1.0000305}};
  for (const auto& e : ends) {
    const auto a = static_cast<Real>(e[0]), b = static_cast<Real>(e[1]);
    for (const std::int64_t method :
         {RVX_RNG_METHOD_UNIFORM_STD, RVX_RNG_METHOD_UNIFORM_STD_ACCURATE}) {
      const bool accurate = method == RVX_RNG_METHOD_UNIFORM_STD_ACCURATE;
      all.push_back(routine(form_name<Real>("RngUniform"),
                            form<Real>(rvxsRngUniform, rvxdRngUniform), method, uniform(a, b),
                            resolution_of<Real>(std::max(-a, b), accurate), a, b));
    }
  }
}

// The floor of a float uniform: probabilities are met to the 24 bits of a float.
void add_integers(std::vector<specimen>& all) {
  const std::int32_t ends[][2] = {{0, 1},       {0, 2},         {-1, 1},      {0, 6},
                                  {1, 7},       {-10, 11},      {0, 100},     {-1000, 77},
                                  {0, 1 << 16}, {-5000, -4000}, {0, 1000003}, {-300000, 300000}};
  for (const auto& e : ends) {
    grain resolution = integer_resolution();
    resolution.probability = 0x1p-24;
    // Rounding delivers the upper end itself once in 2^25 words.
    law expected = integers(e[0], e[1]);
    ++expected.upper;
    all.push_back(routine("iRngUniform", rvxiRngUniform, 0, expected, resolution, e[0], e[1]));
  }
}

}  // namespace

std::vector<specimen> uniform_cases() {
  std::vector<specimen> all;
  add_reals<float>(all);
  add_reals<double>(all);
  add_integers(all);
  // Integers so many that they are as good as reals.
  const law words = uniform(0, 0x1p32);
  const grain whole{0, 0, 0, 0x1p-32, true};
  all.push_back(routine("iRngUniformBits32", rvxiRngUniformBits32, 0, words, whole));
  all.push_back(routine("iRngUniformBits64", rvxiRngUniformBits64, 0, uniform(0, 0x1p64), whole));
  // What raw words are depends on the engine: philox gives 32 bits.
  all.push_back(routine("iRngUniformBits", rvxiRngUniformBits, 0, words, whole));
  return all;
}

}  // namespace laws
