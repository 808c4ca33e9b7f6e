// SPDX-License-Identifier: Apache-2.0
// Bad parameters of every routine: status -k, one report of position k, nothing written, and the
// stream stays. The raw entries, without the checks in front, refuse the same.
#include <deque>
#include <functional>
#include <limits>
#include <set>

#include "support.hpp"

namespace {

constexpr double nan_value = std::numeric_limits<double>::quiet_NaN();
constexpr double infinite = std::numeric_limits<double>::infinity();

// A call of a routine with all its parameters, under its plain name or as raw entry.
struct bad_call {
  const char* routine;
  int position;
  std::function<int(rvx_stream, void*r)> plain, raw;
};

std::vector<bad_call>& table() {
  static std::vector<bad_call> all;
  return all;
}

// Both forms of one call; 4 results.
#define BAD(name, value, position, ...)                                                            \
  table().push_back({#name, position,                                                              \
                     [=](rvx_stream source, void* results) {                                       \
                       return rvx##name(0, source, 4, static_cast<value*>(results), __VA_ARGS__);  \
                     },                                                                            \
                     [=](rvx_stream source, void* results) {                                       \
                       return _rvx##name(0, source, 4, static_cast<value*>(results), __VA_ARGS__); \
                     }})

// A place that is not finite, and a scale or shape that is not positive and finite.
template <class Real>
std::vector<Real> no_places() {
  using limits = std::numeric_limits<Real>;
  return {limits::quiet_NaN(), limits::infinity(), -limits::infinity()};
}
template <class Real>
std::vector<Real> no_scales() {
  auto bad = no_places<Real>();
  bad.insert(bad.end(), {Real(0), Real(-0.0), Real(-1), -std::numeric_limits<Real>::denorm_min()});
  return bad;
}

// Bounds out of order, bounds that are not finite, and finite ones whose difference or sum is not.
template <class Real>
std::vector<std::pair<Real, Real>> no_bounds() {
  constexpr Real most = std::numeric_limits<Real>::max();
  std::vector<std::pair<Real, Real>> bad{
      {1, 1}, {1, -1}, {-most, most}, {most / 2, most}, {-most, -most / 2}};
  for (const Real x : no_places<Real>())
    bad.insert(bad.end(), {{x, Real(1)}, {Real(0), x}, {x, x}, {x, -x}});
  return bad;
}

#define BAD_PLACE_AND_SCALE(name, value)   \
  for (const value x : no_places<value>()) \
    BAD(name, value, 5, x, value(1));      \
  for (const value x : no_scales<value>()) \
  BAD(name, value, 6, value(0), x)

#define BAD_SHAPE_PLACE_SCALE(name, value)      \
  for (const value x : no_scales<value>())      \
    BAD(name, value, 5, x, value(0), value(1)); \
  for (const value x : no_places<value>())      \
    BAD(name, value, 6, value(2), x, value(1)); \
  for (const value x : no_scales<value>())      \
  BAD(name, value, 7, value(2), value(0), x)

template <class Real, class Add>
void four_reals(bool second_is_place, const Add& add) {
  // lognormal m, s, displ, scale and beta p, q, a, b differ in what the first one is.
  for (const Real x : second_is_place ? no_places<Real>() : no_scales<Real>())
    add(5, x, Real(1), Real(0), Real(1));
  for (const Real x : no_scales<Real>())
    add(6, Real(1), x, Real(0), Real(1));
  for (const Real x : no_places<Real>())
    add(7, Real(1), Real(1), x, Real(1));
  for (const Real x : no_scales<Real>())
    add(8, Real(1), Real(1), Real(0), x);
}

void add_reals() {
  for (const auto& ends : no_bounds<float>())
    BAD(sRngUniform, float, 5, ends.first, ends.second);
  for (const auto& ends : no_bounds<double>())
    BAD(dRngUniform, double, 5, ends.first, ends.second);
  BAD_PLACE_AND_SCALE(sRngGaussian, float);
  BAD_PLACE_AND_SCALE(dRngGaussian, double);
  BAD_PLACE_AND_SCALE(sRngExponential, float);
  BAD_PLACE_AND_SCALE(dRngExponential, double);
  BAD_PLACE_AND_SCALE(sRngRayleigh, float);
  BAD_PLACE_AND_SCALE(dRngRayleigh, double);
  BAD_PLACE_AND_SCALE(sRngGumbel, float);
  BAD_PLACE_AND_SCALE(dRngGumbel, double);
  BAD_PLACE_AND_SCALE(sRngLaplace, float);
  BAD_PLACE_AND_SCALE(dRngLaplace, double);
  BAD_PLACE_AND_SCALE(sRngCauchy, float);
  BAD_PLACE_AND_SCALE(dRngCauchy, double);
  BAD_SHAPE_PLACE_SCALE(sRngGamma, float);
  BAD_SHAPE_PLACE_SCALE(dRngGamma, double);
  BAD_SHAPE_PLACE_SCALE(sRngWeibull, float);
  BAD_SHAPE_PLACE_SCALE(dRngWeibull, double);
  four_reals<float>(true, [](int k, float m, float s, float displ, float scale) {
    BAD(sRngLognormal, float, k, m, s, displ, scale);
  });
  four_reals<double>(true, [](int k, double m, double s, double displ, double scale) {
    BAD(dRngLognormal, double, k, m, s, displ, scale);
  });
  four_reals<float>(false, [](int k, float p, float q, float a, float b) {
    BAD(sRngBeta, float, k, p, q, a, b);
  });
  four_reals<double>(false, [](int k, double p, double q, double a, double b) {
    BAD(dRngBeta, double, k, p, q, a, b);
  });
  for (const std::int32_t degrees : {0, -1, std::numeric_limits<std::int32_t>::min()}) {
    BAD(sRngChiSquare, float, 5, degrees);
    BAD(dRngChiSquare, double, 5, degrees);
  }
}

// Numbers that calls of the table point to.
template <class Real>
const Real* kept(std::vector<Real> numbers) {
  static std::deque<std::vector<Real>> all;
  return all.emplace_back(std::move(numbers)).data();
}

// add(position, dimension, layout, mean, matrix), all of them for two dimensions.
template <class Real, class Add>
void vectors(const Add& add) {
  const Real* const numbers = kept<Real>({1, 0, 0, 1});
  const Real* const none = nullptr;
  for (const std::int32_t dimension : {0, -1})
    add(5, dimension, 0, numbers, numbers);
  for (const std::int32_t layout : {-1, 3})
    add(6, 2, layout, numbers, numbers);
  add(7, 2, 0, none, numbers);
  add(8, 2, 0, numbers, none);
  // Entries that count: all but the one above the diagonal, three, two.
  const std::vector<std::size_t> used[] = {{0, 2, 3}, {0, 1, 2}, {0, 1}};
  for (const Real x : no_places<Real>())
    for (const std::int32_t layout : {0, 1, 2}) {
      add(7, 2, layout, kept<Real>({x, 0}), numbers);
      add(7, 2, layout, kept<Real>({0, x}), numbers);
      for (const std::size_t entry : used[layout]) {
        std::vector<Real> matrix{1, 0, 0, 1};
        matrix[entry] = x;
        add(8, 2, layout, numbers, kept(matrix));
      }
    }
}

void add_vectors() {
  vectors<float>(
      [](int k, std::int32_t dimension, std::int32_t layout, const float* mean,
         const float* matrix) { BAD(sRngGaussianMV, float, k, dimension, layout, mean, matrix); });
  vectors<double>([](int k, std::int32_t dimension, std::int32_t layout, const double* mean,
                     const double* matrix) {
    BAD(dRngGaussianMV, double, k, dimension, layout, mean, matrix);
  });
}

void add_integers() {
  using int32 = std::int32_t;
  BAD(iRngUniform, int32, 5, 3, 3);
  BAD(iRngUniform, int32, 5, 3, -3);
  for (const double p : {nan_value, infinite, -infinite, -1e-300, 1 + 1e-15, 2.0}) {
    BAD(iRngBernoulli, int32, 5, p);
    BAD(iRngGeometric, int32, 5, p);
    BAD(iRngBinomial, int32, 6, 10, p);
    BAD(iRngNegbinomial, int32, 6, 2.0, p);
  }
  BAD(iRngGeometric, int32, 5, 0.0);
  BAD(iRngNegbinomial, int32, 6, 2.0, 0.0);
  for (const int32 ntrial : {0, -1}) {
    BAD(iRngBinomial, int32, 5, ntrial, 0.5);
  }
  for (const double a : no_scales<double>()) {
    BAD(iRngNegbinomial, int32, 5, a, 0.5);
    BAD(iRngPoisson, int32, 5, a);
  }
  BAD(iRngHypergeometric, int32, 6, 10, -1, 5);
  BAD(iRngHypergeometric, int32, 7, 10, 5, -1);
  BAD(iRngHypergeometric, int32, 5, 10, 11, 5);
  BAD(iRngHypergeometric, int32, 5, 10, 5, 11);
  BAD(iRngHypergeometric, int32, 5, -1, 0, 0);
  static const double p[4] = {0.25, 0.25, 0.25, 0.25};
  const double* const none = nullptr;
  BAD(iRngMultinomial, int32, 5, -1, 4, p);
  BAD(iRngMultinomial, int32, 6, 5, 0, p);
  BAD(iRngMultinomial, int32, 6, 5, -4, p);
  BAD(iRngMultinomial, int32, 7, 5, 4, none);
  static const double not_probabilities[][4] = {
      {0.5, 0.5, 0.5, 0.5}, {0.1, 0.1, 0.1, 0.1}, {1.5, -0.5, 0, 0}, {nan_value, 0.5, 0.5, 0}};
  for (const auto& bad : not_probabilities) {
    const double* const bad_p = bad;
    BAD(iRngMultinomial, int32, 7, 5, 4, bad_p);
  }
  BAD(iRngPoissonV, int32, 5, none);
  static const double bad_rates[][4] = {
      {1, 1, 1, 0}, {1, -1, 1, 1}, {nan_value, 1, 1, 1}, {1, 1, infinite, 1}};
  for (const auto& rates : bad_rates) {
    const double* const lambda = rates;
    BAD(iRngPoissonV, int32, 5, lambda);
  }
}

class parameters : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    add_reals();
    add_vectors();
    add_integers();
  }
  static void TearDownTestSuite() { table().clear(); }

  void expect_unmoved(const bad_call& call, const std::function<int(rvx_stream, void*)>& form) {
    const support::record before = stream_.state();
    support::results<double> r(16);
    EXPECT_EQ(form(stream_, r.data()), -call.position) << call.routine;
    EXPECT_TRUE(r.untouched()) << call.routine;
    const support::record after = stream_.state();
    EXPECT_EQ(std::memcmp(&before, &after, sizeof before), 0) << call.routine;
  }

  support::stream stream_;
};

TEST_F(parameters, bad_ones_are_refused_and_reported_once) {
  support::reports reports;
  for (const bad_call& call : table()) {
    expect_unmoved(call, call.plain);
    EXPECT_EQ(reports.take(),
              (support::reports::list{{std::string("rvx") + call.routine, call.position}}));
  }
}

TEST_F(parameters, raw_entries_refuse_the_same) {
  for (const bad_call& call : table())
    expect_unmoved(call, call.raw);
}

TEST_F(parameters, of_every_routine_that_has_some_are_in_the_table) {
  std::set<std::string> routines;
  for (const bad_call& call : table())
    routines.insert(call.routine);
#define TARN_ROUTINE(name, value, methods, width, parameters, arguments, check) \
  if (std::string(#arguments) != "()") {                                        \
    EXPECT_EQ(routines.count(#name), 1u) << #name;                              \
  }
#include "statistics/common/routines.def"
  EXPECT_EQ(routines.count("iRngPoissonV"), 1u);
}

}  // namespace
