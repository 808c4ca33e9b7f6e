// SPDX-License-Identifier: Apache-2.0
// Temporary buffers and events on OpenCL queues.
#include "native_kernels.hpp"
#include "tarn_gpu_launch.h"

namespace {

using opencl_layer::calls;
using opencl_layer::fail;
using opencl_layer::object;
using opencl_layer::objects;

class c_memory : public c_launches {
 protected:
  template <typename T>
  static T told(cl_mem buffer, cl_mem_info what) {
    T value{};
    EXPECT_EQ(cl().clGetMemObjectInfo(buffer, what, sizeof value, &value, nullptr), CL_SUCCESS);
    return value;
  }

  int status = 0;
};

TEST_F(c_memory, a_buffer_has_its_size_and_is_read_and_written) {
  cl_mem made = tarn_serv_gpu_alloc_temp_buffer(&status, queue(), 1000);
  ASSERT_EQ(status, 0);
  EXPECT_EQ(told<std::size_t>(made, CL_MEM_SIZE), 1000u);
  EXPECT_EQ(told<cl_mem_flags>(made, CL_MEM_FLAGS), cl_mem_flags{CL_MEM_READ_WRITE});
  EXPECT_EQ(told<cl_context>(made, CL_MEM_CONTEXT), context());
  tarn_serv_gpu_free_buffer(&status, made);
  EXPECT_EQ(status, 0);
}

// The memory is that of a buffer that was full of marks, if the driver gives it out again.
TEST_F(c_memory, zeros_are_there_on_return_for_every_queue) {
  constexpr std::size_t size = 12345;
  const cl_queue_properties wanted[] = {CL_QUEUE_PROPERTIES, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE,
                                        0};
  cl_command_queue unordered =
      cl().clCreateCommandQueueWithProperties(context(), device, wanted, nullptr);
  ASSERT_NE(unordered, nullptr);
  for (int round = 0; round < 10; ++round) {
    cl_mem zeros = tarn_serv_gpu_calloc_temp_buffer(&status, unordered, size);
    ASSERT_EQ(status, 0);
    EXPECT_EQ(contents<unsigned char>(zeros, size), std::vector<unsigned char>(size, 0));
    const std::vector<unsigned char> marks(size, 0xa5);
    EXPECT_EQ(cl().clEnqueueWriteBuffer(queue(), zeros, CL_TRUE, 0, size, marks.data(), 0, nullptr,
                                        nullptr),
              CL_SUCCESS);
    tarn_serv_gpu_free_buffer(&status, zeros);
  }
  EXPECT_EQ(status, 0);
  EXPECT_EQ(cl().clReleaseCommandQueue(unordered), CL_SUCCESS);
}

TEST_F(c_memory, tells_the_code_of_each_call_that_fails_and_leaves_nothing) {
  const std::vector<int> living_before = living();
  struct failure {
    const char* function;
    int after;
  };
  for (const failure& each :
       {failure{"clGetCommandQueueInfo", 0}, failure{"clGetCommandQueueInfo", 1},
        failure{"clCreateBuffer", 0}, failure{"clEnqueueFillBuffer", 0}, failure{"clFinish", 0}}) {
    status = 0;
    fail(each.function, each.after, CL_OUT_OF_RESOURCES);
    EXPECT_EQ(tarn_serv_gpu_calloc_temp_buffer(&status, queue(), 64), nullptr) << each.function;
    EXPECT_EQ(status, CL_OUT_OF_RESOURCES) << each.function;
    EXPECT_EQ(living(), living_before) << each.function;
  }
  status = 0;
  fail("clCreateBuffer", 0, CL_MEM_OBJECT_ALLOCATION_FAILURE);
  EXPECT_EQ(tarn_serv_gpu_alloc_temp_buffer(&status, queue(), 64), nullptr);
  EXPECT_EQ(status, CL_MEM_OBJECT_ALLOCATION_FAILURE);
}

TEST_F(c_memory, no_buffer_has_no_bytes) {
  EXPECT_EQ(tarn_serv_gpu_alloc_temp_buffer(&status, queue(), 0), nullptr);
  EXPECT_EQ(status, CL_INVALID_BUFFER_SIZE);
  status = 0;
  EXPECT_EQ(tarn_serv_gpu_calloc_temp_buffer(&status, queue(), 0), nullptr);
  EXPECT_EQ(status, CL_INVALID_BUFFER_SIZE);
}

TEST_F(c_memory, a_null_buffer_is_a_failure_here) {
  tarn_serv_gpu_free_buffer(&status, nullptr);
  EXPECT_EQ(status, CL_INVALID_MEM_OBJECT);
}

TEST_F(c_memory, a_free_that_fails_is_told_and_the_first_failure_survives) {
  cl_mem made = tarn_serv_gpu_alloc_temp_buffer(&status, queue(), 8);
  fail("clReleaseMemObject", 0, CL_OUT_OF_RESOURCES);
  tarn_serv_gpu_free_buffer(&status, made);
  EXPECT_EQ(status, CL_OUT_OF_RESOURCES);
  tarn_serv_gpu_free_buffer(&status, nullptr);
  EXPECT_EQ(status, CL_OUT_OF_RESOURCES);
  tarn_serv_gpu_free_buffer(&status, made);
}

// Events

class c_events : public c_memory {
 protected:
  cl_event user_event() const {
    cl_int code = -1;
    cl_event made = cl().clCreateUserEvent(context(), &code);
    EXPECT_EQ(code, CL_SUCCESS);
    return made;
  }
  static void complete(cl_event event) {
    EXPECT_EQ(cl().clSetUserEventStatus(event, CL_COMPLETE), CL_SUCCESS);
  }
  int living_events() const {
    return objects(object::event) - before[static_cast<std::size_t>(object::event)];
  }
  // A merge of events that somebody else holds as well, so that they can be looked at.
  std::vector<cl_event> held_events(std::size_t count) {
    std::vector<cl_event> all;
    for (std::size_t i = 0; i < count; ++i) {
      all.push_back(user_event());
      EXPECT_EQ(cl().clRetainEvent(all.back()), CL_SUCCESS);
    }
    return all;
  }
  static cl_uint references(cl_event event) {
    cl_uint count = 0;
    EXPECT_EQ(cl().clGetEventInfo(event, CL_EVENT_REFERENCE_COUNT, sizeof count, &count, nullptr),
              CL_SUCCESS);
    return count;
  }
};

TEST_F(c_events, one_event_stands_for_all_which_are_consumed) {
  const std::vector<cl_event> events = held_events(3);
  const tarn_gpu_event_list_t list{events.data(), 3, 1};  // nobody skips here
  ASSERT_EQ(living_events(), 6);
  cl_event all = tarn_serv_gpu_coalesce_events(&status, queue(), &list);
  ASSERT_EQ(status, 0);
  ASSERT_NE(all, nullptr);
  EXPECT_EQ(living_events(), 4);
  for (cl_event event : events) {
    EXPECT_GT(state_of(all), CL_COMPLETE);
    complete(event);
  }
  tarn_serv_gpu_host_wait(&status, all);
  EXPECT_EQ(state_of(all), CL_COMPLETE);
  tarn_serv_gpu_release_event(&status, all);
  EXPECT_EQ(status, 0);
  for (cl_event event : events) {
    EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
  }
}

TEST_F(c_events, without_events_all_prior_work_is_meant) {
  cl_event held = user_event();
  const cl_queue_properties wanted[] = {CL_QUEUE_PROPERTIES, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE,
                                        0};
  cl_command_queue unordered =
      cl().clCreateCommandQueueWithProperties(context(), device, wanted, nullptr);
  const tarn_gpu_event_list_t before_work{&held, 1, 0};
  cl_event work = tarn_serv_gpu_launch_kernel_1D(&status, unordered, kernel("nothing"), nullptr, 1,
                                                 1, &before_work);
  const tarn_gpu_event_list_t empty{&held, 0, 0};
  cl_event of_null = tarn_serv_gpu_coalesce_events(&status, unordered, nullptr);
  cl_event of_empty = tarn_serv_gpu_coalesce_events(&status, unordered, &empty);
  ASSERT_EQ(status, 0);
  EXPECT_GT(state_of(of_null), CL_COMPLETE);
  EXPECT_GT(state_of(of_empty), CL_COMPLETE);
  complete(held);
  for (cl_event event : {of_null, of_empty, work}) {
    tarn_serv_gpu_host_wait(&status, event);
    EXPECT_EQ(state_of(event), CL_COMPLETE);
    tarn_serv_gpu_release_event(&status, event);
  }
  EXPECT_EQ(status, 0);
  EXPECT_EQ(cl().clReleaseEvent(held), CL_SUCCESS);
  EXPECT_EQ(cl().clReleaseCommandQueue(unordered), CL_SUCCESS);
}

TEST_F(c_events, stay_when_they_cannot_be_merged) {
  const std::vector<cl_event> events = held_events(2);
  const tarn_gpu_event_list_t list{events.data(), 2, 0};
  fail("clEnqueueMarkerWithWaitList", 0, CL_OUT_OF_RESOURCES);
  EXPECT_EQ(tarn_serv_gpu_coalesce_events(&status, queue(), &list), nullptr);
  EXPECT_EQ(status, CL_OUT_OF_RESOURCES);
  EXPECT_EQ(living_events(), 4);
  for (cl_event event : events) {
    EXPECT_EQ(references(event), 2u);
    EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
  }
}

TEST_F(c_events, are_released_in_order_up_to_the_first_that_fails) {
  for (int failing = 0; failing < 3; ++failing) {
    status = 0;
    const std::vector<cl_event> events = held_events(3);
    for (cl_event event : events) {
      complete(event);
    }
    const tarn_gpu_event_list_t list{events.data(), 3, 0};
    fail("clReleaseEvent", failing, CL_OUT_OF_HOST_MEMORY);
    EXPECT_EQ(tarn_serv_gpu_coalesce_events(&status, queue(), &list), nullptr);
    EXPECT_EQ(status, CL_OUT_OF_HOST_MEMORY);
    EXPECT_EQ(cl().clFinish(queue()), CL_SUCCESS);
    EXPECT_EQ(living_events(), 6 - failing) << "the common event is gone, and so are those before";
    for (int i = 0; i < 3; ++i) {
      if (i >= failing) {
        EXPECT_EQ(cl().clReleaseEvent(events[static_cast<std::size_t>(i)]), CL_SUCCESS);
      }
      EXPECT_EQ(references(events[static_cast<std::size_t>(i)]), 1u) << i;
      EXPECT_EQ(cl().clReleaseEvent(events[static_cast<std::size_t>(i)]), CL_SUCCESS);
    }
  }
}

TEST_F(c_events, null_is_released_without_a_call) {
  const int before_call = calls("clReleaseEvent");
  tarn_serv_gpu_release_event(&status, nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(calls("clReleaseEvent"), before_call);
}

TEST_F(c_events, tell_what_fails) {
  cl_event event = user_event();
  complete(event);
  fail("clWaitForEvents", 0, CL_OUT_OF_RESOURCES);
  tarn_serv_gpu_host_wait(&status, event);
  EXPECT_EQ(status, CL_OUT_OF_RESOURCES);
  status = 0;
  fail("clReleaseEvent", 0, CL_OUT_OF_HOST_MEMORY);
  tarn_serv_gpu_release_event(&status, event);
  EXPECT_EQ(status, CL_OUT_OF_HOST_MEMORY);
  status = 0;
  tarn_serv_gpu_release_event(&status, event);
  EXPECT_EQ(status, 0);
  cl_event failed = user_event();
  EXPECT_EQ(cl().clSetUserEventStatus(failed, -7), CL_SUCCESS);
  tarn_serv_gpu_host_wait(&status, failed);
  EXPECT_EQ(status, CL_EXEC_STATUS_ERROR_FOR_EVENTS_IN_WAIT_LIST);
  EXPECT_EQ(cl().clReleaseEvent(failed), CL_SUCCESS);
}

}  // namespace
