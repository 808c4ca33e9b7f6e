// SPDX-License-Identifier: Apache-2.0
// A process without the OpenMP offload runtime: what a call is refused for at once is told without
// looking for it; other calls give -2, silently, and do nothing.
#include <cstdint>
#include <dlfcn.h>

#include "parameter_rows.hpp"
#include "refusal.hpp"

namespace {

using namespace tarn_test;

class caller {
 public:
  template <typename Entries, typename... Argument>
  void refused(std::int64_t method, Argument... argument) {
    expect<Entries>(-3, method, argument...);
  }
  template <typename Entries, typename... Argument>
  void taken(std::int64_t method, Argument... argument) {
    expect<Entries>(-2, method, argument...);
  }

  int calls = 0;

 private:
  template <typename Entries, typename... Argument>
  void expect(int status, std::int64_t method, Argument... argument) {
    Entries::each([&](const char* form, auto entry) {
      ++calls;
      EXPECT_EQ(status_of<typename Entries::value>(entry, method, stream_, &interop_, argument...),
                status)
          << Entries::routine << ", " << method << ", " << form;
    });
  }

  const caller_stream stream_{RVX_BRNG_PHILOX4X32X10, {20261}};
  int interop_ = 0;  // never looked at
};

TEST(offload_without_a_runtime, serves_no_call_and_says_nothing) {
  ASSERT_EQ(dlopen("libomptarget.so", RTLD_NOW), nullptr) << "the environment has a runtime";
  caller all;
  testing::internal::CaptureStderr();
  testing::internal::CaptureStdout();
  for_every_parameter_row(all);
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
  EXPECT_GT(all.calls, 4 * 400);
}

// Which engine a stream has is only asked later.
TEST(offload_without_a_runtime, comes_before_the_engine) {
  const caller_stream host_only(RVX_BRNG_R250, {5});
  int interop = 0;
  EXPECT_EQ(
      status_of<std::uint32_t>(&tarn_rvx_viRngUniformBits_omp_offload_lp64, 0, host_only, &interop),
      -2);
}

}  // namespace
