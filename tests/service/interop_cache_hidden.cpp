// SPDX-License-Identifier: Apache-2.0
// A device that its driver has and SYCL does not show: here LUMEN_BACKENDS leaves Level Zero out.
#include "interop_object.hpp"
#include "level_zero_loader.hpp"

namespace {

using namespace tarn_test;

TEST(interop_cache_hidden, a_device_that_sycl_does_not_show_is_refused) {
  if (level_zero_loader::find() == nullptr) {
    GTEST_SKIP() << "no Level Zero loader";
  }
  const level_zero_loader::first_device first;
  for (const sycl::device& device : sycl::device::get_devices()) {
    ASSERT_NE(device.get_backend(), sycl::backend::ext_kestrel_level_zero);
  }
  int context = 0;
  int queue = 0;
  expect_not_exposed(interop_object(2, {first.device, &context, &queue}));
}

}  // namespace
