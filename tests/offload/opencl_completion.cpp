// SPDX-License-Identifier: Apache-2.0
// The end of calls that are not waited for on OpenCL, over a driver: the completion function is
// told when the event is complete, and the references to the event are balanced. Of an event that
// ends in an error nobody is told.
#include "offload/opencl_completion.hpp"

#include <future>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "completions.hpp"
#include "omptarget.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

namespace {

using kestrel::tarn::rng::detail::openmp::complete_after;
using tarn_test::completions;

int events() {
  return opencl_layer::objects(opencl_layer::object::event);
}

class opencl_completion : public testing::Test {
 protected:
  void SetUp() override {
    cl_device_id device = opencl_loader::first_gpu();
    if (device == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    context_ = cl().clCreateContext(nullptr, 1, &device, nullptr, nullptr, nullptr);
    ASSERT_NE(context_, nullptr);
    queue_ = cl().clCreateCommandQueueWithProperties(context_, device, nullptr, nullptr);
    ASSERT_NE(queue_, nullptr);
    before_ = events();
    interop_.set_completion(completions::note);
  }
  void TearDown() override {
    if (context_ == nullptr) {
      return;
    }
    opencl_layer::reset();
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(cl().clReleaseCommandQueue(queue_), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseContext(context_), CL_SUCCESS);
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  static const opencl_loader::functions& cl() { return opencl_loader::get(); }

  /// An event that the test ends.
  cl_event new_event() const {
    cl_event made = cl().clCreateUserEvent(context_, nullptr);
    EXPECT_NE(made, nullptr);
    return made;
  }
  /// A command behind an event.
  cl_event marker_behind(cl_event event) const {
    cl_event made = nullptr;
    EXPECT_EQ(cl().clEnqueueMarkerWithWaitList(queue_, 1, &event, &made), CL_SUCCESS);
    EXPECT_EQ(cl().clFlush(queue_), CL_SUCCESS);
    return made;
  }
  /// The callback gives its reference back last of all.
  void expect_events_gone() const {
    while (events() > before_) {
      std::this_thread::yield();  // in vain: the test runs into its time limit
    }
    EXPECT_EQ(events(), before_);
  }

  cl_context context_ = nullptr;
  cl_command_queue queue_ = nullptr;
  int before_ = 0;
  omptarget::interop interop_;
};

TEST_F(opencl_completion, is_told_when_the_event_is_complete_and_not_before) {
  cl_event first = new_event();
  cl_event event = marker_behind(first);
  EXPECT_EQ(events(), before_ + 2);
  ASSERT_EQ(complete_after(event, interop_.handle()), 0);
  EXPECT_EQ(events(), before_ + 3) << "a reference of its own";
  EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
  EXPECT_EQ(completions::all().count(), 0u);
  EXPECT_EQ(cl().clSetUserEventStatus(first, CL_COMPLETE), CL_SUCCESS);
  const auto told = completions::all().take(1);
  ASSERT_EQ(told.size(), 1u);
  EXPECT_EQ(told[0].interop, interop_.handle());
  EXPECT_EQ(cl().clReleaseEvent(first), CL_SUCCESS);
  expect_events_gone();
}

TEST_F(opencl_completion, is_told_of_an_event_that_is_complete_already) {
  cl_event event = new_event();
  EXPECT_EQ(cl().clSetUserEventStatus(event, CL_COMPLETE), CL_SUCCESS);
  ASSERT_EQ(complete_after(event, interop_.handle()), 0);
  EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
  EXPECT_EQ(completions::all().take(1).size(), 1u);
  expect_events_gone();
}

TEST_F(opencl_completion, without_a_callback_is_minus_2) {
  for (const int code : {CL_INVALID_EVENT, CL_OUT_OF_HOST_MEMORY}) {
    cl_event event = new_event();
    opencl_layer::fail("clSetEventCallback", 0, code);
    EXPECT_EQ(complete_after(event, interop_.handle()), -2);
    EXPECT_EQ(events(), before_ + 1) << "the reference is given back";
    EXPECT_EQ(cl().clSetUserEventStatus(event, CL_COMPLETE), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
    EXPECT_EQ(events(), before_);
    EXPECT_EQ(completions::all().count(), 0u);
  }
}

TEST_F(opencl_completion, is_told_once_of_each_of_many) {
  constexpr int calls = 50;
  cl_event first = new_event();
  for (int i = 0; i < calls; ++i) {
    cl_event event = marker_behind(first);
    ASSERT_EQ(complete_after(event, interop_.handle()), 0);
    EXPECT_EQ(cl().clReleaseEvent(event), CL_SUCCESS);
  }
  EXPECT_EQ(completions::all().count(), 0u);
  EXPECT_EQ(cl().clSetUserEventStatus(first, CL_COMPLETE), CL_SUCCESS);
  EXPECT_EQ(completions::all().take(calls).size(), std::size_t{calls});
  EXPECT_EQ(cl().clReleaseEvent(first), CL_SUCCESS);
  expect_events_gone();
}

}  // namespace
