// SPDX-License-Identifier: Apache-2.0
// The kernel of multinomial by itself: which trial counts for which category.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/multinomial_gpu_device.hpp"
#include "in_flight.hpp"
#include "queues.hpp"

namespace {

using tarn_test::gpu_queue;
using counts = std::vector<std::int32_t>;
namespace rng = kestrel::tarn::rng;

/// The kernel by itself, on trials of the caller, with probabilities of type P on the device.
template <typename P>
counts counted(const std::vector<float>& trials, std::int32_t ntrial,
               const std::vector<double>& p) {
  sycl::queue queue = gpu_queue();
  const auto n = static_cast<std::int64_t>(trials.size()) / ntrial;
  const tarn_test::results<P> on_device(queue, p.size());
  for (std::size_t j = 0; j < p.size(); ++j) {
    on_device.get()[j] = static_cast<P>(p[j]);
  }
  const tarn_test::results<std::int32_t> rows(queue, static_cast<std::size_t>(n) * p.size());
  const sycl::buffer<float, 1> buffer(trials.data(), sycl::range<1>(trials.size()));
  queue
      .submit([&](sycl::handler& group) {
        rng::detail::gpu::submit_multinomial_naive_add<std::int32_t>(
            group, n, buffer, static_cast<std::int32_t>(p.size()), ntrial,
            static_cast<const P*>(on_device.get()), rows.get(), sycl::event());
      })
      .wait_and_throw();
  return rows.values();
}

/// Rows of one trial each, as the category of each trial.
void expect_categories(const std::vector<float>& trials, const std::vector<double>& p,
                       const std::vector<std::size_t>& categories) {
  counts expected(trials.size() * p.size(), 0);
  for (std::size_t i = 0; i < trials.size(); ++i) {
    if (categories[i] < p.size()) {
      expected[i * p.size() + categories[i]] = 1;
    }
  }
  EXPECT_EQ(counted<float>(trials, 1, p), expected);
  EXPECT_EQ(counted<double>(trials, 1, p), expected);
}

TEST(multinomial_kernel, stretches_are_open_below_and_closed_above) {
  constexpr float least = std::numeric_limits<float>::denorm_min();
  expect_categories({0.0f, least, 0.25f, std::nextafter(0.25f, 1.0f), 0.75f, 1.0f},
                    {0.25, 0.5, 0.25}, {3, 0, 0, 1, 1, 2});
}

TEST(multinomial_kernel, what_lies_in_no_stretch_is_not_counted) {
  constexpr float nan = std::numeric_limits<float>::quiet_NaN();
  expect_categories({0.0f, -0.0f, -0.5f, std::nextafter(1.0f, 2.0f), nan}, {0.25, 0.5, 0.25},
                    {3, 3, 3, 3, 3});
  expect_categories({0.99f}, {0.25, 0.5}, {2});
}

TEST(multinomial_kernel, categories_of_probability_0_are_never_counted) {
  expect_categories({1e-30f, 0.5f, 0.6f, 1.0f}, {0, 0.5, 0, 0, 0.5, 0}, {1, 1, 4, 4});
}

TEST(multinomial_kernel, no_category_is_found_from_a_probability_on_that_is_no_number) {
  constexpr double nan = std::numeric_limits<double>::quiet_NaN();
  expect_categories({0.1f, 0.3f, 0.9f}, {0.25, nan, 0.5}, {0, 3, 3});
}

// A hundred times 0.01: sums in double would put some of these trials into the next category.
TEST(multinomial_kernel, sums_are_of_floats_for_either_type_of_the_probabilities) {
  const std::vector<double> p(100, 0.01);
  std::vector<float> trials;
  std::vector<std::size_t> categories;
  float sum = 0;
  double wide_sum = 0;
  int parted = 0;
  for (std::size_t j = 0; j < p.size(); ++j) {
    sum += static_cast<float>(p[j]);
    wide_sum += p[j];
    trials.push_back(sum);
    categories.push_back(j);
    parted += static_cast<double>(sum) > wide_sum ? 1 : 0;
  }
  EXPECT_GT(parted, 0);
  expect_categories(trials, p, categories);
}

TEST(multinomial_kernel, trials_of_a_row_stand_together) {
  const std::vector<float> trials{0.1f, 0.2f, 0.9f, 0.3f, 0.3f, 0.0f};
  const counts expected{2, 0, 1, 0, 2, 0};
  EXPECT_EQ(counted<float>(trials, 3, {0.25, 0.5, 0.25}), expected);
  EXPECT_EQ(counted<double>(trials, 3, {0.25, 0.5, 0.25}), expected);
}

}  // namespace
