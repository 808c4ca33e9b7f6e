// SPDX-License-Identifier: Apache-2.0
// Means of the less likely outcome on both sides of 30, where methods change, probabilities on both
// sides of one half, trials of every size, and laws of a single value.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> binomial_cases() {
  std::vector<specimen> all;
  struct set {
    std::int32_t ntrial;
    double p;
  };
  for (const auto& [ntrial, p] :
       {set{1, 0.3},           set{10, 0.3},          set{10, 0.7},         set{20, 0.499},
        set{20, 0.501},        set{100, 0.02},        set{60, 0.49},        set{60, 0.499},
        set{60, 0.501},        set{62, 0.5},          set{100, 0.29},       set{100, 0.3},
        set{100, 0.31},        set{1, 0.01},          set{20, 0.01},        set{100, 0.01},
        set{2000, 0.01},       set{100000, 0.01},     set{100, 0.71},       set{100, 0.69},
        set{1000, 0.01},       set{1000, 0.0299},     set{1000, 0.0301},    set{1000, 0.9},
        set{1000, 0.5},        set{10000, 0.999},     set{1000000, 0.001},  set{1000000, 0.3},
        set{2147483647, 1e-9}, set{2147483647, 1e-6}, set{2147483647, 0.4}, set{2147483647, 0.7},
        set{50, 0.0},          set{50, 1.0}}) {
    all.push_back(routine("iRngBinomial", rvxiRngBinomial, 0, binomial(ntrial, p),
                          integer_resolution(), ntrial, p));
  }
  return all;
}

}  // namespace laws
