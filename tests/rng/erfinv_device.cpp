// SPDX-License-Identifier: Apache-2.0
// The inverse error function of kernels: bit for bit the cubics of the tables, whose segment is
// found here by the exponent of t = 1 - |x|; the function itself within the error of the cubics;
// the ends, zeros and what is no argument; and the same bits on every device.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <vector>

#include <sycl/sycl.hpp>

#include <boost/math/special_functions/erf.hpp>
#include <gtest/gtest.h>

#include "distributions/erfinv.hpp"
#include "drawing.hpp"
#include "in_flight.hpp"
#include "queues.hpp"

namespace {

using kestrel::tarn::rng::detail::gpu::erfinv_wrapper;
namespace table = kestrel::tarn::rng::detail::gpu::erfinv_tables;

float plain_erfinv(float x) {
  const float ax = std::fabs(x);
  if (ax == 1)
    return std::copysign(table::float_end, x);
  int exponent;
  const float m = 2 * std::frexp(1 - ax, &exponent);  // [1, 2)
  const int eighth = static_cast<int>((m - 1) * 8);
  // 1 - |x| = 1 has no segment, and takes the first one where its mantissa stands.
  const float* c = table::float_rows[1 - ax == 1 ? 0 : 7 - eighth - 8 * exponent];
  const float r = m - static_cast<float>(eighth) / 8 - 1.0625f;
  return std::fma(std::fma(std::fma(c[3], r, c[2]), r, c[1]), r, c[0]) * x;
}

double plain_erfinv(double x) {
  const double ax = std::fabs(x);
  if (ax == 1)
    return std::copysign(table::double_end, x);
  int exponent;
  const double t = 1 - ax;
  const double m = 2 * std::frexp(t, &exponent);
  const int sixteenth = static_cast<int>((m - 1) * 16);
  const double* c = table::double_rows[sixteenth + 16 * (exponent + 52)];
  const double d = t - std::ldexp(1 + (sixteenth + 0.5) / 16, exponent - 1);
  return std::fma(std::fma(std::fma(c[0], d, c[1]), d, c[2]), d, c[3]) * x;
}

template <typename Real>
void expect_plain(Real x) {
  ASSERT_EQ(erfinv_wrapper(x), plain_erfinv(x)) << x;
  ASSERT_EQ(erfinv_wrapper(-x), -plain_erfinv(x)) << x;
}

// Steps of a prime number of floats, so that all mantissas come up; and all of the last octave but
// one of t.
TEST(erfinv_float, is_the_cubic_of_its_segment) {
  std::uint32_t count = 0;
  for (std::uint32_t bits = 1; bits < 0x3F800000u; bits += 1009, ++count) {
    ASSERT_NO_FATAL_FAILURE(expect_plain(sycl::bit_cast<float>(bits)));
  }
  EXPECT_GT(count, 1000000u);
  for (std::uint32_t bits = 0x3F7F0000u; bits <= 0x3F800000u; ++bits) {
    ASSERT_NO_FATAL_FAILURE(expect_plain(sycl::bit_cast<float>(bits)));
  }
}

TEST(erfinv_float, changes_its_cubic_at_every_eighth_of_an_octave) {
  int edges = 0;
  for (int exponent = -24; exponent < 0; ++exponent) {
    for (int eighth = 0; eighth < 8; ++eighth, ++edges) {
      const float edge = 1 - std::ldexp(1 + static_cast<float>(eighth) / 8, exponent);
      for (const float x : {std::nextafter(edge, 0.0f), edge, std::nextafter(edge, 1.0f)}) {
        ASSERT_NO_FATAL_FAILURE(expect_plain(x));
      }
    }
  }
  EXPECT_EQ(edges, table::float_row_count);
}

TEST(erfinv_double, is_the_cubic_of_its_segment) {
  const std::uint64_t one = sycl::bit_cast<std::uint64_t>(1.0);
  int count = 0;
  for (std::uint64_t bits = 1; bits < one; bits += one / 1000003, ++count) {
    ASSERT_NO_FATAL_FAILURE(expect_plain(sycl::bit_cast<double>(bits)));
  }
  for (int i = 0; i < 1000000; ++i) {
    ASSERT_NO_FATAL_FAILURE(expect_plain(static_cast<double>(i) / 1000000));
    ASSERT_NO_FATAL_FAILURE(expect_plain(1 - std::exp(-36.7 * i / 1000000)));
  }
  EXPECT_GE(count, 1000000);
}

TEST(erfinv_double, changes_its_cubic_at_every_sixteenth_of_an_octave) {
  int edges = 0;
  for (int exponent = -53; exponent < 0; ++exponent) {
    for (int sixteenth = 0; sixteenth < 16; ++sixteenth, ++edges) {
      const double edge = 1 - std::ldexp(1 + sixteenth / 16.0, exponent);
      for (const double x : {std::nextafter(edge, 0.0), edge, std::nextafter(edge, 1.0)}) {
        ASSERT_NO_FATAL_FAILURE(expect_plain(x));
      }
    }
  }
  EXPECT_EQ(edges + 1, table::double_row_count);  // and t = 1
}

// The bounds of the cubics with half a unit for each rounding: 1 - |x| in float is exact from 1/2
// on and loses a share of 2^-25 of t below, where the quotient hardly moves.
TEST(erfinv_float, is_the_function_within_the_error_of_the_cubics) {
  for (int i = 1; i < 4000; ++i) {
    for (const float x :
         {static_cast<float>(i) / 4000, 1 - std::exp2(-0.006f * static_cast<float>(i))}) {
      const double expected = boost::math::erf_inv(static_cast<double>(x));
      ASSERT_NEAR(erfinv_wrapper(x) / expected, 1, 3.2e-7) << x;
    }
  }
}

TEST(erfinv_double, is_the_function_within_the_error_of_the_cubics) {
  for (int i = 1; i < 4000; ++i) {
    for (const double x : {i / 4000.0, 1 - std::exp2(-0.0132 * i)}) {
      ASSERT_NEAR(erfinv_wrapper(x) / boost::math::erf_inv(x), 1, 1e-8) << x;
    }
  }
}

// sqrt(pi) / 2 x, but where 1 - |x| is 1 in float 0.1 per cent more: what belongs to |x| = 1/16,
// the other end of the segment, 1 + pi x^2 / 12 + 7 pi^2 x^4 / 480 + ...
TEST(erfinv_float, reads_the_first_cubic_at_its_other_end_where_t_is_one) {
  const double slope = std::sqrt(std::acos(-1.0)) / 2;
  const float* c = table::float_rows[0];
  const float far_end =
      std::fma(std::fma(std::fma(c[3], -0.0625f, c[2]), -0.0625f, c[1]), -0.0625f, c[0]);
  EXPECT_NEAR(far_end / slope, 1.0010249, 2e-7);
  for (const float x : {0x1p-25f, 0x1p-26f, 0x1.8p-40f, std::numeric_limits<float>::min()}) {
    EXPECT_EQ(erfinv_wrapper(x), far_end * x);
    EXPECT_EQ(erfinv_wrapper(-x), -far_end * x);
  }
  for (const float x : {0x1p-24f, std::nextafter(0x1p-25f, 1.0f)}) {  // t is the float before 1
    EXPECT_NEAR(erfinv_wrapper(x) / (slope * x), 1, 1.4e-7);
  }
}

TEST(erfinv_float, has_values_at_the_ends_and_at_zero) {
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(erfinv_wrapper(1.0f)), 0x407547CBu);
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(erfinv_wrapper(-1.0f)), 0xC07547CBu);
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(erfinv_wrapper(0.0f)), 0u);
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(erfinv_wrapper(-0.0f)), 0x80000000u);
  EXPECT_TRUE(std::isnan(erfinv_wrapper(std::numeric_limits<float>::quiet_NaN())));
  EXPECT_EQ(erfinv_wrapper(std::numeric_limits<float>::infinity()),
            std::numeric_limits<float>::infinity());
}

template <typename Real>
struct erfinv_of_each {
  const Real* x;
  Real* result;

  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { result[i] = erfinv_wrapper(x[i]); }
};

/// The function of each argument, as a kernel gives it.
template <typename Real>
void expect_same_on_a_device(sycl::queue queue, const std::vector<Real>& arguments) {
  const std::size_t size = arguments.size();
  const tarn_test::results<Real> x(queue, size);
  const tarn_test::results<Real> result(queue, size);
  std::copy(arguments.begin(), arguments.end(), x.get());
  queue
      .submit([&](sycl::handler& group) {
        group.parallel_for(sycl::range<1>(size), erfinv_of_each<Real>{x.get(), result.get()});
      })
      .wait_and_throw();
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_TRUE(tarn_test::same_bits(result.get()[i], erfinv_wrapper(arguments[i])))
        << result.get()[i] << " for " << arguments[i];
  }
}

class erfinv_on_devices : public tarn_test::over_queues {};
TARN_OVER_QUEUES(erfinv_on_devices);
TARN_REPORTS_CUDA(erfinv_on_devices)

TEST_P(erfinv_on_devices, has_the_same_bits) {
  std::vector<float> floats = {0.0f, -0.0f, 1.0f, -1.0f};
  for (std::uint32_t bits = 1; bits < 0x3F800000u; bits += 10007) {
    floats.push_back(sycl::bit_cast<float>(bits));
    floats.push_back(-floats.back());
  }
  expect_same_on_a_device(queue(), floats);
  std::vector<double> doubles = {0.0, -0.0, 1.0, -1.0};
  for (int i = 0; i < 100000; ++i) {
    doubles.push_back(static_cast<double>(i) / 100000);
    doubles.push_back(std::exp(-36.7 * i / 100000) - 1);
  }
  expect_same_on_a_device(queue(), doubles);
}

TEST(erfinv_double, has_values_at_the_ends_and_at_zero_and_none_beyond) {
  const double infinity = std::numeric_limits<double>::infinity();
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(erfinv_wrapper(1.0)), 0x4017744F8F74E94Au);
  EXPECT_EQ(erfinv_wrapper(-1.0), -5.8635847487551676);
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(erfinv_wrapper(0.0)), 0u);
  EXPECT_TRUE(std::signbit(erfinv_wrapper(-0.0)));
  EXPECT_EQ(erfinv_wrapper(-0.0), 0.0);
  for (const double x :
       {std::nextafter(1.0, 2.0), 1.5, infinity, std::numeric_limits<double>::quiet_NaN()}) {
    EXPECT_TRUE(std::isnan(erfinv_wrapper(x))) << x;
    EXPECT_TRUE(std::isnan(erfinv_wrapper(-x))) << x;
  }
}

}  // namespace
