// SPDX-License-Identifier: Apache-2.0
// Every routine and method on every engine. Pseudo-random engines have to give the law, coarsely:
// errors of the meeting of engine and routine are gross ones. The words of quasi-random engines are
// no sample, so that only the range of results counts there.
#include "critical.hpp"
#include "every_engine.hpp"
#include "sampling.hpp"

namespace {

using laws::specimen;
using support::engine_case;

constexpr std::size_t n = 4000;

bool quasi_random(const engine_case& engine) {
  return engine.code == RVX_BRNG_SOBOL || engine.code == RVX_BRNG_NIEDERR;
}

class engines : public testing::TestWithParam<engine_case> {
 protected:
  // Raw words, and 32 or 64 equidistributed bits, are not the same on all engines.
  bool takes(const specimen& s) const { return s.routine.rfind("iRngUniformBits", 0) != 0; }
};

TEST_P(engines, give_every_law) {
  std::size_t judged = 0;
  for (const specimen& s : laws::every_method()) {
    if (!takes(s))
      continue;
    support::any_stream stream = GetParam().make();
    for (const laws::judged_view& view : laws::judge(s, stream, n)) {
      for (const laws::finding& f : view.findings) {
        const bool range = f.test == "values outside the support";
        if (range || !quasi_random(GetParam())) {
          EXPECT_FALSE(f.failed()) << s.name() << ", view " << view.number << ": " << f.test << " "
                                   << f.statistic << ", critical " << f.critical;
        }
      }
      ++judged;
    }
  }
  EXPECT_GE(judged, 60u);
}

INSTANTIATE_TEST_SUITE_P(each, engines, testing::ValuesIn(support::every_engine()),
                         support::engine_name<engine_case>);

class within_budget : public testing::Environment {
  // Thirteen engines take the share of three programs.
  void TearDown() override { EXPECT_LE(laws::tests_made(), 3 * laws::tests_of_a_program); }
};
const testing::Environment* const budget =
    testing::AddGlobalTestEnvironment(new within_budget);  // gtest owns it

}  // namespace
