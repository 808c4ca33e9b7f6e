// SPDX-License-Identifier: Apache-2.0
// The last step of an entry by itself: what the call has made for itself lives until its kernels
// have ended, and is gone when the completion function is told.
#include "offload/finish.hpp"

#include <atomic>
#include <memory>
#include <thread>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "completions.hpp"
#include "omptarget.hpp"
#include "tests/rng/in_flight.hpp"

namespace {

using namespace tarn_test;
namespace openmp = kestrel::tarn::rng::detail::openmp;
using owned = std::unique_ptr<void, void (*)(void*)>;

std::atomic<int> living{0};
std::atomic<int> living_when_told{-1};

owned new_generator() {
  ++living;
  return owned(new int(7), [](void* made) {
    delete static_cast<int*>(made);
    --living;
  });
}

class offload_finish : public testing::Test {
 protected:
  offload_finish() {
    interop_.set_completion([](void* interop) {
      living_when_told = living.load();
      completions::note(interop);
    });
  }
  void TearDown() override {
    EXPECT_EQ(living, 0);
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  sycl::queue queue_{sycl::gpu_selector_v};
  omptarget::interop interop_;
};

TEST_F(offload_finish, waits) {
  gate shut(queue_);
  shut.open_during([&] {
    EXPECT_EQ(
        openmp::finish(shut.closed, new_generator(), interop_.handle(), openmp::ending::waited_for),
        0);
  });
  EXPECT_EQ(living, 0);
}

TEST_F(offload_finish, leaves_the_wait_to_a_thread) {
  gate shut(queue_);
  ASSERT_EQ(
      openmp::finish(shut.closed, new_generator(), interop_.handle(), openmp::ending::by_thread),
      0);
  EXPECT_EQ(living, 1) << "as long as the kernels";
  EXPECT_EQ(completions::all().count(), 0u);
  shut.open();
  const auto told = completions::all().take(1);
  ASSERT_EQ(told.size(), 1u);
  EXPECT_EQ(told[0].interop, interop_.handle());
  EXPECT_NE(told[0].thread, std::this_thread::get_id());
  EXPECT_EQ(living_when_told, 0);
}

TEST_F(offload_finish, has_a_thread_for_each_of_many) {
  constexpr std::size_t calls = 50;
  gate shut(queue_);
  for (std::size_t i = 0; i < calls; ++i) {
    ASSERT_EQ(
        openmp::finish(shut.closed, new_generator(), interop_.handle(), openmp::ending::by_thread),
        0);
  }
  EXPECT_EQ(living, static_cast<int>(calls));
  EXPECT_EQ(completions::all().count(), 0u);
  shut.open();
  completions::all().wait_for(interop_.handle(), calls);
  EXPECT_EQ(completions::all().take(calls).size(), calls);
}

}  // namespace
