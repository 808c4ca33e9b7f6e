// SPDX-License-Identifier: Apache-2.0
// The read/write word: what readers and writers make of its 32 bits, and that they keep each other
// out.
#include "rw_word.hpp"

#include <atomic>
#include <chrono>
#include <cstdint>
#include <mutex>
#include <shared_mutex>
#include <thread>
#include <type_traits>
#include <vector>

#include <gtest/gtest.h>

namespace {

using kestrel::tarn::gpu::rw_word;

static_assert(sizeof(rw_word) == 4 && std::is_standard_layout_v<rw_word>);

std::uint32_t bits(const rw_word& word) {
  return reinterpret_cast<const std::atomic<std::uint32_t>&>(word).load();
}

void wait_for(const rw_word& word, std::uint32_t value) {
  while (bits(word) != value) {
    std::this_thread::yield();
  }
}

TEST(rw_word, starts_free_and_readers_count_two_each) {
  rw_word word;
  EXPECT_EQ(bits(word), 0u);
  word.lock_shared();
  EXPECT_EQ(bits(word), 2u);
  word.lock_shared();
  EXPECT_EQ(bits(word), 4u);
  word.unlock_shared();
  word.unlock_shared();
  EXPECT_EQ(bits(word), 0u);
}

TEST(rw_word, the_writer_has_bit_0) {
  rw_word word;
  word.lock();
  EXPECT_EQ(bits(word), 1u);
  word.unlock();
  EXPECT_EQ(bits(word), 0u);
}

TEST(rw_word, a_reader_that_waits_for_the_writer_is_counted_and_stays_so) {
  rw_word word;
  std::atomic<bool> reads{false};
  word.lock();
  std::thread reader([&] {
    word.lock_shared();
    reads = true;
  });
  wait_for(word, 3);
  EXPECT_FALSE(reads);
  word.unlock();
  reader.join();
  EXPECT_TRUE(reads);
  EXPECT_EQ(bits(word), 2u);
}

TEST(rw_word, a_writer_waits_for_the_last_reader_and_leaves_no_mark_meanwhile) {
  rw_word word;
  std::atomic<bool> comes{false};
  std::atomic<bool> writes{false};
  word.lock_shared();
  word.lock_shared();
  std::thread writer([&] {
    comes = true;
    word.lock();
    writes = true;
  });
  while (!comes) {
    std::this_thread::yield();
  }
  word.unlock_shared();
  // Long enough for a writer that does not wait; one that waits cannot come, however long it is.
  std::this_thread::sleep_for(std::chrono::milliseconds(20));
  EXPECT_EQ(bits(word), 2u);
  EXPECT_FALSE(writes);
  word.unlock_shared();
  writer.join();
  EXPECT_EQ(bits(word), 1u);
}

// A pair that writers keep equal, with a pause in the middle: a reader who came then would find it
// unequal, and of writers who met one would be lost.
TEST(rw_word, writers_keep_everybody_out) {
  constexpr int threads = 8;
  constexpr int rounds = 500;
  rw_word word;
  std::atomic<int> first{0};
  std::atomic<int> second{0};
  std::atomic<int> unequal{0};
  std::vector<std::thread> team;
  for (int t = 0; t < threads; ++t) {
    team.emplace_back([&] {
      for (int i = 0; i < rounds; ++i) {
        {
          const std::shared_lock<rw_word> reading(word);
          const int seen = first;
          std::this_thread::yield();
          unequal += seen != second ? 1 : 0;
        }
        const std::lock_guard<rw_word> writing(word);
        const int seen = first;
        first = seen + 1;
        std::this_thread::yield();
        second = seen + 1;
      }
    });
  }
  for (std::thread& member : team) {
    member.join();
  }
  EXPECT_EQ(unequal, 0);
  EXPECT_EQ(first, threads * rounds);
  EXPECT_EQ(second, threads * rounds);
  EXPECT_EQ(bits(word), 0u);
}

// What the sanitizer for threads sees: the lock orders plain memory.
TEST(rw_word, what_a_writer_stored_is_what_readers_see) {
  rw_word word;
  std::int64_t value = 0;
  std::thread writer([&] {
    for (int i = 0; i < 1000; ++i) {
      const std::lock_guard<rw_word> writing(word);
      ++value;
    }
  });
  std::int64_t last = 0;
  while (last < 1000) {
    const std::shared_lock<rw_word> reading(word);
    ASSERT_GE(value, last);
    last = value;
  }
  writer.join();
}

}  // namespace
