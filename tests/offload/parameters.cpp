// SPDX-License-Identifier: Apache-2.0
// Methods and parameters that the entries do not take: -3, whatever else is wrong with the call,
// and before the offload runtime is asked anything.
#include <cstdint>
#include <set>
#include <string>

#include "parameter_rows.hpp"
#include "refusal.hpp"

namespace {

using namespace tarn_test;

constexpr std::int64_t philox = RVX_BRNG_PHILOX4X32X10;

int calls_of_the_runtime() {
  return omptarget::calls("__tgt_get_interop_property") + omptarget::calls("omp_get_interop_int") +
         omptarget::calls("omp_get_interop_ptr") + omptarget::calls("omp_get_interop_str");
}

/// Makes the calls of a walk over the rows.
class caller {
 public:
  template <typename Entries, typename... Argument>
  void refused(std::int64_t method, Argument... argument) {
    expect<Entries>(-3, method, argument...);
    ++refused_calls;
  }
  template <typename Entries, typename... Argument>
  void taken(std::int64_t method, Argument... argument) {
    expect<Entries>(0, method, argument...);
    routines.insert(Entries::routine);
  }

  int refused_calls = 0;
  std::set<std::string> routines;  // with a call that was taken

 private:
  template <typename Entries, typename... Argument>
  void expect(int status, std::int64_t method, Argument... argument) {
    std::string text = std::string(Entries::routine) + ", " + std::to_string(method);
    if constexpr ((std::is_arithmetic_v<Argument> && ...)) {
      ((text += ", " + std::to_string(argument)), ...);
    }
    using value = typename Entries::value;
    Entries::each([&](const char* form, auto entry) {
      const int before = calls_of_the_runtime();
      EXPECT_EQ(status_of<value>(entry, method, stream_, interop_.handle(), argument...), status)
          << text << ", " << form;
      EXPECT_EQ(calls_of_the_runtime() != before, status == 0) << text << ", " << form;
      if (status != 0) {
        const rvx_stream no_stream = nullptr;
        void* const no_interop = nullptr;
        value* const no_results = nullptr;
        EXPECT_EQ(call(entry, method, no_stream, few, no_results, argument..., no_interop), status)
            << text << ", " << form << ", all else is wrong, too";
      }
    });
  }

  const caller_stream stream_{philox, {20261}};
  const gpu_interop interop_{common_queue()};
};

TEST(offload_parameters, are_refused_before_all_else_or_taken) {
  caller all;
  testing::internal::CaptureStderr();
  for_every_parameter_row(all);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "nothing is told";
  EXPECT_EQ(all.routines.size(), 38u) << "every routine has a row";
  EXPECT_GT(all.refused_calls, 300);
}

// 64-bit integers that 32 bits do not hold are not cut.
template <typename Entries, typename... Argument>
int wide_status(std::int64_t method, Argument... argument) {
  const caller_stream stream(philox, {20261});
  const gpu_interop interop(common_queue());
  int status = -77;
  Entries::each([&](const std::string&, auto entry) {
    if constexpr (is_ilp64<decltype(entry)>) {
      const int mine =
          status_of<typename Entries::value>(entry, method, stream, interop.handle(), argument...);
      EXPECT_TRUE(status == -77 || status == mine);
      status = mine;
    }
  });
  return status;
}

TEST(offload_parameters, of_64_bits_that_do_not_fit_are_refused) {
  using namespace offload;
  constexpr std::int64_t wrap = std::int64_t{1} << 32;
  constexpr std::int64_t most = INT32_MAX;
  constexpr std::int64_t least = INT32_MIN;
  static const double numbers[] = {1.0, 2.0};
  EXPECT_EQ(wide_status<vsUniform>(wrap, 0, 1), -3);
  EXPECT_EQ(wide_status<vdUniform>(wrap + accuracy, 0, 1), -3);
  EXPECT_EQ(wide_status<vdGaussian>(wrap + 1, 0, 1), -3);
  EXPECT_EQ(wide_status<vdGaussianMV>(wrap, 1, 0, numbers, numbers), -3);
  EXPECT_EQ(wide_status<viUniformBits>(wrap), -3);
  EXPECT_EQ(wide_status<viPoisson>(wrap + 1, 2.5), -3);
  EXPECT_EQ(wide_status<viUniform>(0, std::int64_t{0}, most), 0);
  EXPECT_EQ(wide_status<viUniform>(0, least, std::int64_t{5}), 0);
  EXPECT_EQ(wide_status<viUniform>(0, std::int64_t{0}, most + 1), -3);
  EXPECT_EQ(wide_status<viUniform>(0, least - 1, std::int64_t{5}), -3);
  EXPECT_EQ(wide_status<viUniform>(0, wrap, wrap + 9), -3);
  EXPECT_EQ(wide_status<vsChiSquare>(0, wrap + 4), -3);
  EXPECT_EQ(wide_status<viBinomial>(0, wrap + 9, 0.5), -3);
  EXPECT_EQ(wide_status<viHypergeometric>(0, wrap + 9, std::int64_t{3}, std::int64_t{2}), -3);
  EXPECT_EQ(wide_status<viHypergeometric>(0, std::int64_t{9}, wrap + 3, std::int64_t{2}), -3);
  EXPECT_EQ(wide_status<viHypergeometric>(0, wrap + 9, wrap + 3, wrap + 2), -3);
  EXPECT_EQ(wide_status<viMultinomial>(0, wrap, std::int64_t{1}, numbers), -3);
  EXPECT_EQ(wide_status<viMultinomial>(0, std::int64_t{0}, wrap + 1, numbers), -3);
  EXPECT_EQ(wide_status<vdGaussianMV>(0, wrap + 1, std::int64_t{0}, numbers, numbers), -3);
  EXPECT_EQ(wide_status<vdGaussianMV>(0, std::int64_t{1}, wrap, numbers, numbers), -3);
}

}  // namespace
