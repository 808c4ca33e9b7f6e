// SPDX-License-Identifier: Apache-2.0
// Calls for no results, which do nothing, and for fewer than none, which are refused.
#include <cstdint>
#include <set>
#include <string>

#include "drawings.hpp"
#include "engines.hpp"
#include "gpu_interop.hpp"

namespace {

using namespace tarn_test;

class offload_counts : public testing::Test {
 protected:
  void TearDown() override { EXPECT_EQ(omptarget::mistakes(), 0); }

  /// The status of every entry of a drawing for `n` results without a place for them.
  template <typename Drawing>
  void expect_status(int status, const Drawing& drawn, std::int64_t n) {
    const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
    const auto before = stream.image();
    typename Drawing::value* const nowhere = nullptr;
    Drawing::entries::each([&](const char* form, auto entry) {
      EXPECT_EQ(drawn.draw(entry, stream, n, nowhere, interop_.handle()), status)
          << Drawing::entries::routine << ", " << drawn.method << ", " << form;
      EXPECT_EQ(stream.image(), before);
    });
    routines_.insert(Drawing::entries::routine);
  }

  template <typename Visit>
  void for_every(const Visit& visit) {
    for_every_drawing(1, visit);
    visit(raw_words(1));
    EXPECT_EQ(routines_.size(), 38u);
  }

  const gpu_interop interop_{common_queue()};
  std::set<std::string> routines_;
};

TEST_F(offload_counts, of_0_do_nothing) {
  testing::internal::CaptureStderr();
  for_every([this](const auto& drawn) { expect_status(0, drawn, 0); });
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST_F(offload_counts, of_0_need_no_rates) {
  const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {5});
  const auto before = stream.image();
  const double* const no_rates = nullptr;
  std::int32_t* const nowhere = nullptr;
  int calls = 0;
  offload::viPoissonV::each([&](const char* form, auto entry) {
    EXPECT_EQ(
        call(entry, 0, static_cast<rvx_stream>(stream), 0, nowhere, no_rates, interop_.handle()), 0)
        << form;
    ++calls;
  });
  EXPECT_EQ(calls, 4);
  EXPECT_EQ(stream.image(), before);
}

// Each is told of in one line.
TEST_F(offload_counts, below_0_are_minus_2) {
  testing::internal::CaptureStderr();
  int calls = 0;
  for (const std::int64_t n : {std::int64_t{-1}, std::int64_t{INT32_MIN}}) {
    for_every([&](const auto& drawn) {
      expect_status(-2, drawn, n);
      calls += 4;
    });
  }
  const std::string told = testing::internal::GetCapturedStderr();
  int lines = 0;
  for (std::size_t at = told.find("Tarn RNG: "); at != std::string::npos;
       at = told.find("\nTarn RNG: ", at + 1)) {
    ++lines;
  }
  EXPECT_EQ(lines, calls) << told.substr(0, 1000);
}

template <typename Engine>
class offload_counts_of : public testing::Test {};
TYPED_TEST_SUITE(offload_counts_of, offload_engines, offload_engine_name);

TYPED_TEST(offload_counts_of, of_0_and_below_leave_the_stream_alone) {
  using row = offload_engine<TypeParam>;
  const gpu_interop interop(common_queue());
  for (const std::int64_t first : row::places()) {
    const caller_stream stream = row::at(first);
    const auto before = stream.image();
    EXPECT_EQ(tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, 0, nullptr, interop.handle()),
              0);
    testing::internal::CaptureStderr();
    for (const std::int64_t n : {std::int64_t{-1}, INT64_MIN}) {
      std::uint32_t value = 77;
      EXPECT_EQ(tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, n, &value, interop.handle()),
                -2);
      EXPECT_EQ(value, 77u);
    }
    EXPECT_NE(testing::internal::GetCapturedStderr(), "");
    EXPECT_EQ(stream.image(), before) << first;
  }
}

}  // namespace
