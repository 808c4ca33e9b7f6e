// SPDX-License-Identifier: Apache-2.0
// The list of clean-up callbacks: order, the end of the list, and what comes after it.
#include "clean_up.hpp"

#include <cstdio>
#include <cstdlib>
#include <string>
#include <tarn_serv.h>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "serv_memory.hpp"
#include "tarn_gpu.h"

namespace {

using namespace kestrel::tarn::gpu;

std::vector<int> calls;
std::vector<void*> lists;

template <int number>
void callback(void* list) {
  calls.push_back(number);
  lists.push_back(list);
}

class CleanUp : public testing::Test {
 protected:
  void SetUp() override {
    tarn_sycl_destructor();
    calls.clear();
    lists.clear();
    blocks = serv_memory::live_blocks();
  }
  void TearDown() override {
    tarn_sycl_destructor();
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
  }

  std::int64_t blocks = 0;
};

using numbers = std::vector<int>;

TEST_F(CleanUp, ASecondRunFindsNothing) {
  tarn_sycl_destructor();
  EXPECT_TRUE(register_sycl_destructor(callback<1>));
  tarn_sycl_destructor();
  tarn_sycl_destructor();
  tarn_sycl_destructor_local();
  EXPECT_EQ(calls, numbers{1});
}

TEST_F(CleanUp, TheLatestGoesFirst) {
  EXPECT_TRUE(register_sycl_destructor(callback<1>));
  EXPECT_TRUE(register_sycl_destructor_nolock(callback<2>));
  EXPECT_TRUE(register_sycl_destructor(callback<3>));
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{3, 2, 1}));
}

TEST_F(CleanUp, TheSameWithoutTheLock) {
  register_sycl_destructor(callback<1>);
  register_sycl_destructor(callback<2>);
  tarn_sycl_destructor_local();
  EXPECT_EQ(calls, (numbers{2, 1}));
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
}

TEST_F(CleanUp, ANullSlotIsSkipped) {
  register_sycl_destructor(callback<1>);
  EXPECT_TRUE(register_sycl_destructor(nullptr));
  register_sycl_destructor(callback<3>);
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{3, 1}));
}

TEST_F(CleanUp, OneCallbackTwiceIsCalledTwice) {
  register_sycl_destructor(callback<1>);
  register_sycl_destructor(callback<1>);
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{1, 1}));
}

TEST_F(CleanUp, EachCallbackGetsTheListWhichIsFreedAfterTheRun) {
  register_sycl_destructor(callback<1>);
  EXPECT_EQ(serv_memory::last_malloc().size, 264U);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 64U);
  EXPECT_EQ(serv_memory::live_blocks(), blocks + 1);
  register_sycl_destructor(callback<2>);
  EXPECT_EQ(serv_memory::live_blocks(), blocks + 1);
  tarn_sycl_destructor();
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  ASSERT_EQ(lists.size(), 2U);
  EXPECT_NE(lists[0], nullptr);
  EXPECT_EQ(lists[0], lists[1]);
}

TEST_F(CleanUp, AfterARunANewListBegins) {
  for (int round = 0; round < 40; ++round) {  // more rounds than a list has room
    EXPECT_TRUE(register_sycl_destructor(callback<1>));
    tarn_sycl_destructor();
  }
  EXPECT_EQ(calls, numbers(40, 1));
}

void registers_again(void* list) {
  callback<1>(list);
  register_sycl_destructor_nolock(callback<2>);
}

TEST_F(CleanUp, WhatACallbackRegistersWaitsForTheNextRun) {
  register_sycl_destructor(callback<3>);
  register_sycl_destructor(registers_again);
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{1, 3}));
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{1, 3, 2}));
}

void runs_again(void* list) {
  callback<1>(list);
  tarn_sycl_destructor_local();
}

TEST_F(CleanUp, ACallbackMayRunTheListAndEachIsCalledOnceAllTheSame) {
  register_sycl_destructor(callback<2>);
  register_sycl_destructor(runs_again);
  tarn_sycl_destructor();
  EXPECT_EQ(calls, (numbers{1, 2}));
}

TEST_F(CleanUp, WithoutMemoryNothingIsRegistered) {
  {
    const serv_memory::failure failing(0);
    EXPECT_FALSE(register_sycl_destructor(callback<1>));
    EXPECT_TRUE(failing.happened());
  }
  EXPECT_TRUE(register_sycl_destructor(callback<2>));
  tarn_sycl_destructor();
  EXPECT_EQ(calls, numbers{2});
}

int exit_code = -1;

TEST_F(CleanUp, TheThirtyThirdEndsTheProcess) {
  for (int i = 0; i < 32; ++i) {
    ASSERT_TRUE(register_sycl_destructor(callback<1>));
  }
  EXPECT_EXIT(register_sycl_destructor(callback<2>), testing::ExitedWithCode(1), "");
  EXPECT_EXIT(register_sycl_destructor_nolock(callback<2>), testing::ExitedWithCode(1), "");

  exit_code = -1;
  tarn_serv_set_exit_hook([](int code) { exit_code = code; });
  testing::internal::CaptureStdout();
  EXPECT_FALSE(register_sycl_destructor(callback<2>));
  const std::string text = testing::internal::GetCapturedStdout();
  tarn_serv_set_exit_hook(nullptr);
  EXPECT_EQ(exit_code, 1);
  EXPECT_NE(text.find("more clean-up functions were registered than there is room for"),
            std::string::npos)
      << text;
  tarn_sycl_destructor();
  EXPECT_EQ(calls, numbers(32, 1));
}

TEST_F(CleanUp, ManyThreadsMayRegister) {
  std::vector<std::thread> threads;
  for (int t = 0; t < 16; ++t) {
    threads.emplace_back([t] {
      (t % 2 == 0 ? register_sycl_destructor : register_sycl_destructor_nolock)(callback<1>);
      (t % 2 == 0 ? register_sycl_destructor : register_sycl_destructor_nolock)(callback<2>);
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  tarn_sycl_destructor();
  EXPECT_EQ(calls.size(), 32U);
}

void tell(void*) {
  std::fputs("cleaned up\n", stderr);
}

TEST_F(CleanUp, TheCoreCallsItWhenTheProcessEnds) {
  EXPECT_EXIT(
      {
        register_sycl_destructor(tell);
        std::exit(0);
      },
      testing::ExitedWithCode(0), "cleaned up\n");
  EXPECT_EXIT(
      {
        register_sycl_destructor(callback<1>);
        tarn_sycl_destructor();
        register_sycl_destructor(tell);
        std::exit(0);
      },
      testing::ExitedWithCode(0), "^cleaned up\n$");
}

}  // namespace
