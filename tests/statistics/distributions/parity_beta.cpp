// SPDX-License-Identifier: Apache-2.0
// Beta variates against their methods tried plainly, candidate by candidate: which candidates are
// accepted, their values within bounds derived from the errors of the elementary functions, and the
// words used. Under each SIMD target.
#include "every_engine.hpp"
#include "rejection_model.hpp"

namespace {

using support::any_stream;
using beta_variates = support::on_simd_target;

int draw(std::int64_t method, rvx_stream s, std::size_t n, float* r, float p, float q, float a,
         float b) {
  return rvxsRngBeta(method, s, static_cast<std::int64_t>(n), r, p, q, a, b);
}
int draw(std::int64_t method, rvx_stream s, std::size_t n, double* r, double p, double q, double a,
         double b) {
  return rvxdRngBeta(method, s, static_cast<std::int64_t>(n), r, p, q, a, b);
}

// One candidate of the method that belongs to shapes other than 1. A logarithm has an error of 3.5
// units, and what is multiplied or divided and goes into an exponential turns relative errors into
// that many times the logarithm.
template <class Number>
struct plain_beta {
  Number p, q;

  model::verdict<Number> operator()(model::uniforms& u) const {
    if (p > 1 && q > 1)
      return cheng(u);
    if (p < 1 && q < 1) {
      const bool by_johnk =
          Number(0.8522552176537243) * p * p + q - Number(0.9562409713408151) <= 0;
      return by_johnk ? johnk(u) : atkinson(u, p, q, false);
    }
    return p < 1 ? atkinson(u, p, q, false) : atkinson(u, q, p, true);
  }

 private:
  using verdict = model::verdict<Number>;

  verdict cheng(model::uniforms& uniforms) const {
    using std::abs, std::exp, std::log, std::max, std::min, std::sqrt;
    const auto u1 = uniforms.inner<Number>();
    const auto u2 = uniforms.next<Number>();
    const Number a = min(p, q), b = max(p, q), alpha = a + b;
    const Number beta = sqrt((alpha - 2) / (2 * a * b - alpha)), gamma = a + 1 / beta;
    const Number v = beta * log(u1 / (1 - u1)), w = a * exp(v);
    const Number bound = gamma * v - log(Number(4)) + alpha * log(alpha / (b + w));
    const Number z = u1 * u1 * u2;
    const Number log_z = z == 0 ? Number(-1e6) : Number(log(z));
    const Number value = (a == p ? w : b) / (b + w);
    return {bound >= log_z, value, 12 + 8 * abs(v), abs(bound - log_z)};
  }

  verdict johnk(model::uniforms& uniforms) const {
    using std::abs, std::exp, std::log, std::max;
    const Number log_x = log(uniforms.inner<Number>()) / p;
    const Number log_y = log(uniforms.inner<Number>()) / q;
    const Number over = 1 - exp(log_x) - exp(log_y);
    const Number value = 1 / (1 + exp(log_y - log_x));
    return {over >= 0, value, 8 + 8 * max(abs(log_x), abs(log_y)), abs(over)};
  }

  // lesser < 1; `mirrored` gives 1 - x. The tolerance is that of the part that comes from the
  // exponential, y, and its share in 1 - y.
  verdict atkinson(model::uniforms& uniforms, const Number& lesser, const Number& greater,
                   bool mirrored) const {
    using std::abs, std::exp, std::log, std::pow, std::sqrt;
    const auto u = uniforms.inner<Number>();
    const Number log_w = log(uniforms.inner<Number>());
    const bool both_below = greater < 1;
    const Number root_l = sqrt(lesser * (1 - lesser));
    const Number t = both_below ? Number(root_l / (root_l + sqrt(greater * (1 - greater))))
                                : Number((1 - lesser) / (1 - lesser + greater));
    const Number left_mass = greater * t;
    const Number right_mass = lesser * (both_below ? Number(1 - t) : Number(pow(1 - t, greater)));
    const Number split = left_mass / (left_mass + right_mass);
    const bool left = u <= split;
    const Number log_y = left ? Number(log(t) + log(u / split) / lesser)
                              : Number(log(1 - t) + log((1 - u) / (1 - split)) / greater);
    const Number y = exp(log_y), x = left ? y : Number(1 - y);
    const Number test =
        left ? Number(log_w + (1 - greater) * (log(1 - x) - (both_below ? log(1 - t) : Number(0))))
             : Number(log_w + (1 - lesser) * (log(x) - log(t)));
    const Number error = 12 + 8 * abs(log_y) + 4 / (left ? lesser : greater);
    const Number value = mirrored ? Number(1 - x) : x;
    const bool is_y = left != mirrored;
    return {test <= 0, value, is_y ? error : Number(12 + error * y / (1 - y)),
            abs(test) < abs(u - split) ? Number(abs(test)) : Number(abs(u - split))};
  }
};

template <class Number, class Real>
void compare(any_stream& s, Real p, Real q, Real a, Real b, std::size_t n,
             double least_margin = 1e-11) {
  SCOPED_TRACE(testing::Message() << p << ", " << q);
  model::compare<Number>(s, plain_beta<Number>{Number(p), Number(q)}, a, b, n, least_margin,
                         [&](rvx_stream stream, std::size_t count, Real* r) {
                           return draw(count % 2 == 0 ? RVX_RNG_METHOD_ACCURACY_FLAG : 0, stream,
                                       count, r, p, q, a, b);
                         });
}

template <class Real>
struct shapes {
  Real p, q;
};

template <class Real>
Real above(Real x) {
  return std::nextafter(x, Real(2) * x);
}
template <class Real>
Real below(Real x) {
  return std::nextafter(x, Real(0));
}

// Shapes on both sides of every change of method: of Johnk's and Atkinson's at p = 1/2 the greater
// shape 0.7431..., and 1.
template <class Real>
const shapes<Real> cases[] = {
    {Real(2.5), Real(1.5)},    {Real(1.5), Real(2.5)},      {above(Real(1)), above(Real(1))},
    {Real(20), Real(30)},      {Real(1.2), Real(500)},      {Real(500), Real(1.2)},
    {Real(0.5), Real(0.5)},    {Real(0.5), Real(0.743)},    {Real(0.5), Real(0.744)},
    {Real(0.9), Real(0.2)},    {Real(0.3), Real(0.9)},      {Real(0.9), Real(0.9)},
    {Real(0.9), Real(0.7)},    {Real(0.7), Real(0.9)},      {Real(0.5), Real(2)},
    {Real(2), Real(0.5)},      {Real(0.05), Real(100)},     {Real(100), Real(0.3)},
    {below(Real(1)), Real(3)}, {Real(0.4), above(Real(1))}, {below(Real(1)), below(Real(1))}};

template <class Real>
void compare_cases() {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {42});
  for (const auto& c : cases<Real>) {
    ASSERT_NO_FATAL_FAILURE(compare<long double>(s, c.p, c.q, Real(0), Real(1), 4001));
    for (std::size_t n = 1; n <= 40; ++n)
      ASSERT_NO_FATAL_FAILURE(compare<long double>(s, c.p, c.q, Real(-3), Real(0.7), n));
    for (std::size_t n : {511u, 512u, 513u, 1025u})
      ASSERT_NO_FATAL_FAILURE(compare<long double>(s, c.p, c.q, Real(1e6), Real(30), n));
  }
}

TEST_F(beta_variates, floats_are_those_of_the_plain_methods) {
  compare_cases<float>();
}
TEST_F(beta_variates, doubles_are_those_of_the_plain_methods) {
  compare_cases<double>();
}

// Around the lesser shape 2^17, from which on Cheng's test is a series, both forms have errors of
// up to 2^-34; far above it, and with one or both shapes far from 1, the plain formulas need more
// digits than any built-in type has.
TEST_F(beta_variates, shapes_far_from_one) {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {43});
  const shapes<double> extremes[] = {
      {131000, 140000}, {140000, 131073}, {1e6, 3e7},   {1e30, 1e30}, {1e12, 1e25}, {2, 1e30},
      {1e30, 1.5},      {0.5, 1e30},      {1e30, 0.25}, {1e-3, 1e20}, {0.01, 0.02}, {0.01, 0.99}};
  for (const auto& c : extremes) {
    ASSERT_NO_FATAL_FAILURE(compare<model::digits_100>(s, c.p, c.q, 0.0, 1.0, 200, 1e-9));
    ASSERT_NO_FATAL_FAILURE(compare<model::digits_100>(
        s, static_cast<float>(c.p), static_cast<float>(c.q), 0.0f, 1.0f, 100, 1e-9));
  }
}

TEST_F(beta_variates, extreme_words) {
  for (const auto& c : cases<double>)
    model::for_extreme_words([&](any_stream& s) {
      ASSERT_NO_FATAL_FAILURE(compare<long double>(s, c.p, c.q, 0.0, 1.0, 2, 0));
    });
}

// One shape is 1: one word for one value.
template <class Real>
void compare_inversion() {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {44});
  const shapes<Real> ones[] = {{1, 1},         {1, Real(0.01)}, {1, Real(0.5)},
                               {1, 7},         {1, Real(1e15)}, {Real(0.01), 1},
                               {Real(0.5), 1}, {7, 1},          {Real(1e15), 1}};
  for (const auto& c : ones) {
    SCOPED_TRACE(testing::Message() << c.p << ", " << c.q);
    constexpr std::size_t n = 2503;
    any_stream other = s;
    support::results<Real> r(n), u(n);
    ASSERT_EQ(draw(0, s, n, r.data(), c.p, c.q, Real(0), Real(1)), 0);
    if constexpr (sizeof(Real) == sizeof(float))
      ASSERT_EQ(rvxsRngUniform(0, other, n, u.data(), 0, 1), 0);
    else
      ASSERT_EQ(rvxdRngUniform(0, other, n, u.data(), 0, 1), 0);
    for (std::size_t i = 0; i < n; ++i) {
      const long double shape = c.p == 1 ? c.q : c.p;
      const long double log = std::log(static_cast<long double>(u[i])) / shape;
      const long double expected = c.p == 1 ? -std::expm1(log) : std::exp(log);
      // Errors of the logarithm, 4 units, and of the exponential, 7, beside the last rounding.
      const long double bound = model::epsilon * expected * (8 + 5 * std::abs(log)) +
                                0.5001L * std::numeric_limits<Real>::epsilon() * expected +
                                static_cast<long double>(std::numeric_limits<Real>::denorm_min());
      ASSERT_LE(std::abs(r[i] - expected), bound) << u[i];
    }
    EXPECT_TRUE(r.guards_intact());
    EXPECT_EQ(s.image(), other.image());
  }
}

TEST_F(beta_variates, a_shape_of_one) {
  compare_inversion<float>();
  compare_inversion<double>();
}

TEST_F(beta_variates, cuts) {
  for (const auto& c :
       {shapes<double>{2, 3}, {0.5, 0.4}, {0.9, 0.8}, {0.5, 3}, {3, 0.5}, {1, 2}, {2, 1}}) {
    ASSERT_NO_FATAL_FAILURE(
        model::compare_cuts<double>([&](rvx_stream s, std::size_t n, double* r) {
          return draw(0, s, n, r, c.p, c.q, 0.0, 1.0);
        }));
    ASSERT_NO_FATAL_FAILURE(model::compare_cuts<float>([&](rvx_stream s, std::size_t n, float* r) {
      return draw(0, s, n, r, static_cast<float>(c.p), static_cast<float>(c.q), 0.0f, 1.0f);
    }));
  }
}

// From the least shapes to the greatest: in [a, a + b], never anything else.
template <class Real>
void draw_at_the_ends_of_the_range() {
  using limits = std::numeric_limits<Real>;
  constexpr std::size_t n = 600;
  any_stream s(RVX_BRNG_PHILOX4X32X10, {45});
  const Real extremes[] = {limits::denorm_min(), limits::min(), Real(1e-30),    Real(0.5),
                           below(Real(1)),       Real(1),       above(Real(1)), Real(2),
                           Real(1e30),           limits::max()};
  for (const Real p : extremes)
    for (const Real q : extremes)
      for (const Real a : {Real(0), Real(-1), limits::max()})
        for (const Real b : {limits::denorm_min(), Real(1), limits::max()}) {
          support::results<Real> r(n);
          ASSERT_EQ(draw(RVX_RNG_METHOD_ACCURACY_FLAG, s, n, r.data(), p, q, a, b), 0);
          for (std::size_t i = 0; i < n; ++i)
            ASSERT_TRUE(std::isfinite(r[i]) && a <= r[i] && r[i] <= a + b)
                << p << ' ' << q << ' ' << a << ' ' << b;
          EXPECT_TRUE(r.guards_intact());
        }
}

TEST_F(beta_variates, finite_for_all_parameters) {
  draw_at_the_ends_of_the_range<float>();
  draw_at_the_ends_of_the_range<double>();
}

// For two least shapes only the ends are left: 1 with the probability p / (p + q).
TEST_F(beta_variates, least_shapes_choose_an_end) {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {46});
  constexpr std::size_t n = 40000;
  constexpr double least = std::numeric_limits<double>::denorm_min();
  support::results<double> r(n);
  ASSERT_EQ(draw(0, s, n, r.data(), 3 * least, least, 0.0, 1.0), 0);
  std::size_t ones = 0;
  for (std::size_t i = 0; i < n; ++i) {
    ASSERT_TRUE(r[i] == 0 || r[i] == 1);
    ones += r[i] == 1;
  }
  // Deviation of the count sqrt(n * 3 / 16) = 87; 500 are more than five of them.
  EXPECT_NEAR(static_cast<double>(ones), 0.75 * n, 500);
}

TEST_F(beta_variates, every_engine) {
  for (const support::engine_case& engine : support::every_engine()) {
    if (engine.code == RVX_BRNG_NONDETERM)
      continue;
    SCOPED_TRACE(engine.name);
    any_stream s = engine.make();
    for (const auto& c : {shapes<double>{2.5, 1.5}, {0.5, 0.4}, {0.9, 0.8}, {3, 0.5}})
      ASSERT_NO_FATAL_FAILURE(compare<long double>(s, c.p, c.q, 0.0, 1.0, 700));
    ASSERT_NO_FATAL_FAILURE(compare<long double>(s, 2.5f, 1.5f, 0.0f, 1.0f, 700));
  }
}

// The values of the models leave the last bits open; this holds them, as all targets compute them.
// Another release of the vector functions may change it.
TEST_F(beta_variates, bits_of_all_targets) {
  std::uint64_t hash = model::empty_hash;
  for (const auto& c : {shapes<double>{2.5, 1.5},
                        {1e6, 2e6},
                        {0.5, 0.4},
                        {0.9, 0.8},
                        {0.5, 3},
                        {3, 0.5},
                        {1, 2},
                        {2, 1}}) {
    model::add_to_hash<double>(hash, [&](rvx_stream s, std::size_t n, double* r) {
      return draw(0, s, n, r, c.p, c.q, 0.1, 3.0);
    });
    model::add_to_hash<float>(hash, [&](rvx_stream s, std::size_t n, float* r) {
      return draw(0, s, n, r, static_cast<float>(c.p), static_cast<float>(c.q), 0.1f, 3.0f);
    });
  }
  EXPECT_EQ(hash, 10943658314216642055u);
}

}  // namespace
