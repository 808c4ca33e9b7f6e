// SPDX-License-Identifier: Apache-2.0
// Locks on plain words: exclusion under contention, and waiting past the spinning phase.
#include <chrono>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "tarn_serv.h"

namespace {

TEST(CoreLock, ExcludesUnderContention) {
  int word = 0;
  long counter = 0;  // Not atomic: only the lock orders the threads.
  constexpr int threads = 8;
  constexpr long rounds = 5000;
  std::vector<std::thread> workers;
  for (int t = 0; t < threads; ++t) {
    workers.emplace_back([&] {
      for (long i = 0; i < rounds; ++i) {
        tarn_serv_lock(&word);
        ++counter;
        tarn_serv_unlock(&word);
      }
    });
  }
  for (auto& worker : workers) {
    worker.join();
  }
  EXPECT_EQ(counter, threads * rounds);
  EXPECT_EQ(word, 0);
}

TEST(CoreLock, AWaiterSleepsUntilTheHolderLeaves) {
  int word = 0;
  bool left = false;
  tarn_serv_lock(&word);
  EXPECT_NE(word, 0);
  std::thread waiter([&] {
    tarn_serv_lock(&word);
    EXPECT_TRUE(left);
    tarn_serv_unlock(&word);
  });
  std::this_thread::sleep_for(std::chrono::milliseconds(20));
  left = true;
  tarn_serv_unlock(&word);
  waiter.join();
  EXPECT_EQ(word, 0);
}

TEST(CoreLock, LocksAreIndependent) {
  int first = 0;
  int second = 0;
  tarn_serv_lock(&first);
  tarn_serv_lock(&second);
  tarn_serv_unlock(&first);
  EXPECT_EQ(first, 0);
  EXPECT_NE(second, 0);
  tarn_serv_unlock(&second);
}

}  // namespace
