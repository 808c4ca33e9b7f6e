// SPDX-License-Identifier: Apache-2.0
// The interop cache over Level Zero, which counts no references: native objects stay the caller's.
#include <set>
#include <vector>

#include "interop_object.hpp"
#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"

namespace {

using namespace tarn_test;

constexpr auto level_zero = sycl::backend::ext_kestrel_level_zero;
using level_zero_driver::object;

// The native objects live as long as the process, as the cache does.
class interop_cache_level_zero : public testing::Test {
 protected:
  void SetUp() override {
    if (level_zero_loader::find() == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
    const level_zero_loader::first_device first;
    device_ = first.device;
    const ze_context_desc_t description{ZE_STRUCTURE_TYPE_CONTEXT_DESC, nullptr, 0};
    ASSERT_EQ(ze().zeContextCreate(first.driver, &description, &context_), ZE_RESULT_SUCCESS);
  }
  void TearDown() override { EXPECT_EQ(omptarget::mistakes(), 0); }

  static const level_zero_loader::functions& ze() { return level_zero_loader::get(); }

  native_handles new_handles() const {
    ze_command_queue_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_DESC;
    description.ordinal = 1;  // the group that computes
    ze_command_queue_handle_t queue = nullptr;
    EXPECT_EQ(ze().zeCommandQueueCreate(context_, device_, &description, &queue),
              ZE_RESULT_SUCCESS);
    return {device_, context_, queue};
  }

  ze_device_handle_t device_ = nullptr;
  ze_context_handle_t context_ = nullptr;
};

TEST_F(interop_cache_level_zero, native_objects_stay_the_callers) {
  const native_handles handles = new_handles();
  const int contexts = level_zero_driver::objects(object::context);
  const int queues = level_zero_driver::objects(object::queue);
  sycl::queue* const found = queue_of(interop_object(2, handles));
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(found->get_backend(), level_zero);
  EXPECT_EQ(sycl::get_native<level_zero>(*found), handles.queue);
  EXPECT_EQ(sycl::get_native<level_zero>(found->get_context()), handles.context);
  EXPECT_EQ(sycl::get_native<level_zero>(found->get_device()), handles.device);
  EXPECT_EQ(found->get_context().get_devices().size(), 1u);
  EXPECT_EQ(level_zero_driver::objects(object::context), contexts);
  EXPECT_EQ(level_zero_driver::objects(object::queue), queues);
}

TEST_F(interop_cache_level_zero, the_queue_works) {
  sycl::queue* const found = queue_of(interop_object(2, new_handles()));
  ASSERT_NE(found, nullptr);
  std::vector<unsigned char> values(100, 1);
  auto* const memory = sycl::malloc_device<unsigned char>(values.size(), *found);
  ASSERT_NE(memory, nullptr);
  found->memset(memory, 42, values.size()).wait();
  found->memcpy(values.data(), memory, values.size()).wait();
  EXPECT_EQ(values, std::vector<unsigned char>(100, 42));
  sycl::free(memory, *found);
}

TEST_F(interop_cache_level_zero, the_queue_is_in_order_if_the_object_says_so) {
  for (const bool in_order : {false, true}) {
    interop_object described(2, new_handles());
    described.set_int(in_order_property, in_order ? 1 : 0);
    sycl::queue* const found = queue_of(described);
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(found->is_in_order(), in_order);
  }
}

TEST_F(interop_cache_level_zero, threads_that_come_together_get_one_queue) {
  for (int round = 0; round < 10; ++round) {
    const native_handles handles = new_handles();
    const int queues = level_zero_driver::objects(object::queue);
    const std::vector<sycl::queue*> found = queues_of_threads(interop_object(2, handles), 16);
    const std::set<sycl::queue*> different(found.begin(), found.end());
    ASSERT_EQ(different.size(), 1u);
    ASSERT_NE(*different.begin(), nullptr);
    EXPECT_EQ(level_zero_driver::objects(object::queue), queues);
  }
}

TEST_F(interop_cache_level_zero, a_device_that_is_no_root_device_is_not_exposed) {
  native_handles handles = new_handles();
  handles.device = &handles;
  expect_not_exposed(interop_object(2, handles));
}

}  // namespace
