// SPDX-License-Identifier: Apache-2.0
// multinomial on GPUs: rows against a serial count of the engine's own uniforms, the parameters
// that need no trials, and those that are refused.
#include <atomic>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <new>
#include <numeric>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/multinomial_gpu_device.hpp"
#include "level_calls.hpp"
#include "message.hpp"

/// Memory that the next allocation of `placed_size` bytes is given, and that nobody frees here: a
/// vector of it lies where a device can use it.
static std::atomic<void*> placed{nullptr};
static std::atomic<std::size_t> placed_size{0};

void* operator new(std::size_t size) {
  if (size != 0 && size == placed_size) {
    placed_size = 0;
    return placed;
  }
  if (void* memory = std::malloc(size != 0 ? size : 1)) {
    return memory;
  }
  throw std::bad_alloc();
}
void operator delete(void* memory) noexcept {
  if (memory != placed) {
    std::free(memory);
  }
}
void operator delete(void* memory, std::size_t) noexcept {
  operator delete(memory);
}

namespace {

namespace rng = kestrel::tarn::rng;
using tarn_test::both_forms;
using tarn_test::cpu_queue;
using tarn_test::device_type;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::engine_case;
using tarn_test::gpu_queue;
using tarn_test::output_form;
using counts = std::vector<std::int32_t>;

/// `k` probabilities, no two neighbours alike, every fifth of them 0.
std::vector<double> uneven(std::size_t k) {
  std::vector<double> p(k);
  for (std::size_t j = 0; j < k; ++j) {
    p[j] = static_cast<double>(j % 5 * (1 + j % 7));
  }
  const double sum = std::accumulate(p.begin(), p.end(), 0.0);
  for (double& value : p) {
    value /= sum;
  }
  return p;
}

/// The category of `u`: the first of the stretches between neighbours of `sums` that it lies in, or
/// one past the last.
std::size_t model_category(float u, const std::vector<float>& sums) {
  std::size_t j = 0;
  while (j + 1 < sums.size() && !(u > sums[j] && u <= sums[j + 1])) {
    ++j;
  }
  return j;
}

counts model(const std::vector<float>& u, std::size_t ntrial, const std::vector<double>& p) {
  const std::size_t k = p.size();
  std::vector<float> sums{0.0f};
  for (const double value : p) {
    sums.push_back(sums.back() + static_cast<float>(value));
  }
  counts rows(u.size() / ntrial * k, 0);
  for (std::size_t i = 0; i < u.size(); ++i) {
    const std::size_t category = model_category(u[i], sums);
    if (category < k) {
      ++rows[i / ntrial * k + category];
    }
  }
  return rows;
}

template <typename IntType>
counts as_counts(const std::vector<IntType>& values) {
  return counts(values.begin(), values.end());
}

struct shape {
  std::int32_t ntrial;
  std::size_t k;
};

template <typename Case>
class multinomial_on : public testing::Test {};
TYPED_TEST_SUITE(multinomial_on, tarn_test::device_cases, tarn_test::case_name);
TARN_REPORTS_CUDA(multinomial_on)

/// One call on an engine of its own, and where it leaves the engine.
template <typename Case, typename IntType>
void expect_model(output_form form, std::int64_t n, const shape& of, const counts& expected) {
  const rng::multinomial<IntType> distr(of.ntrial, uneven(of.k));
  auto engine = Case::make(gpu_queue());
  const auto drawn = draw_at_level(form, distr, engine, n, expected.size());
  ASSERT_EQ(as_counts(drawn.values), expected) << n << " rows of " << of.k;
  ASSERT_EQ(drawn.consumed, n * of.ntrial);
  tarn_test::expect_next<Case>(engine, drawn.consumed, 5);
}

TYPED_TEST(multinomial_on, counts_the_uniforms_of_the_engine) {
  for (const shape& of :
       {shape{1, 16}, shape{1, 17}, shape{2, 32}, shape{3, 301}, shape{16, 256}, shape{16, 1000}}) {
    for (const std::int64_t n : {0, 1, 3, 37, 1001}) {
      auto host = TypeParam::make(cpu_queue());
      const auto trials = draw(rng::uniform<float>(0.0f, 1.0f), host, n * of.ntrial);
      const counts expected = model(trials, static_cast<std::size_t>(of.ntrial), uneven(of.k));
      for (const output_form form : both_forms) {
        expect_model<TypeParam, std::int32_t>(form, n, of, expected);
        expect_model<TypeParam, std::uint32_t>(form, n, of, expected);
      }
    }
  }
}

// Without an index mt2203 has as many generators as the device has compute units.
TEST(multinomial_on_a_gpu, counts_what_a_family_of_generators_draws) {
  const std::vector<double> p = uneven(64);
  rng::mt2203 family(gpu_queue(), 7);
  rng::mt2203 same(gpu_queue(), 7);
  const auto trials = draw(rng::uniform<float>(), family, 4 * 501);
  const auto rows = draw(rng::multinomial<>(4, p), same, 501, 64);
  EXPECT_EQ(rows, model(trials, 4, p));
}

TEST(multinomial_on_a_gpu, goes_through_generate_in_both_forms) {
  const std::vector<double> p = uneven(48);
  rng::philox4x32x10 host(cpu_queue(), 7);
  rng::philox4x32x10 engine(gpu_queue(), 7);
  rng::philox4x32x10 same(gpu_queue(), 7);
  const counts expected = model(draw(rng::uniform<float>(), host, 3 * 77), 3, p);
  EXPECT_EQ(draw(rng::multinomial<>(3, p), engine, 77, 48), expected);
  EXPECT_EQ(tarn_test::draw_into_buffer(rng::multinomial<>(3, p), same, 77, 48), expected);
}

TEST(multinomial_on_a_gpu, rows_sum_to_the_trials_that_found_a_category) {
  std::vector<double> p = uneven(64);
  for (double& value : p) {
    value /= 2;  // half of the trials lie above the last sum
  }
  rng::philox4x32x10 engine(gpu_queue(), 7);
  const auto rows = draw(rng::multinomial<>(4, p), engine, 1000, 64);
  const int total = std::accumulate(rows.begin(), rows.end(), 0);
  EXPECT_NEAR(total, 2000, 200);  // over six times the deviation, sqrt(4000) / 2
}

// The two ways past the check: no trials, and one category. They draw nothing.
template <typename IntType>
void expect_filled(std::int32_t ntrial, const std::vector<double>& p, std::int64_t n,
                   IntType value) {
  using Case = engine_case<rng::mt19937, device_type::gpu>;
  for (const output_form form : both_forms) {
    auto engine = Case::make(gpu_queue());
    const auto size = static_cast<std::size_t>(n) * p.size();
    const auto drawn = draw_at_level(form, rng::multinomial<IntType>(ntrial, p), engine, n, size);
    std::vector<IntType> expected(size, tarn_test::marker<IntType>());
    std::fill_n(expected.begin(), n, value);
    EXPECT_EQ(drawn.values, expected) << ntrial << " in " << p.size() << " categories, " << n;
    EXPECT_EQ(drawn.consumed, 0);
    tarn_test::expect_next<Case>(engine, 0, 5);
  }
}

// Not n * k: the rest of the rows keeps what it held.
TEST(multinomial_on_a_gpu, no_trials_fill_as_many_elements_as_rows) {
  for (const std::int64_t n : {0, 1, 10, 1001}) {
    expect_filled<std::int32_t>(0, {0.125, 0.375, 0.5}, n, 0);
    expect_filled<std::uint32_t>(0, uneven(64), n, 0);
    expect_filled<std::int32_t>(0, {1.0}, n, 0);
  }
}

TEST(multinomial_on_a_gpu, one_category_takes_all_trials_however_many) {
  for (const std::int32_t ntrial : {1, 16, 17, 1000000, std::numeric_limits<std::int32_t>::max()}) {
    for (const std::int64_t n : {0, 1, 10, 1001}) {
      expect_filled<std::int32_t>(ntrial, {1.0}, n, ntrial);
      expect_filled<std::uint32_t>(ntrial, {0.25}, n, static_cast<std::uint32_t>(ntrial));
    }
  }
}

void expect_refused(std::int32_t ntrial, std::size_t k) {
  const std::string text =
      "kestrel::tarn::rng::multinomial: invalid argument: these parameters are not supported on "
      "GPU";
  using Case = engine_case<rng::philox4x32x10, device_type::gpu>;
  auto engine = Case::make(gpu_queue());
  const rng::multinomial<> distr(ntrial, uneven(k));
  const tarn_test::results<std::int32_t> memory(engine.get_queue(), 3 * k + 3);
  sycl::buffer<std::int32_t, 1> buffer{sycl::range<1>(3 * k + 3)};
  for (const std::int64_t n : {0, 3}) {
    EXPECT_EQ(tarn_test::message_of<kestrel::tarn::invalid_argument>(
                  [&] { rng::generate(distr, engine, n, memory.get()); }),
              text)
        << ntrial << " in " << k;
    EXPECT_EQ(tarn_test::message_of<kestrel::tarn::invalid_argument>(
                  [&] { rng::generate(distr, engine, n, buffer); }),
              text)
        << ntrial << " in " << k;
  }
  EXPECT_TRUE(memory.untouched());
  tarn_test::expect_next<Case>(engine, 0, 5);
}

TEST(multinomial_on_a_gpu, fewer_than_sixteen_categories_for_a_trial_are_refused) {
  expect_refused(1, 15);
  expect_refused(2, 31);
  expect_refused(16, 255);
  expect_refused(1, 0);
}

TEST(multinomial_on_a_gpu, more_than_sixteen_trials_are_refused_for_any_categories) {
  expect_refused(17, 271);
  expect_refused(17, 272);
  expect_refused(17, 5000);
  expect_refused(std::numeric_limits<std::int32_t>::max(), 5000);
  expect_refused(1 << 28, 5000);  // sixteen times this is 0 in 32 bits
}

TEST(multinomial_on_a_gpu, negative_counts_are_refused) {
  expect_refused(-1, 32);
  expect_refused(-1, 2);
  expect_refused(-1, 1);
  expect_refused(std::numeric_limits<std::int32_t>::min(), 32);
}

/// The categories of three trials before and after the first two of sixteen probabilities, of a
/// half each, became a quarter and three, behind the back of what was made of them.
counts counted_after_a_change(std::vector<double>& p) {
  sycl::queue queue = gpu_queue();
  const std::vector<float> trials{0.2f, 0.3f, 0.6f};
  const sycl::buffer<float, 1> buffer(trials.data(), sycl::range<1>(trials.size()));
  const tarn_test::results<std::int32_t> rows(queue, trials.size() * p.size());
  p[0] = p[1] = 0.5;
  const rng::detail::gpu::category_probabilities probabilities(queue, p, "philox4x32x10");
  p[0] = 0.25;
  p[1] = 0.75;
  probabilities.count(queue, 3, buffer, 1, rows.get(), sycl::event());
  counts categories;
  for (std::size_t i = 0; i < trials.size(); ++i) {
    categories.push_back(rows.get()[i * p.size()] == 1 ? 0 : 1);
    EXPECT_EQ(rows.get()[i * p.size() + 1], categories.back());
  }
  return categories;
}

TEST(multinomial_probabilities, are_copied_unless_the_device_can_use_them) {
  std::vector<double> on_the_heap(16);
  EXPECT_EQ(counted_after_a_change(on_the_heap), (counts{0, 0, 1}));
  const tarn_test::results<double> shared(gpu_queue(), 16);
  placed = shared.get();
  placed_size = 16 * sizeof(double);
  {
    std::vector<double> usable(16);
    ASSERT_EQ(usable.data(), shared.get());
    EXPECT_EQ(counted_after_a_change(usable), (counts{0, 1, 1}));
  }
  placed = nullptr;
}

}  // namespace
