// SPDX-License-Identifier: Apache-2.0
// The ring of queues: growth, the order of looks, what is lost when it is full, and memory.
#include "device_ring.hpp"

#include <memory>
#include <stdexcept>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "serv_memory.hpp"
#include "tarn_gpu_int.hpp"
#include "tarn_sycl_device.hpp"

namespace {

using namespace kestrel::tarn::gpu;

std::vector<int> looked_at;  // keys of entries, in the order of the looks

/// Found by a number, and tells when it is looked at.
struct number_entry {
  using queue_key = int;

  void* device = nullptr;
  int key = -1;

  bool is_of(int queue) const {
    looked_at.push_back(key);
    return key == queue;
  }
  void assign(void* new_device, int queue) {
    device = new_device;
    key = queue;
  }
};

constexpr int limit = 2048;
char places[2 * limit + 16];  // stand in for devices

void* device_number(int i) {
  return &places[i];
}

template <typename Entry>
class owned_ring : public device_ring<Entry> {
 public:
  ~owned_ring() { this->clear(); }
};

class DeviceRing : public testing::Test {
 protected:
  void SetUp() override { blocks = serv_memory::live_blocks(); }

  /// The device of a queue, which is asked for if it is not in the ring.
  void* look_up(int queue) {
    looked_at.clear();
    asked = false;
    return ring
        .device_of(queue,
                   [&] {
                     asked = true;
                     return std::optional<void*>(device_number(queue));
                   })
        .value_or(nullptr);
  }
  void expect_kept(int queue) {
    EXPECT_EQ(look_up(queue), device_number(queue)) << queue;
    EXPECT_FALSE(asked) << queue;
  }
  void fill(int queues) {
    for (int i = 0; i < queues; ++i) {
      EXPECT_EQ(look_up(i), device_number(i));
      EXPECT_TRUE(asked) << i;
    }
  }

  std::int64_t blocks = 0;
  owned_ring<number_entry> ring;
  bool asked = false;
};

TEST_F(DeviceRing, BeginsEmpty) {
  EXPECT_EQ(ring.capacity, 0);
  EXPECT_EQ(ring.count, 0);
  EXPECT_EQ(ring.next_victim, 0);
  EXPECT_EQ(ring.last, -1);
  EXPECT_EQ(ring.entries, nullptr);
  EXPECT_EQ(look_up(3), device_number(3));
  EXPECT_TRUE(asked);
  EXPECT_EQ(looked_at, std::vector<int>{});
}

TEST_F(DeviceRing, FindsWhatItHasSeen) {
  fill(3);
  for (int i = 0; i < 3; ++i) {
    expect_kept(i);
  }
  EXPECT_EQ(ring.count, 3);
}

TEST_F(DeviceRing, ANullDeviceIsRememberedToo) {
  ring.device_of(1, [] { return std::optional<void*>(nullptr); });
  const std::optional<void*> found = ring.device_of(1, []() -> std::optional<void*> {
    ADD_FAILURE() << "asked again";
    return std::nullopt;
  });
  EXPECT_EQ(found, std::optional<void*>(nullptr));
}

TEST_F(DeviceRing, GrowsByEight) {
  for (int i = 0; i < limit; ++i) {
    look_up(i);
    ASSERT_EQ(ring.capacity, (i / 8 + 1) * 8);
    ASSERT_EQ(ring.count, i + 1);
    ASSERT_EQ(ring.last, i);
    ASSERT_EQ(ring.next_victim, 0);
  }
}

TEST_F(DeviceRing, LooksAtTheLatestFirst) {
  fill(5);
  look_up(9);
  EXPECT_EQ(looked_at, (std::vector<int>{4, 3, 2, 1, 0}));
  ring.clear();
  fill(limit + 2);  // the latest are at 0 and 1
  look_up(limit - 1);
  EXPECT_EQ(looked_at, (std::vector<int>{limit + 1, limit, limit - 1}));
}

TEST_F(DeviceRing, With2048QueuesItGrowsNoMoreAndTheOldestIsOverwritten) {
  fill(limit);
  expect_kept(0);
  look_up(limit);
  EXPECT_TRUE(asked);
  EXPECT_EQ(ring.capacity, limit);
  EXPECT_EQ(ring.count, limit);
  EXPECT_EQ(ring.last, 0);
  EXPECT_EQ(ring.next_victim, 1);
  expect_kept(limit);
  expect_kept(1);
  EXPECT_EQ(ring.entries[0]->key, limit);
  EXPECT_EQ(look_up(0), device_number(0));  // is asked for anew, in the place of 1
  EXPECT_TRUE(asked);
  EXPECT_EQ(ring.entries[1]->key, 0);
}

TEST_F(DeviceRing, VictimsGoRoundAndRound) {
  fill(limit);
  const std::int64_t full = serv_memory::live_blocks();
  for (int i = limit; i < 2 * limit + 3; ++i) {
    look_up(i);
    ASSERT_TRUE(asked) << i;
    ASSERT_EQ(ring.last, i % limit);
    ASSERT_EQ(ring.next_victim, (i + 1) % limit);
  }
  EXPECT_EQ(serv_memory::live_blocks(), full);
  expect_kept(limit + 3);
  expect_kept(2 * limit + 2);
  look_up(limit + 2);
  EXPECT_TRUE(asked);
}

TEST_F(DeviceRing, WhatFailsIsNotRemembered) {
  EXPECT_EQ(ring.device_of(7, [] { return std::optional<void*>(); }), std::nullopt);
  EXPECT_EQ(ring.count, 0);
  EXPECT_EQ(ring.lock, 0);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
}

TEST_F(DeviceRing, WhatIsThrownPassesOutAndTheLockIsFree) {
  EXPECT_THROW(ring.device_of(7, []() -> std::optional<void*> { throw std::runtime_error(""); }),
               std::runtime_error);
  EXPECT_EQ(ring.lock, 0);
  EXPECT_EQ(ring.count, 0);
  EXPECT_EQ(look_up(7), device_number(7));
}

TEST_F(DeviceRing, WithoutMemoryTheDeviceIsGivenAndNotRemembered) {
  fill(8);
  for (const int after : {0, 1}) {  // the array, the entry
    const int was = ring.count;
    const int last = ring.last;
    const serv_memory::failure failing(after);
    EXPECT_EQ(look_up(100 + after), device_number(100 + after));
    EXPECT_TRUE(failing.happened()) << after;
    EXPECT_EQ(ring.count, was) << after;
    EXPECT_EQ(ring.last, last) << after;
    EXPECT_EQ(ring.lock, 0);
  }
  for (int i = 0; i < 8; ++i) {
    expect_kept(i);
  }
  look_up(100);
  expect_kept(100);
  EXPECT_EQ(ring.capacity, 16);
}

TEST_F(DeviceRing, ClearedItIsAsAtTheStartAndWorksAgain) {
  fill(limit + 5);
  ring.clear();
  EXPECT_EQ(ring.capacity, 0);
  EXPECT_EQ(ring.count, 0);
  EXPECT_EQ(ring.next_victim, 0);
  EXPECT_EQ(ring.last, -1);
  EXPECT_EQ(ring.entries, nullptr);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  fill(9);
  expect_kept(8);
}

TEST(CLayerRing, NeverFindsAQueueAgain) {
  owned_ring<c_layer::queue_entry> ring;
  char place = 0;
  const auto queue = reinterpret_cast<cl_command_queue>(&place);
  for (int i = 1; i <= limit + 1; ++i) {
    bool asked = false;
    ring.device_of(i % 2 == 0 ? queue : nullptr, [&] {
      asked = true;
      return std::optional<void*>(device_number(i));
    });
    ASSERT_TRUE(asked) << i;
    ASSERT_EQ(ring.count, std::min(i, limit));
  }
  EXPECT_EQ(ring.entries[0]->device, device_number(limit + 1));
  EXPECT_EQ(ring.entries[0]->queue, nullptr);
  EXPECT_EQ(ring.entries[1]->queue, queue);
}

TEST(CLayerRing, HasEntriesOf24BytesOnCacheLines) {
  owned_ring<c_layer::queue_entry> ring;
  ring.device_of(nullptr, [] { return std::optional<void*>(nullptr); });
  EXPECT_EQ(serv_memory::last_malloc().size, 24U);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 64U);
  EXPECT_EQ(serv_memory::last_realloc().size, 8 * sizeof(void*));
}

class SyclLayerRing : public testing::Test {
 protected:
  bool is_asked_for(const std::shared_ptr<const void>& queue) {
    bool asked = false;
    ring.device_of(queue, [&] {
      asked = true;
      return std::optional<void*>(nullptr);
    });
    return asked;
  }

  owned_ring<sycl_queue_entry> ring;
};

TEST_F(SyclLayerRing, HasEntriesOf32BytesOnCacheLines) {
  is_asked_for(std::make_shared<int>());
  EXPECT_EQ(serv_memory::last_malloc().size, 32U);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 64U);
}

TEST_F(SyclLayerRing, FindsAQueueAsLongAsItLives) {
  const std::shared_ptr<const void> queue = std::make_shared<int>();
  EXPECT_TRUE(is_asked_for(queue));
  EXPECT_FALSE(is_asked_for(queue));
  EXPECT_FALSE(is_asked_for(queue));
  EXPECT_TRUE(is_asked_for(std::make_shared<int>()));
}

TEST_F(SyclLayerRing, AQueueAtTheAddressOfADeadOneIsAnotherQueue) {
  int place = 0;
  const auto keep = [](const int*) {};
  std::shared_ptr<const void> queue(&place, keep);
  EXPECT_TRUE(is_asked_for(queue));
  EXPECT_FALSE(is_asked_for(queue));
  queue.reset();
  queue = std::shared_ptr<const void>(&place, keep);
  EXPECT_TRUE(is_asked_for(queue));
  EXPECT_FALSE(is_asked_for(queue));
}

int control_blocks = 0;  // that live; with the object, until the last weak reference has gone

template <typename T>
struct counting_allocator {
  using value_type = T;
  counting_allocator() = default;
  template <typename U>
  counting_allocator(const counting_allocator<U>&) {}
  T* allocate(std::size_t n) {
    ++control_blocks;
    return std::allocator<T>().allocate(n);
  }
  void deallocate(T* block, std::size_t n) {
    --control_blocks;
    std::allocator<T>().deallocate(block, n);
  }
};

std::shared_ptr<const void> counted_queue() {
  return std::allocate_shared<int>(counting_allocator<int>());
}

TEST_F(SyclLayerRing, AnOverwrittenEntryGivesUpItsReferenceAndSoDoesAClearedOne) {
  control_blocks = 0;
  for (int i = 0; i < limit; ++i) {
    is_asked_for(counted_queue());
  }
  EXPECT_EQ(control_blocks, limit);  // the queues are dead, what is known of them is not
  for (int i = 0; i < 10; ++i) {
    is_asked_for(counted_queue());
  }
  EXPECT_EQ(control_blocks, limit);
  ring.clear();
  EXPECT_EQ(control_blocks, 0);
}

TEST_F(SyclLayerRing, KeepsNoQueueAlive) {
  auto queue = std::make_shared<int>();
  is_asked_for(queue);
  EXPECT_EQ(queue.use_count(), 1);
}

TEST_F(SyclLayerRing, ManyThreadsAtOnce) {
  std::vector<std::shared_ptr<const void>> queues;
  for (int i = 0; i < 64; ++i) {
    queues.push_back(std::make_shared<int>());
  }
  std::vector<std::thread> threads;
  std::atomic<int> wrong{0};
  for (int t = 0; t < 8; ++t) {
    threads.emplace_back([&, t] {
      for (int i = 0; i < 512; ++i) {
        const int at = (i * 7 + t) % 64;
        const auto found = ring.device_of(queues[static_cast<std::size_t>(at)],
                                          [at] { return std::optional<void*>(device_number(at)); });
        wrong += found != std::optional<void*>(device_number(at)) ? 1 : 0;
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(ring.count, 64);
}

}  // namespace
