// SPDX-License-Identifier: Apache-2.0
// Routines that take one word for a count: the same values however a sequence is cut into calls,
// for every engine, and one word each. Long calls look values up that short ones compute.
#include <cmath>
#include <functional>
#include <string>

#include "every_engine.hpp"

namespace {

using support::any_stream;
using support::engine_case;

struct case_of_counts {
  const char* name;
  std::function<int(rvx_stream, std::int64_t, std::int32_t*, const double*)> draw;
};

const case_of_counts cases[] = {
    {"poisson 3.5", [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 3.5); }},
    {"poisson 3.5 by rejection",
     [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(0, s, n, r, 3.5); }},
    {"poisson 31", [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 31); }},
    {"poisson 40", [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 40); }},
    {"poisson 500", [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 500); }},
    {"poisson 19999",
     [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 19999); }},
    {"poisson 20001",
     [](auto s, auto n, auto* r, auto) { return rvxiRngPoisson(1, s, n, r, 20001); }},
    {"poisson_v",
     [](auto s, auto n, auto* r, auto* rate) { return rvxiRngPoissonV(0, s, n, r, rate); }},
    {"bernoulli", [](auto s, auto n, auto* r, auto) { return rvxiRngBernoulli(0, s, n, r, 0.3); }},
    {"geometric", [](auto s, auto n, auto* r, auto) { return rvxiRngGeometric(0, s, n, r, 0.02); }},
};

class counts : public support::on_simd_target, public testing::WithParamInterface<engine_case> {};

TEST_P(counts, do_not_depend_on_the_length_of_calls) {
  constexpr std::size_t n = 140000;  // long enough for tables and for threads
  std::vector<double> rates(n);
  support::test_data data(1);
  for (double& rate : rates)
    rate = std::ldexp(1 + static_cast<double>(data() >> 12) * 0x1p-52,
                      static_cast<int>(data.below(20)) - 6);
  for (const case_of_counts& c : cases) {
    SCOPED_TRACE(c.name);
    any_stream whole = GetParam().make();
    any_stream parts = whole, words = whole;
    support::results<std::int32_t> a(n), b(n);
    ASSERT_EQ(c.draw(whole, n, a.data(), rates.data()), 0);
    std::size_t done = 0;
    for (std::size_t count = 1; done < n; count = count % 1500 + 7) {
      const std::size_t some = std::min(count, n - done);
      ASSERT_EQ(
          c.draw(parts, static_cast<std::int64_t>(some), b.data() + done, rates.data() + done), 0);
      done += some;
    }
    ASSERT_TRUE(a == b);
    EXPECT_TRUE(a.guards_intact());
    static_cast<void>(words.words(n, GetParam().parts));
    EXPECT_EQ(whole.image(), words.image()) << "one word a value";
    EXPECT_EQ(parts.image(), words.image());
  }
}

std::vector<engine_case> repeating_engines() {
  auto chosen = support::every_engine();
  chosen.erase(std::remove_if(chosen.begin(), chosen.end(),
                              [](const engine_case& e) { return e.code == RVX_BRNG_NONDETERM; }),
               chosen.end());
  return chosen;
}
INSTANTIATE_TEST_SUITE_P(each, counts, testing::ValuesIn(repeating_engines()),
                         support::engine_name<engine_case>);

// poisson_v of one rate is poisson of that rate; of mixed rates each value is that of its own.
TEST_F(counts, rates_of_their_own) {
  const double some[] = {0.25, 500, 31.999, 32, 1e5, 3, 1e-7, 77.7, 2e9, 20};
  constexpr std::size_t n = 2003;
  std::vector<double> rates(n);
  for (std::size_t i = 0; i < n; ++i)
    rates[i] = some[(i * 7) % 10];
  support::stream mixed(3);
  support::results<std::int32_t> r(n);
  ASSERT_EQ(rvxiRngPoissonV(0, mixed, n, r.data(), rates.data()), 0);
  for (const double rate : some) {
    support::stream single(3);
    support::results<std::int32_t> all(n);
    ASSERT_EQ(rvxiRngPoisson(1, single, n, all.data(), rate), 0);
    for (std::size_t i = 0; i < n; ++i) {
      if (rates[i] != rate)
        continue;
      // Rounded differently at 2e9, where a unit is 1e-9 of the value.
      EXPECT_NEAR(r[i], all[i], rate > 1e8 ? 1 : 0) << "value " << i << " of rate " << rate;
    }
  }
  EXPECT_TRUE(r.guards_intact());
}

}  // namespace
