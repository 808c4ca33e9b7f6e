// SPDX-License-Identifier: Apache-2.0
// The interop cache over virtual GPUs, which interop objects of kind 2 can name: what is read and
// in which order, what is kept, and what is refused.
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "interop_object.hpp"

namespace {

using namespace tarn_test;

sycl::device gpu_number(std::size_t number) {
  return sycl::device::get_devices(sycl::info::device_type::gpu).at(number);
}

native_handles handles_of(const sycl::queue& queue) {
  namespace service = kestrel::tarn::service;
  return {service::native_of(queue.get_device()), service::native_of(queue.get_context()),
          service::native_of(queue)};
}

int property_calls() {
  return omptarget::calls("__tgt_get_interop_property");
}
int in_order_calls() {
  return omptarget::calls("omp_get_interop_int");
}

class interop_cache : public testing::Test {
 protected:
  void TearDown() override { EXPECT_EQ(omptarget::mistakes(), 0); }

  sycl::queue queue_{gpu_number(1)};
};

TEST_F(interop_cache, gives_the_queue_that_the_object_names) {
  const interop_object object(2, handles_of(queue_));
  sycl::queue* const found = queue_of(object);
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(*found, queue_);
  EXPECT_EQ(found->get_device(), gpu_number(1));
  EXPECT_EQ(found->get_context(), queue_.get_context());
  int* const value = sycl::malloc_shared<int>(1, *found);
  *value = -1;
  found->fill(value, 42, 1).wait();
  EXPECT_EQ(*value, 42);
  sycl::free(value, *found);
}

TEST_F(interop_cache, gives_the_same_queue_to_every_object_that_names_it) {
  const interop_object first(2, handles_of(queue_));
  const interop_object second(2, handles_of(queue_));
  sycl::queue* const found = queue_of(first);
  EXPECT_EQ(queue_of(first), found);
  EXPECT_EQ(queue_of(second), found);
}

TEST_F(interop_cache, outlives_the_callers_queue) {
  sycl::queue* found = nullptr;
  {
    const sycl::queue of_the_caller(gpu_number(1));
    found = queue_of(interop_object(2, handles_of(of_the_caller)));
  }
  ASSERT_NE(found, nullptr);
  int* const value = sycl::malloc_shared<int>(1, *found);
  *value = -1;
  found->fill(value, 7, 1).wait();
  EXPECT_EQ(*value, 7);
  sycl::free(value, *found);
}

TEST_F(interop_cache, reads_four_properties_and_the_order_once) {
  const interop_object object(2, handles_of(queue_));
  const int properties = property_calls();
  const int orders = in_order_calls();
  queue_of(object);
  EXPECT_EQ(property_calls() - properties, 4);
  EXPECT_EQ(in_order_calls() - orders, 1);
  queue_of(object);
  EXPECT_EQ(property_calls() - properties, 8);
  EXPECT_EQ(in_order_calls() - orders, 1) << "asked for a queue that was known";
}

// The number of calls shows the order: 8, 9, 5, 7.
TEST_F(interop_cache, stops_at_the_first_property_that_fails_and_says_nothing) {
  const native_handles handles = handles_of(queue_);
  const int order[] = {kind_property, device_of_kind_2_property, context_property, queue_property};
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  for (int failing = 0; failing < 4; ++failing) {
    interop_object object(2, handles);
    object.fail_native(order[failing], 1);
    const int before = property_calls();
    EXPECT_EQ(queue_of(object), nullptr);
    EXPECT_EQ(property_calls() - before, failing + 1);
  }
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
  EXPECT_NE(queue_of(interop_object(2, handles)), nullptr);
}

TEST_F(interop_cache, every_result_but_0_is_a_failure) {
  for (const int status : {-1, 1, 2, 1000}) {
    interop_object object(2, handles_of(queue_));
    object.fail_native(context_property, status);
    EXPECT_EQ(queue_of(object), nullptr) << status;
  }
}

TEST_F(interop_cache, the_device_is_property_9_for_kind_2_and_property_6_for_others) {
  const native_handles handles = handles_of(queue_);
  interop_object without_9(2, handles);
  without_9.fail_native(device_of_kind_2_property, 1);
  without_9.set_native(device_property, handles.device);
  EXPECT_EQ(queue_of(without_9), nullptr);
  for (const std::uintptr_t kind : {0, 1, 3, 4}) {
    interop_object without_6(kind, handles);
    without_6.fail_native(device_property, 1);
    without_6.set_native(device_of_kind_2_property, handles.device);
    EXPECT_EQ(queue_of(without_6), nullptr) << kind;
  }
}

TEST_F(interop_cache, an_unknown_device_is_refused_and_nothing_is_kept) {
  const sycl::queue fresh(sycl::context(gpu_number(0)), gpu_number(0));
  const native_handles handles = handles_of(fresh);
  int nobody = 0;
  for (void* const device : {static_cast<void*>(&nobody), static_cast<void*>(nullptr)}) {
    const interop_object object(2, {device, handles.context, handles.queue});
    expect_not_exposed(object);
    expect_not_exposed(object);
  }
  EXPECT_NE(queue_of(interop_object(2, handles)), nullptr);
}

TEST_F(interop_cache, a_known_queue_needs_no_context_and_no_device) {
  const native_handles handles = handles_of(queue_);
  sycl::queue* const found = queue_of(interop_object(2, handles));
  int nobody = 0;
  EXPECT_EQ(queue_of(interop_object(2, {&nobody, &nobody, handles.queue})), found);
}

TEST_F(interop_cache, a_known_context_needs_no_device) {
  const sycl::queue first(sycl::context(gpu_number(0)), gpu_number(0));
  const sycl::queue second(first.get_context(), gpu_number(0));
  sycl::queue* const found = queue_of(interop_object(2, handles_of(first)));
  const native_handles handles = handles_of(second);
  int nobody = 0;
  sycl::queue* const other = queue_of(interop_object(2, {&nobody, handles.context, handles.queue}));
  ASSERT_NE(other, nullptr);
  EXPECT_NE(other, found);
  EXPECT_EQ(other->get_context(), found->get_context());
}

TEST_F(interop_cache, a_null_queue_is_refused_by_the_runtime_after_its_order_was_asked_for) {
  native_handles handles = handles_of(queue_);
  handles.queue = nullptr;
  const int before = in_order_calls();
  EXPECT_THROW(queue_of(interop_object(2, handles)), sycl::exception);
  EXPECT_EQ(in_order_calls() - before, 1);
}

TEST_F(interop_cache, threads_that_come_together_get_one_queue) {
  for (const int threads : {2, 16}) {
    for (int round = 0; round < 20; ++round) {
      const sycl::queue fresh(sycl::context(gpu_number(0)), gpu_number(0));
      const std::vector<sycl::queue*> found =
          queues_of_threads(interop_object(2, handles_of(fresh)), threads);
      const std::set<sycl::queue*> different(found.begin(), found.end());
      ASSERT_EQ(different.size(), 1u);
      ASSERT_NE(*different.begin(), nullptr);
      EXPECT_EQ(**different.begin(), fresh);
    }
  }
}

TEST(interop_cache_contexts, a_context_is_kept_with_the_device_that_is_given) {
  sycl::device device = gpu_number(0);
  const sycl::context context(device);
  void* const native = kestrel::tarn::service::native_of(context);
  sycl::context* const found =
      gpu::lookup_and_cache_lumen_context(native, nullptr, TARN_GPU_BACKEND_LEVEL_ZERO, &device);
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(*found, context);
  EXPECT_EQ(found->get_devices(), std::vector<sycl::device>{device});
  EXPECT_EQ(gpu::lookup_and_cache_lumen_context(native, nullptr, TARN_GPU_BACKEND_UNKNOWN, nullptr),
            found);
}

TEST(interop_cache_contexts, the_device_is_looked_for_by_its_handle_when_none_is_given) {
  const sycl::device device = gpu_number(1);
  const sycl::context context(device);
  sycl::context* const found = gpu::lookup_and_cache_lumen_context(
      kestrel::tarn::service::native_of(context), kestrel::tarn::service::native_of(device),
      TARN_GPU_BACKEND_LEVEL_ZERO, nullptr);
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(found->get_devices(), std::vector<sycl::device>{device});
}

TEST(interop_cache_contexts, a_queue_without_an_interop_object_is_made_without_asking) {
  const sycl::queue queue(gpu_number(0));
  void* const native = kestrel::tarn::service::native_of(queue);
  const int before = in_order_calls();
  sycl::queue* const found = gpu::lookup_and_cache_lumen_queue(native, TARN_GPU_BACKEND_LEVEL_ZERO,
                                                               queue.get_context(), nullptr);
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(*found, queue);
  EXPECT_EQ(in_order_calls(), before);
}

}  // namespace
