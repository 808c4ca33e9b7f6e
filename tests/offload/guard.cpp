// SPDX-License-Identifier: Apache-2.0
// The guard around an entry: each kind of exception has a line on standard error, word for word.
#include "offload/guard.hpp"

#include <stdexcept>
#include <string>

#include <kestrel/tarn/exceptions.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

using kestrel::tarn::rng::detail::openmp::guarded;

/// What is told when a guarded call throws, which has to give -2.
template <typename Exception>
std::string told_of(const Exception& exception) {
  testing::internal::CaptureStderr();
  EXPECT_EQ(guarded([&]() -> int { throw exception; }), -2);
  return testing::internal::GetCapturedStderr();
}

TEST(offload_guard, tells_of_the_librarys_exceptions) {
  EXPECT_EQ(told_of(kestrel::tarn::invalid_argument("rng", "gamma", "alpha <= 0")),
            "Tarn RNG: kestrel::tarn::exception: what: "
            "kestrel::tarn::rng::gamma: invalid argument: alpha <= 0\n");
}

TEST(offload_guard, tells_of_those_of_sycl_with_a_space_before_the_end) {
  EXPECT_EQ(told_of(sycl::exception(sycl::make_error_code(sycl::errc::runtime), "no such device")),
            "Tarn RNG: sycl::exception what: no such device \n");
}

TEST(offload_guard, tells_of_those_of_the_standard) {
  EXPECT_EQ(told_of(std::runtime_error("out of luck")),
            "Tarn RNG: std::exception what: out of luck\n");
  EXPECT_EQ(told_of(std::bad_alloc()), "Tarn RNG: std::exception what: std::bad_alloc\n");
}

TEST(offload_guard, tells_that_there_was_another_one) {
  EXPECT_EQ(told_of(42), "Tarn RNG: unknown exception occured during Lumen call\n");
}

TEST(offload_guard, takes_percent_signs_as_they_are) {
  EXPECT_EQ(told_of(std::runtime_error("100%s %d%n")),
            "Tarn RNG: std::exception what: 100%s %d%n\n");
}

TEST(offload_guard, passes_results_on_in_silence) {
  testing::internal::CaptureStderr();
  for (const int status : {0, -1, -2, -1014}) {
    EXPECT_EQ(guarded([&] { return status; }), status);
  }
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

}  // namespace
