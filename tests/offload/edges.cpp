// SPDX-License-Identifier: Apache-2.0
// Calls at the edges of what is taken, in the order in which an entry looks: the backend and the
// engine before the distribution, the least laws, the flag and the properties of interop objects.
#include <algorithm>
#include <cstdint>
#include <thread>
#include <vector>

#include "completions.hpp"
#include "drawn.hpp"
#include "refusal.hpp"

namespace {

using namespace tarn_test;

constexpr std::int64_t philox = RVX_BRNG_PHILOX4X32X10;

class offload_edges : public testing::Test {
 protected:
  void TearDown() override {
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  /// Draws whole, and as `generate` does.
  template <typename Engine = rng::philox4x32x10, typename Drawing>
  void expect_as_generated(const Drawing& drawn, std::int64_t n) {
    const caller_stream stream(philox, {5});
    auto engine = engine_at<Engine>(stream);
    EXPECT_EQ(draw_wide(drawn, stream, n, interop_),
              draw(drawn.distr, engine, n, static_cast<std::size_t>(drawn.width)))
        << text_of(drawn);
  }

  gpu_interop interop_{common_queue()};
};

// Geometric takes no p = 0, which its constructor finds: a -2, were it asked first.
TEST_F(offload_edges, the_backend_and_the_engine_are_asked_before_the_distribution_is_made) {
  const auto status = [](const caller_stream& stream, const gpu_interop& interop) {
    return status_of<std::int32_t>(&tarn_rvx_viRngGeometric_omp_offload_lp64, 0, stream,
                                   interop.handle(), 0.0);
  };
  const caller_stream served(philox, {5});
  const caller_stream host_only(RVX_BRNG_ARS5, {5});
  const gpu_interop other_backend(common_queue(), 1);
  testing::internal::CaptureStderr();
  EXPECT_EQ(status(host_only, interop_), -1014);
  EXPECT_EQ(status(served, other_backend), -1);
  EXPECT_EQ(status(host_only, other_backend), -1);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
  testing::internal::CaptureStderr();
  EXPECT_EQ(status(served, interop_), -2);
  EXPECT_NE(testing::internal::GetCapturedStderr(), "");
}

// They take no words. Of no trials the first n numbers alone are set to 0, not n rows.
TEST_F(offload_edges, multinomial_of_no_trials_or_one_category) {
  static const double thirds[] = {1.0 / 3, 1.0 / 3, 1.0 / 3};
  static const double sure[] = {1};
  const auto rows = [&](std::int32_t trials, int categories, const double* p) {
    auto drawn = drawing_of<offload::viMultinomial>(
        0, taken::by_parameters, rng::multinomial<>(trials, std::vector<double>(p, p + categories)),
        trials, categories, p);
    drawn.width = categories;
    expect_as_generated(drawn, 40);
    const caller_stream stream(philox, {5});
    const auto before = stream.image();
    const auto values = draw_wide(drawn, stream, 40, interop_);
    EXPECT_EQ(stream.image(), before);
    return values;
  };
  std::vector<std::int32_t> none(120, marker<std::int32_t>());
  std::fill_n(none.begin(), 40, 0);
  EXPECT_EQ(rows(0, 3, thirds), none);
  EXPECT_EQ(rows(9, 1, sure), std::vector<std::int32_t>(40, 9));
}

TEST_F(offload_edges, hypergeometric_laws_of_one_value) {
  const auto values = [&](std::int32_t l, std::int32_t s, std::int32_t m) {
    const auto drawn = drawing_of<offload::viHypergeometric>(
        0, taken::by_parameters, rng::hypergeometric<>(l, s, m), l, s, m);
    const caller_stream stream(philox, {5});
    expect_as_generated(drawn, 40);
    return draw_wide(drawn, stream, 40, interop_);
  };
  EXPECT_EQ(values(50, 50, 20), std::vector<std::int32_t>(40, 20)) << "all are drawn";
  EXPECT_EQ(values(50, 20, 50), std::vector<std::int32_t>(40, 20)) << "all are marked";
  EXPECT_EQ(values(0, 0, 0), std::vector<std::int32_t>(40, 0));
}

template <rng::matrix_layout layout>
auto vectors_of_3(const std::vector<double>& factor) {
  static const std::vector<double> mean = {-1, 2, 0.5};
  auto drawn = drawing_of<offload::vdGaussianMV>(
      2, taken::one_word,
      rng::gaussian_mv<double, layout, rng::gaussian_mv_method::icdf>(3, mean, factor), 3,
      static_cast<int>(layout), mean.data(), factor.data());
  drawn.width = 3;
  return drawn;
}

// In three dimensions the packed factor is longer than the diagonal and shorter than the whole,
// and its order by rows is not that by columns.
TEST_F(offload_edges, vectors_of_three_dimensions) {
  using layout = rng::matrix_layout;
  static const std::vector<double> full = {1.5, 0, 0, 0.5, 0.75, 0, -0.25, 3, 2};
  static const std::vector<double> packed = {1.5, 0.5, -0.25, 0.75, 3, 2};
  static const std::vector<double> diagonal = {1.5, 0.75, 2};
  expect_as_generated(vectors_of_3<layout::full>(full), 100);
  expect_as_generated(vectors_of_3<layout::packed>(packed), 100);
  expect_as_generated(vectors_of_3<layout::diagonal>(diagonal), 100);
}

/// A call on an object that says nowait, however it says it.
void expect_not_waited_for(const gpu_interop& interop) {
  const caller_stream stream(philox, {5});
  caller_stream serial(stream);
  const results<std::uint32_t> out(common_queue(), 3000);
  ASSERT_EQ(
      tarn_rvx_viRngUniformBits_omp_offload_lp64(0, stream, 3000, out.get(), interop.handle()), 0);
  const auto told = completions::all().take(1);
  ASSERT_EQ(told.size(), 1u);
  EXPECT_EQ(told[0].interop, interop.handle());
  EXPECT_NE(told[0].thread, std::this_thread::get_id());
  EXPECT_EQ(out.values(), serial.words(3000));
}

TEST_F(offload_edges, any_bit_of_the_flag_says_nowait) {
  interop_.set_completion(completions::note);
  for (const unsigned bit : {0x80u, 0x02u, 0xFFu}) {
    auto flag = static_cast<unsigned char>(bit);
    interop_.set_native(nowait_property, &flag);
    expect_not_waited_for(interop_);
  }
}

// OpenCL by its number, but not by its queue: there is no native event to have a callback.
TEST_F(offload_edges, a_thread_waits_where_an_opencl_object_has_another_queue) {
  gpu_interop opencl(common_queue(), opencl_id);
  opencl.set_nowait(true);
  opencl.set_completion(completions::note);
  expect_not_waited_for(opencl);
}

// What a call that fails leaves in its outputs is not to be used.
TEST_F(offload_edges, values_of_calls_that_fail_are_not_used) {
  const caller_stream stream(philox, {5});
  caller_stream serial(stream);
  gpu_interop failing(common_queue());
  unsigned char yes = 1;
  failing.set_completion(completions::note);
  failing.fail_native_with(nowait_property, 5, &yes);
  EXPECT_EQ(draw_wide(raw_words(1), stream, 100000, failing), serial.words(100000));
  failing.set_nowait(true);
  failing.fail_native_with(completion_property, 5, reinterpret_cast<void*>(&completions::note));
  EXPECT_EQ(draw_wide(raw_words(1), stream, 100000, failing), serial.words(100000));
  EXPECT_EQ(completions::all().count(), 0u);
  gpu_interop nameless(common_queue());
  nameless.fail_int_with(id_property, 1, sycl_id);
  EXPECT_EQ(status_of<std::uint32_t>(&tarn_rvx_viRngUniformBits_omp_offload_lp64, 0, stream,
                                     nameless.handle()),
            -2);
}

}  // namespace
