// SPDX-License-Identifier: Apache-2.0
// The ending by a callback, by itself: what becomes of the generator, who is told, and when. The
// events are those of fills that a driver of OpenCL keeps back until a test lets them go.
#include <chrono>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "offload/finish.hpp"
#include "omptarget.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"
#include "tests/rng/in_flight.hpp"

namespace {

namespace openmp = kestrel::tarn::rng::detail::openmp;
using words = std::vector<std::string>;

/// What has happened, in its order.
class diary {
 public:
  static diary& of_all() {
    static auto* const only = new diary;
    return *only;
  }
  void note(const char* what) {
    const std::lock_guard<std::mutex> lock(mutex_);
    lines_.emplace_back(what);
  }
  words lines() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return lines_;
  }
  /// Once there are `count` lines; in vain, the test runs into its time limit.
  words take(std::size_t count) {
    while (lines().size() < count) {
      std::this_thread::yield();
    }
    const std::lock_guard<std::mutex> lock(mutex_);
    return std::exchange(lines_, {});
  }

 private:
  std::mutex mutex_;
  words lines_;
};

void told(void*) {
  diary::of_all().note("told");
}

/// Something that an ending deletes.
std::unique_ptr<void, void (*)(void*)> generator() {
  static int object = 0;
  return {&object, [](void* it) {
            EXPECT_EQ(it, &object);
            diary::of_all().note("deleted");
          }};
}

class offload_finish_by_callback : public testing::Test {
 protected:
  offload_finish_by_callback() { interop_.set_completion(told); }
  ~offload_finish_by_callback() override {
    EXPECT_EQ(diary::of_all().lines(), words()) << "something happened twice";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  int finish(const sycl::event& event) {
    return openmp::finish(event, generator(), interop_.handle(), openmp::ending::by_callback);
  }
  static bool is_complete(const sycl::event& event) {
    return event.get_info<sycl::info::event::command_execution_status>() ==
           sycl::info::event_command_status::complete;
  }

  omptarget::interop interop_;
};

// No device command stands behind these events, so there is no native one either.
TEST_F(offload_finish_by_callback, waits_for_events_without_a_handle_and_tells) {
  EXPECT_EQ(finish(sycl::event()), 0);
  EXPECT_EQ(diary::of_all().take(2), (words{"deleted", "told"}));
  tarn_test::gate shut{sycl::queue(sycl::cpu_selector_v)};
  shut.open_during([&] {
    EXPECT_EQ(finish(shut.closed), 0);
    EXPECT_TRUE(is_complete(shut.closed));
  });
  EXPECT_EQ(diary::of_all().take(2), (words{"deleted", "told"}));
}

/// On a queue of OpenCL whose commands stand behind an event of the test.
class offload_opencl_finish : public offload_finish_by_callback {
 protected:
  void SetUp() override {
    cl_device_id device = opencl_loader::first_gpu();
    if (device == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    context_ = cl().clCreateContext(nullptr, 1, &device, nullptr, nullptr, nullptr);
    native_ = cl().clCreateCommandQueueWithProperties(context_, device, nullptr, nullptr);
    ASSERT_NE(native_, nullptr);
    const auto context = sycl::make_context<sycl::backend::opencl>(context_);
    queue_ =
        std::make_unique<sycl::queue>(sycl::make_queue<sycl::backend::opencl>(native_, context));
    place_ = sycl::malloc_device<unsigned char>(size, *queue_);
    ASSERT_NE(place_, nullptr);
    queue_->memset(place_, 0, size).wait();
  }
  void TearDown() override {
    if (context_ != nullptr) {
      opencl_layer::reset();
      sycl::free(place_, *queue_);
      queue_.reset();
      EXPECT_EQ(cl().clReleaseCommandQueue(native_), CL_SUCCESS);
      EXPECT_EQ(cl().clReleaseContext(context_), CL_SUCCESS);
    }
  }
  static const opencl_loader::functions& cl() { return opencl_loader::get(); }
  static int events() { return opencl_layer::objects(opencl_layer::object::event); }

  /// From now on commands of the queue wait for open().
  void shut() {
    shut_ = cl().clCreateUserEvent(context_, nullptr);
    ASSERT_NE(shut_, nullptr);
    ASSERT_EQ(cl().clEnqueueBarrierWithWaitList(native_, 1, &shut_, nullptr), CL_SUCCESS);
  }
  void open() {
    EXPECT_EQ(cl().clSetUserEventStatus(shut_, CL_COMPLETE), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseEvent(shut_), CL_SUCCESS);
  }
  /// What the kernels of a call would be.
  sycl::event fill(int value) { return queue_->memset(place_, value, size); }

  void expect_filled(int value) {
    std::vector<unsigned char> found(size, 0xA5);
    queue_->memcpy(found.data(), place_, size).wait();
    EXPECT_EQ(found, std::vector<unsigned char>(size, static_cast<unsigned char>(value)));
  }
  /// The callback gives its reference back last of all.
  static void expect_events(int number) {
    while (events() > number) {
      std::this_thread::yield();  // in vain: the test runs into its time limit
    }
    EXPECT_EQ(events(), number);
  }

  static constexpr std::size_t size = 100000;
  cl_context context_ = nullptr;
  cl_command_queue native_ = nullptr;
  cl_event shut_ = nullptr;
  std::unique_ptr<sycl::queue> queue_;
  unsigned char* place_ = nullptr;
};

TEST_F(offload_opencl_finish, deletes_at_once_and_tells_when_the_event_is_complete) {
  const int before = events();
  for (const int value : {1, 2, 3}) {
    shut();
    {
      const sycl::event kernels = fill(value);
      ASSERT_EQ(finish(kernels), 0);
      EXPECT_EQ(diary::of_all().take(1), words{"deleted"}) << "before the event is complete";
      EXPECT_FALSE(is_complete(kernels));
      open();
      EXPECT_EQ(diary::of_all().take(1), words{"told"});
    }
    expect_filled(value);
  }
  queue_->wait();
  expect_events(before);
}

TEST_F(offload_opencl_finish, that_is_not_taken_is_minus_2_with_the_results_there) {
  const int before = events();
  for (const int code : {CL_INVALID_EVENT, CL_OUT_OF_HOST_MEMORY}) {
    shut();
    opencl_layer::fail("clSetEventCallback", 0, code);
    std::thread opener([this] {
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
      open();
    });
    {
      const sycl::event kernels = fill(4);
      EXPECT_EQ(finish(kernels), -2) << code;
      EXPECT_TRUE(is_complete(kernels)) << code;
    }
    opener.join();
    EXPECT_EQ(diary::of_all().take(1), words{"deleted"}) << "and nobody is told";
    expect_filled(4);
  }
  queue_->wait();
  expect_events(before);
}

}  // namespace
