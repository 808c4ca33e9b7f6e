// SPDX-License-Identifier: Apache-2.0
// poisson_v on GPUs: the kernel functor against its formulas, each rate on its own result on every
// engine, and the two ways by which rates reach the kernel.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <new>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/poisson_functors.hpp"
#include "formula_support.hpp"
#include "in_flight.hpp"
#include "level_calls.hpp"
#include "message.hpp"

namespace {

/// As long as it lives, an allocation of `size` bytes on this thread gets `block`: so the list of a
/// distribution comes to lie where the test wants it. One block at a time.
class loan {
 public:
  loan(void* block, std::size_t size) {
    lent = block;
    wanted = size;
    taken = false;
  }
  loan(const loan&) = delete;
  loan& operator=(const loan&) = delete;
  ~loan() { lent = nullptr; }

  static void* take(std::size_t size) {
    if (lent == nullptr || taken || size != wanted) {
      return nullptr;
    }
    taken = true;
    return lent;
  }
  static bool is(const void* block) { return block != nullptr && block == lent; }

 private:
  static thread_local void* lent;
  static thread_local std::size_t wanted;
  static thread_local bool taken;
};
thread_local void* loan::lent = nullptr;
thread_local std::size_t loan::wanted = 0;
thread_local bool loan::taken = false;

}  // namespace

void* operator new(std::size_t size) {
  void* block = loan::take(size);
  if (block == nullptr) {
    block = std::malloc(size != 0 ? size : 1);
  }
  if (block == nullptr) {
    throw std::bad_alloc();
  }
  return block;
}
// Not inlined: the compiler takes free() for a mistake where it sees it behind `new`.
[[gnu::noinline]] void operator delete(void* block) noexcept {
  if (!loan::is(block)) {
    std::free(block);
  }
}
void operator delete(void* block, std::size_t) noexcept {
  operator delete(block);
}

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using real = long double;
using tarn_test::both_forms;
using tarn_test::canonical_reals;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;
using tarn_test::output_form;

template <typename T>
T result_of(double lambda, float u) {
  return gpu::poisson_v_gaussian_icdf_based<T>{&lambda, -1, 1, 1}.at(u, 0);
}

real horner(std::initializer_list<real> c, real x) {
  real sum = 0;
  for (const real term : c) {
    sum = sum * x + term;
  }
  return sum;
}

/// x + 1 for a rate of 1/16 and more, from row `row`.
real plain_x(double lambda, float u, int row) {
  const double* c = gpu::poisson_v_interval_constants + 20 * row;
  const real t = std::ldexp(static_cast<real>(lambda), -std::ilogb(lambda)) - 1;
  const auto cubic = [&](int k) { return horner({c[k + 3], c[k + 2], c[k + 1], c[k]}, t); };
  const real z = gpu::erfinv_wrapper(u) * 1.41421354f;  // rounded to float, as told
  const real a = lambda + c[0] + c[1] * t;
  const real b = std::sqrt(static_cast<real>(lambda)) + c[2] + c[3] * t;
  return a + b * horner({cubic(16), cubic(12), cubic(8), cubic(4), 0}, z) + 1;
}

/// Kept: the exponential has a fourth power and no third, so that it falls short by up to 4e-5;
/// results depend on it.
int plain_small(double lambda, float u, real slack) {
  const real total = horner(
      {0.16669916415448055L, 0, 0.49999555884885266L, 1.0000002352041819L, 0.99999999789769289L},
      lambda);
  const real w = total * std::fabs(u) + slack;
  real sum = 1;
  real term = 1;
  int k = 0;
  while (k < 11 && w > sum) {
    ++k;
    term *= static_cast<real>(lambda) / k;
    sum += term;
  }
  return k;
}

template <typename T>
struct poisson_v_functor : testing::Test {};
using result_types = testing::Types<std::int32_t, std::uint32_t>;
TYPED_TEST_SUITE(poisson_v_functor, result_types);

// A dozen roundings in double of numbers up to x, which lie between no two results that differ.
TYPED_TEST(poisson_v_functor, is_its_formula_with_a_row_for_each_octave) {
  const auto reals = canonical_reals<float>(-1, 1);
  for (int row = 0; row < 18; ++row) {
    for (const double mantissa : {1.0, 1.3, std::nextafter(2.0, 1.0)}) {
      const double lambda = std::ldexp(mantissa, row - 4);
      for (const float u : reals) {
        const real x = plain_x(lambda, u, row);
        const real slack = 12 * 0x1p-53L * (lambda + std::fabs(x) + 1);
        const auto got = static_cast<real>(result_of<TypeParam>(lambda, u));
        ASSERT_GE(got, std::floor(std::fmax(x - slack, 0.0L))) << lambda << ' ' << u;
        ASSERT_LE(got, std::floor(std::fmax(x + slack, 0.0L))) << lambda << ' ' << u;
      }
    }
  }
}

TYPED_TEST(poisson_v_functor, rates_from_8192_on_share_the_last_row) {
  for (const double lambda : {8192.0, 16384.0, 20000.0, 3e5, 1e9}) {
    for (const float u : {-1.0f, -0.9f, -0.3f, 0.1f, 0.77f, 1.0f}) {
      EXPECT_EQ(static_cast<real>(result_of<TypeParam>(lambda, u)),
                std::floor(plain_x(lambda, u, 17)))
          << lambda << ' ' << u;
    }
  }
}

TYPED_TEST(poisson_v_functor, is_its_formula_for_rates_below_a_sixteenth) {
  int close = 0;
  for (const double lambda : {1e-300, 1e-9, 0.001, 0.03, std::nextafter(0.0625, 0.0)}) {
    for (const float u : canonical_reals<float>(-1, 1)) {
      const int low = plain_small(lambda, u, -1e-15L);
      const int high = plain_small(lambda, u, 1e-15L);
      const auto got = static_cast<int>(result_of<TypeParam>(lambda, u));
      ASSERT_GE(got, low) << lambda << ' ' << u;
      ASSERT_LE(got, high) << lambda << ' ' << u;
      close += low != high ? 1 : 0;
    }
  }
  EXPECT_LT(close, 10);
}

// Below, the size of u counts, so that u and -u give the same; from a sixteenth on its sign does.
TYPED_TEST(poisson_v_functor, a_sixteenth_is_where_inversion_begins) {
  const double below = std::nextafter(0.0625, 0.0);
  EXPECT_GT(result_of<TypeParam>(below, -0.97f), 0u);
  EXPECT_EQ(result_of<TypeParam>(below, -0.97f), result_of<TypeParam>(below, 0.97f));
  EXPECT_EQ(result_of<TypeParam>(0.0625, -0.97f), 0u);
  EXPECT_GT(result_of<TypeParam>(0.0625, 0.97f), 0u);
}

TYPED_TEST(poisson_v_functor, rates_below_a_sixteenth_never_give_more_than_11) {
  TypeParam most = 0;
  for (int i = 0; i < 1 << 16; ++i) {
    most = std::max(most, result_of<TypeParam>(0.0624, 1 - static_cast<float>(i) * 0x1p-24f));
  }
  EXPECT_EQ(most, 3u);  // where the exponential with its third power would go on to 4
  EXPECT_EQ(result_of<TypeParam>(0.0624, 3), 11u);  // beyond all sums
  EXPECT_EQ(result_of<TypeParam>(0.0624, std::numeric_limits<float>::quiet_NaN()), 11u);
}

TYPED_TEST(poisson_v_functor, a_uniform_of_0_gives_0_for_small_rates_and_the_median_for_others) {
  EXPECT_EQ(result_of<TypeParam>(0.05, 0), 0u);
  EXPECT_EQ(result_of<TypeParam>(1, 0), 1u);
  EXPECT_EQ(result_of<TypeParam>(100, 0), 100u);
  EXPECT_EQ(result_of<TypeParam>(1e6, 0), 1000000u);
}

TYPED_TEST(poisson_v_functor, the_least_uniform_is_5_42_deviations_below_the_median) {
  // -3.8325069 from the inverse error function, times the root of 2.
  for (const double lambda : {0.0625, 1.0, 64.0, 1e4}) {
    const int row = std::min(std::ilogb(lambda) + 4, 17);
    EXPECT_EQ(static_cast<real>(result_of<TypeParam>(lambda, -1)),
              std::floor(std::fmax(plain_x(lambda, -1, row), 0.0L)));
  }
  EXPECT_EQ(result_of<TypeParam>(1, -1), 0u);
  EXPECT_EQ(result_of<TypeParam>(64, -1), 26u);
}

TYPED_TEST(poisson_v_functor, results_that_the_type_cannot_hold_are_its_greatest) {
  constexpr auto greatest = std::numeric_limits<TypeParam>::max();
  for (const double lambda : {1e10, 1e100, 1e300}) {
    EXPECT_EQ(result_of<TypeParam>(lambda, -1), greatest);
    EXPECT_EQ(result_of<TypeParam>(lambda, 0.5f), greatest);
  }
  EXPECT_EQ(result_of<TypeParam>(3e9, 0),
            (std::is_same_v<TypeParam, std::int32_t> ? greatest : static_cast<TypeParam>(3e9)));
}

TYPED_TEST(poisson_v_functor, reads_the_rate_of_its_place_and_none_past_the_last) {
  const std::vector<double> rates{0.001, 5, 400};
  const gpu::poisson_v_gaussian_icdf_based<TypeParam> functor{rates.data(), -1, 1, rates.size()};
  for (std::size_t i = 0; i < rates.size(); ++i) {
    EXPECT_EQ(functor.at(0.25f, i), result_of<TypeParam>(rates[i], 0.25f));
  }
  EXPECT_EQ(functor.at(0.25f, rates.size()), 0u);
  EXPECT_EQ(functor.at(0.25f, std::uint64_t{1} << 40), 0u);
  EXPECT_EQ(functor.range().lo, -1);
  EXPECT_EQ(functor.range().hi, 1);
  static_assert(std::is_trivially_copyable_v<decltype(functor)>);
}

/// Rates of all regimes, no two neighbours alike.
std::vector<double> rates_of(std::int64_t n) {
  std::vector<double> rates;
  for (std::int64_t i = 0; i < n; ++i) {
    rates.push_back(
        std::exp2(static_cast<double>(i * 7 % 29 - 8) + 0.125 * static_cast<double>(i % 5)));
  }
  return rates;
}

/// What the formula makes of uniforms, each with its rate.
template <typename T>
std::vector<T> model(const std::vector<float>& u, const std::vector<double>& rates) {
  std::vector<T> results;
  for (std::size_t i = 0; i < u.size(); ++i) {
    results.push_back(result_of<T>(rates[i], u[i]));
  }
  return results;
}

template <typename Case>
class poisson_v_on : public testing::Test {};
TYPED_TEST_SUITE(poisson_v_on, tarn_test::device_cases, tarn_test::case_name);

template <typename Case, typename T>
void expect_model(output_form form, std::int64_t n) {
  const std::vector<double> rates = rates_of(n);
  auto uniforms = Case::make(host_run_gpu_queue());
  auto engine = Case::make(host_run_gpu_queue());
  const auto u = draw(rng::uniform<float>(-1.0f, 1.0f), uniforms, n);
  const auto drawn =
      draw_at_level(form, rng::poisson_v<T>(rates), engine, n, static_cast<std::size_t>(n));
  ASSERT_EQ(drawn.values, model<T>(u, rates)) << n;
  ASSERT_EQ(drawn.consumed, n);
  tarn_test::expect_next<Case>(engine, n, 5);
}

TYPED_TEST(poisson_v_on, gives_each_result_its_rate_and_one_word) {
  for (const std::int64_t n : {1, 2, 3, 4, 37, 250, 1001}) {
    for (const output_form form : both_forms) {
      expect_model<TypeParam, std::int32_t>(form, n);
      expect_model<TypeParam, std::uint32_t>(form, n);
    }
  }
}

TEST(poisson_v_on_a_gpu, goes_on_in_the_sequence_from_call_to_call) {
  rng::philox4x32x10 uniforms(host_run_gpu_queue(), 7);
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  const auto u = draw(rng::uniform<float>(-1.0f, 1.0f), uniforms, 60);
  const std::vector<double> first = rates_of(23);
  const std::vector<double> second = rates_of(37);
  EXPECT_EQ(draw(rng::poisson_v<>(first), engine, 23),
            model<std::int32_t>({u.begin(), u.begin() + 23}, first));
  EXPECT_EQ(draw(rng::poisson_v<>(second), engine, 37),
            model<std::int32_t>({u.begin() + 23, u.end()}, second));
}

TEST(poisson_v_on_a_gpu, a_count_of_rates_other_than_that_of_results_is_refused) {
  using Case = tarn_test::engine_case<rng::philox4x32x10, rng::detail::device_type::gpu>;
  auto engine = Case::make(host_run_gpu_queue());
  const rng::poisson_v<> distr(rates_of(10));
  const tarn_test::results<std::int32_t> memory(engine.get_queue(), 20);
  sycl::buffer<std::int32_t, 1> buffer{sycl::range<1>(20)};
  const std::string text =
      "kestrel::tarn::rng::poisson_v: invalid argument: lambda size should be equal to n";
  for (const std::int64_t n : {0, 1, 9, 11, 20}) {
    EXPECT_EQ(tarn_test::message_of<kestrel::tarn::invalid_argument>(
                  [&] { rng::generate(distr, engine, n, memory.get()); }),
              text);
    EXPECT_EQ(tarn_test::message_of<kestrel::tarn::invalid_argument>(
                  [&] { rng::generate(distr, engine, n, buffer); }),
              text);
  }
  EXPECT_TRUE(memory.untouched());
  tarn_test::expect_next<Case>(engine, 0, 5);
}

/// Writes to the buffer and says so.
struct mark {
  sycl::accessor<std::int32_t, 1, sycl::access_mode::read_write> out;
  int* ran;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const {
    out[i] = -1;
    *ran = 1;
  }
};

/// A buffer into which nothing can be drawn before the gate opens, for a kernel that waits at the
/// gate writes to it first.
class held_output {
 public:
  held_output(sycl::queue queue, std::size_t size)
      : ran_(queue, 1), gate_(queue), buffer_(sycl::range<1>(size)) {
    *ran_.get() = 0;
    queue.submit([&](sycl::handler& group) {
      group.depends_on(gate_.closed);
      group.parallel_for(
          sycl::range<1>(size),
          mark{sycl::accessor<std::int32_t, 1, sycl::access_mode::read_write>(buffer_, group),
               ran_.get()});
    });
  }

  sycl::buffer<std::int32_t, 1>& buffer() { return buffer_; }
  tarn_test::gate& gate() { return gate_; }
  bool passed() const { return *ran_.get() != 0; }

  std::vector<std::int32_t> values() {
    const sycl::host_accessor host(buffer_, sycl::read_only);
    std::vector<std::int32_t> all;
    for (std::size_t i = 0; i < buffer_.size(); ++i) {
      all.push_back(host[i]);
    }
    return all;
  }

 private:
  tarn_test::results<int> ran_;
  tarn_test::gate gate_;
  sycl::buffer<std::int32_t, 1> buffer_;
};

TEST(poisson_v_on_a_gpu, with_rates_that_have_to_be_copied_it_is_over_on_return) {
  rng::philox4x32x10 uniforms(host_run_gpu_queue(), 7);
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  const std::vector<double> rates = rates_of(100);
  const auto u = draw(rng::uniform<float>(-1.0f, 1.0f), uniforms, 100);
  held_output out(engine.get_queue(), 100);
  out.gate().open_during([&] {
    rng::generate(rng::poisson_v<>(rates), engine, 100, out.buffer());
    EXPECT_TRUE(out.passed());
  });
  EXPECT_EQ(out.values(), model<std::int32_t>(u, rates));
}

TEST(poisson_v_on_a_gpu, rates_that_the_kernel_reaches_are_read_in_place_without_waiting) {
  rng::philox4x32x10 uniforms(host_run_gpu_queue(), 7);
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  const auto u = draw(rng::uniform<float>(-1.0f, 1.0f), uniforms, 100);
  const std::vector<double> rates = rates_of(100);
  const std::vector<double> others(rates.rbegin(), rates.rend());
  const tarn_test::results<double> shared(engine.get_queue(), 100);
  held_output out(engine.get_queue(), 100);
  const loan of_shared(shared.get(), 100 * sizeof(double));
  const rng::poisson_v<> distr(rates);
  ASSERT_EQ(distr.lambda().data(), shared.get());
  rng::generate(distr, engine, 100, out.buffer());
  EXPECT_FALSE(out.passed());
  std::copy(others.begin(), others.end(), shared.get());
  out.gate().open();
  EXPECT_EQ(out.values(), model<std::int32_t>(u, others));
}

}  // namespace
