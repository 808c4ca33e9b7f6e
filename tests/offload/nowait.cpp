// SPDX-License-Identifier: Apache-2.0
// Calls that are not waited for: the entry returns with the stream moved while no kernel has run
// yet, and the completion function is told once, from another thread, when the results are there.
#include <algorithm>
#include <memory>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "completions.hpp"
#include "drawn.hpp"
#include "engines.hpp"

namespace {

using namespace tarn_test;

/// An interop object of a call that is not waited for.
class nowait_interop : public gpu_interop {
 public:
  explicit nowait_interop(const sycl::queue& queue, std::intptr_t id = sycl_id)
      : gpu_interop(queue, id) {
    set_nowait(true);
    set_completion(completions::note);
  }
};

/// Queues of their own live as long as the process, as their handles have to.
sycl::queue& new_queue(const sycl::property_list& properties = {}) {
  static auto* const all = new std::vector<sycl::queue*>;
  all->push_back(new sycl::queue(sycl::gpu_selector_v, properties));
  return *all->back();
}

class offload_nowait : public testing::Test {
 protected:
  void TearDown() override {
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  static void expect_told(void* interop) {
    const auto told = completions::all().take(1);
    ASSERT_EQ(told.size(), 1u);
    EXPECT_EQ(told[0].interop, interop);
    EXPECT_NE(told[0].thread, std::this_thread::get_id());
  }
};

// What stands in front in an in-order queue keeps the kernels back.
template <typename Engine>
class offload_nowait_of : public offload_nowait {};
TYPED_TEST_SUITE(offload_nowait_of, offload_engines, offload_engine_name);

TYPED_TEST(offload_nowait_of, returns_before_the_kernels_run) {
  using row = offload_engine<TypeParam>;
  constexpr std::int64_t n = 1000;
  const auto drawn = raw_words(row::stored_words);
  sycl::queue& queue = new_queue(sycl::property::queue::in_order());
  const nowait_interop interop(queue);
  const results<std::uint32_t> out(queue, static_cast<std::size_t>(n * drawn.width));
  for (const std::int64_t first : {0, 5}) {
    std::fill_n(out.get(), n * drawn.width, marker<std::uint32_t>());
    caller_stream stream = row::at(first);
    caller_stream serial(stream);
    gate shut(queue);
    ASSERT_EQ(tarn_rvx_viRngUniformBits_omp_offload_lp64(0, stream, n, out.get(), interop.handle()),
              0);
    const auto expected = serial.words(n, row::stored);
    EXPECT_EQ(stream.image(), serial.image()) << "moved already";
    EXPECT_EQ(stream.words(9, row::stored), serial.words(9, row::stored));
    EXPECT_TRUE(out.untouched());
    EXPECT_EQ(completions::all().count(), 0u);
    shut.open();
    this->expect_told(interop.handle());
    EXPECT_EQ(out.values(), expected);
  }
}

TEST_F(offload_nowait, gives_the_results_of_a_call_that_is_waited_for) {
  const nowait_interop interop(common_queue());
  const gpu_interop waiting(common_queue(), level_zero_id);
  std::set<std::string> routines;
  const auto expect = [&](const auto& drawn) {
    using entries = typename std::decay_t<decltype(drawn)>::entries;
    using value = typename entries::value;
    constexpr std::int64_t n = 20;
    SCOPED_TRACE(text_of(drawn));
    const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
    const caller_stream same(stream);
    const results<value> out(common_queue(), static_cast<std::size_t>(n * drawn.width));
    ASSERT_EQ(drawn.draw(entries::wide, stream, n, out.get(), interop.handle()), 0);
    expect_told(interop.handle());
    EXPECT_EQ(out.values(), draw_wide(drawn, same, n, waiting));
    EXPECT_EQ(stream.image(), same.image());
    routines.insert(entries::routine);
  };
  for_every_drawing(20, expect);
  expect(raw_words(1));
  EXPECT_EQ(routines.size(), 38u);
}

TEST_F(offload_nowait, without_a_completion_function_is_waited_for) {
  nowait_interop missing(common_queue());
  missing.fail_native(completion_property, 1);
  nowait_interop null(common_queue());
  null.set_native(completion_property, nullptr);
  for (const omptarget::interop* const interop : {&missing, &null}) {
    const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
    caller_stream serial(stream);
    EXPECT_EQ(draw_wide(raw_words(1), stream, 100000, *interop), serial.words(100000));
    EXPECT_EQ(stream.image(), serial.image());
  }
}

TEST_F(offload_nowait, calls_of_no_results_are_told_of_as_well) {
  const nowait_interop interop(common_queue());
  const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  const auto before = stream.image();
  EXPECT_EQ(tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, 0, nullptr, 0, 1, interop.handle()),
            0);
  expect_told(interop.handle());
  EXPECT_EQ(stream.image(), before);
}

// Nobody is told of a call that was refused: its status says all.
TEST_F(offload_nowait, refused_calls_are_not_told_of) {
  const nowait_interop interop(common_queue());
  const nowait_interop other(common_queue(), 1);
  const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  const caller_stream host_only(RVX_BRNG_ARS5, {5});
  float r = -1;
  std::int32_t k = -1;
  testing::internal::CaptureStderr();
  EXPECT_EQ(tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, 1, &r, 1, 1, interop.handle()), -3);
  EXPECT_EQ(tarn_rvx_vsRngUniform_omp_offload_lp64(0, host_only, 1, &r, 0, 1, interop.handle()),
            -1014);
  EXPECT_EQ(tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, 1, &r, 0, 1, other.handle()), -1);
  EXPECT_EQ(tarn_rvx_viRngGeometric_omp_offload_lp64(0, stream, 1, &k, 0.0, interop.handle()), -2);
  testing::internal::GetCapturedStderr();
  // A call behind them is told of, and is the only one.
  const results<float> out(common_queue(), 8);
  ASSERT_EQ(tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, 8, out.get(), 0, 1, interop.handle()),
            0);
  expect_told(interop.handle());
  EXPECT_EQ(r, -1);
  EXPECT_EQ(k, -1);
}

TEST_F(offload_nowait, many_calls_in_flight_are_each_told_of_once) {
  constexpr std::int64_t n = 1000;
  constexpr std::size_t calls = 40;
  std::vector<std::unique_ptr<nowait_interop>> interops;
  std::set<void*> handles;
  const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  caller_stream serial(stream);
  const results<std::uint32_t> out(common_queue(), calls * n);
  for (std::size_t i = 0; i < calls; ++i) {
    interops.push_back(std::make_unique<nowait_interop>(common_queue()));
    handles.insert(interops.back()->handle());
    ASSERT_EQ(tarn_rvx_viRngUniformBits_omp_offload_lp64(0, stream, n, out.get() + i * n,
                                                         interops.back()->handle()),
              0);
  }
  std::set<void*> told;
  for (const auto& one : completions::all().take(calls)) {
    told.insert(one.interop);
  }
  EXPECT_EQ(told, handles);
  EXPECT_EQ(out.values(), serial.words(calls * n));
}

}  // namespace
