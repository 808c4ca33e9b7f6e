// SPDX-License-Identifier: Apache-2.0
// Composition of messages and the tree of exception classes.
#include <string>
#include <type_traits>

#include <kestrel/tarn/exceptions.hpp>

#include <gtest/gtest.h>

#include "message.hpp"
#include "queues.hpp"

namespace {

namespace tarn = kestrel::tarn;

std::string device_name() {
  return tarn_test::cpu_queue().get_device().get_info<sycl::info::device::name>();
}

TEST(exceptions, empty_parts_leave_out_their_separators) {
  EXPECT_STREQ(tarn::exception("", "", "").what(), "kestrel::tarn");
  EXPECT_STREQ(tarn::exception("rng", "", "").what(), "kestrel::tarn::rng");
  EXPECT_STREQ(tarn::exception("", "f", "").what(), "kestrel::tarn::f");
  EXPECT_STREQ(tarn::exception("", "", "t").what(), "kestrel::tarn: t");
  EXPECT_STREQ(tarn::exception("rng", "f", "t").what(), "kestrel::tarn::rng::f: t");
}

TEST(exceptions, classes_build_in_their_text) {
  EXPECT_STREQ(tarn::invalid_argument("rng", "generate", "n").what(),
               "kestrel::tarn::rng::generate: invalid argument: n");
  EXPECT_STREQ(tarn::invalid_argument("", "", "").what(), "kestrel::tarn: invalid argument");
  EXPECT_STREQ(tarn::computation_error("rng", "skip_ahead", "").what(),
               "kestrel::tarn::rng::skip_ahead: computation error");
  EXPECT_STREQ(tarn::computation_error("rng", "sobol", "generator period is exceeded").what(),
               "kestrel::tarn::rng::sobol: computation error: generator period is exceeded");
  EXPECT_STREQ(tarn::unimplemented("rng", "generate", "x").what(),
               "kestrel::tarn::rng::generate: unimplemented functionality: x");
  EXPECT_STREQ(tarn::unimplemented("rng", "generate", "").what(),
               "kestrel::tarn::rng::generate: unimplemented functionality");
  EXPECT_STREQ(tarn::batch_error("", "").what(), "kestrel::tarn: batch error");
}

TEST(exceptions, device_classes_end_with_the_name_of_the_device) {
  const sycl::device device = tarn_test::cpu_queue().get_device();
  EXPECT_EQ(tarn::unsupported_device("rng", "ars5", device).what(),
            "kestrel::tarn::rng::ars5: unsupported device: " + device_name());
  EXPECT_EQ(tarn::device_bad_alloc("rng", "sobol", device).what(),
            "kestrel::tarn::rng::sobol: cannot allocate memory on " + device_name());
}

TEST(exceptions, two_texts_begin_with_a_blank) {
  EXPECT_STREQ(
      tarn::computation_error("rng", "save_state", " does not support multi-state mt2203").what(),
      "kestrel::tarn::rng::save_state: computation error:  does not support multi-state mt2203");
}

template <typename Class>
constexpr bool is_ours = std::is_base_of_v<tarn::exception, Class>;

TEST(exceptions, every_class_is_a_tarn_exception_and_a_standard_one) {
  static_assert(is_ours<tarn::invalid_argument> && is_ours<tarn::computation_error> &&
                is_ours<tarn::unimplemented> && is_ours<tarn::unsupported_device> &&
                is_ours<tarn::device_bad_alloc> && is_ours<tarn::batch_error>);
  static_assert(std::is_base_of_v<std::exception, tarn::exception>);
  static_assert(std::is_nothrow_copy_constructible_v<tarn::unsupported_device>);
  const tarn::exception copy = tarn::unimplemented("a", "b", "c");
  EXPECT_STREQ(copy.what(), "kestrel::tarn::a::b: unimplemented functionality: c");
}

}  // namespace
