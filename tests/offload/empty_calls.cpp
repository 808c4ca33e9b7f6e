// SPDX-License-Identifier: Apache-2.0
// Calls for no results of every routine, waited for and not, on engines whose state lies on the
// device and on one whose state travels; and calls for fewer than none, of every engine.
#include <cstdint>
#include <limits>
#include <set>
#include <string>

#include "completions.hpp"
#include "drawings.hpp"
#include "engines.hpp"
#include "gpu_interop.hpp"
#include "refusal.hpp"

namespace {

using namespace tarn_test;
namespace rng = kestrel::tarn::rng;

template <typename Engine>
class offload_empty_calls : public testing::Test {
 protected:
  using row = offload_engine<Engine>;

  offload_empty_calls() { interop_.set_completion(completions::note); }
  void TearDown() override {
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  /// Calls of all entries without a place for results; each but those of `told` = 0 tells once.
  template <typename Drawing>
  void expect_nothing(const Drawing& drawn, std::size_t told) {
    typename Drawing::value* const nowhere = nullptr;
    Drawing::entries::each([&](const char* form, auto entry) {
      EXPECT_EQ(drawn.draw(entry, stream_, 0, nowhere, interop_.handle()), 0)
          << Drawing::entries::routine << ", " << drawn.method << ", " << form;
      EXPECT_EQ(completions::all().take(told).size(), told);
      EXPECT_EQ(stream_.image(), before_);
    });
    routines_.insert(Drawing::entries::routine);
  }

  gpu_interop interop_{common_queue()};
  const caller_stream stream_ = row::at(5);
  const std::vector<std::uint8_t> before_ = stream_.image();
  std::set<std::string> routines_;
};
using some_engines = testing::Types<rng::mt19937, rng::sobol, rng::philox4x32x10>;
TYPED_TEST_SUITE(offload_empty_calls, some_engines, offload_engine_name);

TYPED_TEST(offload_empty_calls, do_nothing_and_are_told_of_where_nobody_waits) {
  const double* const no_rates = nullptr;
  testing::internal::CaptureStderr();
  for (const bool nowait : {false, true}) {
    this->interop_.set_nowait(nowait);
    const auto expect = [&](const auto& drawn) { this->expect_nothing(drawn, nowait ? 1 : 0); };
    for_every_drawing(1, expect);
    expect(raw_words(1));
    expect(drawing_of<offload::viPoissonV>(0, taken::one_word, rng::poisson_v<>({1.0}), no_rates));
  }
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
  EXPECT_EQ(this->routines_.size(), 38u);
}

/// A call for `n` < 0 results: -2, told in one line, and nothing else.
template <typename Entry>
void expect_refusal(Entry entry, const caller_stream& stream, std::int64_t n,
                    const gpu_interop& interop) {
  const auto before = stream.image();
  const results<std::uint32_t> out(common_queue(), 16);
  testing::internal::CaptureStderr();
  EXPECT_EQ(call(entry, 0, static_cast<rvx_stream>(stream), n, out.get() + 8, interop.handle()),
            -2);
  const std::string told = testing::internal::GetCapturedStderr();
  EXPECT_EQ(told.find("Tarn RNG: kestrel::tarn::exception: what: "), 0u) << told;
  EXPECT_EQ(told.find('\n') + 1, told.size()) << told;
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(stream.image(), before);
}

template <typename Engine>
class offload_negative_calls : public testing::Test {};
TYPED_TEST_SUITE(offload_negative_calls, offload_engines, offload_engine_name);

TYPED_TEST(offload_negative_calls, are_minus_2_in_every_form) {
  using row = offload_engine<TypeParam>;
  const gpu_interop interop(common_queue());
  int calls = 0;
  for (const std::int64_t first : row::places()) {
    const caller_stream stream = row::at(first);
    offload::viUniformBits::each([&](const char*, auto entry) {
      using integer = typename integer_of<decltype(entry)>::type;
      for (const integer n : {integer{-1}, integer{-2}, std::numeric_limits<integer>::min()}) {
        expect_refusal(entry, stream, n, interop);
        ++calls;
      }
    });
  }
  EXPECT_EQ(calls, static_cast<int>(12 * row::places().size()));
}

// 2^62 vectors of two numbers are more than 64 bits can count, also where each number is one word.
TYPED_TEST(offload_negative_calls, and_counts_whose_values_cannot_be_counted_are_minus_2) {
  using row = offload_engine<TypeParam>;
  const gpu_interop interop(common_queue());
  const caller_stream stream = row::at(3);
  const auto before = stream.image();
  const double mean[] = {0, 0};
  const double factor[] = {1, 1};
  const results<double> out(common_queue(), 16);
  for (const std::int64_t n : {std::int64_t{1} << 62, std::numeric_limits<std::int64_t>::max()}) {
    for (const std::int64_t method : {0, 1, 2}) {
      testing::internal::CaptureStderr();
      EXPECT_EQ(tarn_rvx_vdRngGaussianMV_omp_offload_ilp64(method, stream, n, out.get(), 2, 2, mean,
                                                           factor, interop.handle()),
                -2);
      EXPECT_NE(testing::internal::GetCapturedStderr(), "");
      EXPECT_TRUE(out.untouched());
      EXPECT_EQ(stream.image(), before);
    }
  }
}

}  // namespace
