// SPDX-License-Identifier: Apache-2.0
// The table of programs and kernels, over programs and kernels that are numbers.
#include <algorithm>
#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "number_layer.hpp"

namespace {

using namespace kestrel::tarn::gpu;

TEST_F(KernelCache, ALookMakesNoTable) {
  EXPECT_EQ(found(key_of("k")), 0);
  EXPECT_EQ(cache.bucket_count, 0U);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  EXPECT_EQ(number_layer::tables_made, 0);
}

TEST_F(KernelCache, TheFirstInsertMakesIt) {
  const auto program = std::make_shared<int>(1);
  serv_memory::failure after_the_buckets(1);
  EXPECT_THROW(cache.insert(here, key_of("k"), {}, program), std::bad_alloc);
  ASSERT_EQ(cache.bucket_count, 1021U);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(cache.buckets) % 128, 0U);
  for (std::size_t i = 0; i < 1021; ++i) {
    ASSERT_EQ(cache.buckets[i], nullptr) << i;
  }
  EXPECT_EQ(serv_memory::live_blocks(), blocks + 1);
  EXPECT_EQ(number_layer::tables_made, 1);
  insert(key_of("k"), 2);
  EXPECT_EQ(number_layer::tables_made, 1);
  EXPECT_EQ(cache.count, 1U);
}

TEST_F(KernelCache, TheBucketsAre1021PointersAlignedTo128) {
  serv_memory::failure of_the_buckets(0);
  EXPECT_THROW(insert(key_of("k"), 1), std::bad_alloc);
  EXPECT_EQ(serv_memory::last_malloc().size, 1021U * 8);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 128U);
}

TEST_F(KernelCache, AnEntryIsAlignedTo16AndAHandleTo64) {
  insert(key_of("k"), 1);
  {
    serv_memory::failure of_the_entry(0);
    EXPECT_THROW(insert(key_of("l"), 1), std::bad_alloc);
    EXPECT_EQ(serv_memory::last_malloc().size, sizeof(cache_type::entry));
    EXPECT_EQ(serv_memory::last_malloc().alignment, 16U);
  }
  add(*insert(key_of("k"), 1), 5);
  EXPECT_EQ(serv_memory::last_malloc().size, 24U);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 64U);
}

TEST_F(KernelCache, ATableThatCannotBeAnnouncedIsNotMade) {
  number_layer::table_fails = true;
  EXPECT_THROW(insert(key_of("k"), 1), std::bad_alloc);
  EXPECT_EQ(cache.bucket_count, 0U);
  EXPECT_EQ(cache.buckets, nullptr);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  number_layer::table_fails = false;
  insert(key_of("k"), 1);
  EXPECT_EQ(number_layer::tables_made, 2);
  EXPECT_EQ(found(key_of("k")), 1);
}

TEST_F(KernelCache, EveryPartOfTheKeyCounts) {
  insert(key_of("k", "blob"), 1);
  EXPECT_EQ(found(key_of("k", "blob")), 1);
  EXPECT_EQ(found(key_of("l", "blob")), 0);
  EXPECT_EQ(found(key_of("k", "blog")), 0);
  EXPECT_EQ(found(key_of("k", "blo")), 0);
  EXPECT_EQ(found(key_of("k", "")), 0);
  EXPECT_EQ(found(key_of("k", "blob", 4)), 0);
  EXPECT_EQ(found(key_of("k", "blob"), {device_at(0x100005000), 7, here.backend}), 0);
  EXPECT_EQ(found(key_of("k", "blob"), {here.device, 8, here.backend}), 0);
  EXPECT_EQ(found(key_of("k", "blob"), {here.device, 7, TARN_GPU_BACKEND_LEVEL_ZERO}), 1);
}

TEST_F(KernelCache, KeysOfOneBucketStandInAChainTheLatestFirst) {
  std::vector<std::string> names;
  const std::uint64_t bucket = kernel_hash(here.device, key_of("a")) % 1021;
  for (int i = 0; names.size() < 5; ++i) {
    const std::string name = "n" + std::to_string(i);
    if (kernel_hash(here.device, key_of(name.c_str())) % 1021 == bucket) {
      names.push_back(name);
    }
  }
  for (std::size_t i = 0; i < names.size(); ++i) {
    insert(key_of(names[i].c_str()), static_cast<int>(i) + 1);
  }
  EXPECT_EQ(chain(key_of("a")), (std::vector<int>{5, 4, 3, 2, 1}));
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_EQ(found(key_of(names[i].c_str())), static_cast<int>(i) + 1);
  }
  EXPECT_EQ(found(key_of("a")), 0);
  EXPECT_EQ(cache.count, 5U);
}

TEST_F(KernelCache, ASelfNamingKeyIgnoresTheName) {
  insert(key_of("one", "\xFF\x01"), 1);
  EXPECT_EQ(found(key_of("other", "\xFF\x01")), 1);
  EXPECT_EQ(found(key_of(nullptr, "\xFF\x01")), 1);
  EXPECT_EQ(found(key_of("one", "\xFF\x02")), 0);
  EXPECT_STREQ(cache.fetch(here, key_of(nullptr, "\xFF\x01"), false).where->name, "one");
  insert(key_of(nullptr, "\xFF\x03"), 2);
  EXPECT_EQ(cache.fetch(here, key_of("x", "\xFF\x03"), false).where->name, nullptr);
}

TEST_F(KernelCache, BytesBeyondThe64thSeparateKeysOfOneBucket) {
  const std::string one = std::string(64, 'x') + "1";
  const std::string other = std::string(64, 'x') + "2";
  insert(key_of("k", one), 1);
  insert(key_of("k", other), 2);
  EXPECT_EQ(found(key_of("k", one)), 1);
  EXPECT_EQ(found(key_of("k", other)), 2);
  EXPECT_EQ(chain(key_of("k", one)), (std::vector<int>{2, 1}));
}

TEST_F(KernelCache, AKeyMayHoldZeros) {
  insert(key_of("k", std::string("a\0b", 3)), 1);
  EXPECT_EQ(found(key_of("k", std::string("a\0b", 3))), 1);
  EXPECT_EQ(found(key_of("k", std::string("a\0c", 3))), 0);
  EXPECT_EQ(found(key_of("k", "a")), 0);
}

TEST_F(KernelCache, WhatItKeepsIsItsOwn) {
  std::string name = "name";
  std::string blob = "blob";
  std::string payload = "payload";
  auto* const where = cache.insert(here, key_of(name.c_str(), blob),
                                   {payload.data(), payload.size()}, std::make_shared<int>(1));
  name = blob = payload = "--------";
  EXPECT_EQ(found(key_of("name", "blob")), 1);
  EXPECT_EQ(std::string(where->payload, where->payload_len), "payload");
  EXPECT_STREQ(where->name, "name");
}

TEST_F(KernelCache, TheSecondBuildersProgramReplacesTheFirst) {
  const auto first = std::make_shared<int>(1);
  auto* const where = cache.insert(here, key_of("k"), {"early", 5}, first);
  tarn_gpu_kernel_struct_t* const kernel = add(*where, 9);
  EXPECT_EQ(first.use_count(), 2);
  EXPECT_EQ(cache.insert(here, key_of("k"), {"late", 4}, std::make_shared<int>(2)), where);
  EXPECT_EQ(first.use_count(), 1);
  EXPECT_EQ(found(key_of("k")), 2);
  EXPECT_EQ(cache.count, 1U);
  EXPECT_EQ(std::string(where->payload, where->payload_len), "early");
  EXPECT_EQ(where->kernels, kernel);
}

TEST_F(KernelCache, AKernelIsTakenGivenBackAndTakenAgain) {
  auto& where = *insert(key_of("k"), 1);
  tarn_gpu_kernel_struct_t* const kernel = add(where, 9);
  EXPECT_EQ(kernel->state, 1U);
  EXPECT_EQ(cache.fetch(here, key_of("k"), true).kernel, nullptr);
  int status = 0;
  for (int round = 0; round < 3; ++round) {
    release_handle<number_layer>(&status, kernel);
    EXPECT_EQ(kernel->state, 0U);
    EXPECT_EQ(cache.fetch(here, key_of("k"), false).kernel, nullptr);
    EXPECT_EQ(kernel->state, 0U);
    const auto taken = cache.fetch(here, key_of("k"), true);
    EXPECT_EQ(taken.kernel, kernel);
    EXPECT_EQ(taken.reference, nullptr);
    EXPECT_EQ(kernel->state, 1U);
  }
  EXPECT_EQ(status, 0);
}

TEST_F(KernelCache, TheFirstFreeKernelOfTheListIsTaken) {
  auto& where = *insert(key_of("k"), 1);
  tarn_gpu_kernel_struct_t* const one = add(where, 1);
  tarn_gpu_kernel_struct_t* const two = add(where, 2);
  tarn_gpu_kernel_struct_t* const three = add(where, 3);
  EXPECT_EQ(where.kernels, three);
  EXPECT_EQ(three->next, two);
  int status = 0;
  release_handle<number_layer>(&status, one);
  release_handle<number_layer>(&status, two);
  EXPECT_EQ(cache.fetch(here, key_of("k"), true).kernel, two);
  EXPECT_EQ(cache.fetch(here, key_of("k"), true).kernel, one);
  EXPECT_EQ(cache.fetch(here, key_of("k"), true).kernel, nullptr);
}

TEST_F(KernelCache, AReleaseIsAPlainStoreWithoutTheLock) {
  tarn_gpu_kernel_struct_t* const kernel = add(*insert(key_of("k"), 1), 9);
  const serv_lock held(&cache.lock);
  int status = 0;
  release_handle<number_layer>(&status, kernel);  // would wait for ever if it took the lock
  EXPECT_EQ(kernel->state, 0U);
}

TEST_F(KernelCache, APrivateHandleGoesWithItsRelease) {
  tarn_gpu_kernel_struct_t* const kernel =
      cache_type::make_handle(std::make_unique<counted_kernel>(9), TARN_GPU_KERNEL_PRIVATE);
  EXPECT_EQ(kernel->state, 2U);
  EXPECT_EQ(serv_memory::live_blocks(), blocks + 1);
  int status = 0;
  release_handle<number_layer>(&status, kernel);
  EXPECT_EQ(status, -1);  // what the layer says of the kernel
  EXPECT_EQ(number_layer::released, std::vector<int>{-9});
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
}

TEST_F(KernelCache, NoHandleIsReleasedForNull) {
  int status = 0;
  release_handle<number_layer>(&status, nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(number_layer::released.empty());
}

TEST_F(KernelCache, AnyFailedAllocationLeavesItAsItWas) {
  insert(key_of("first"), 1);
  const std::int64_t before = serv_memory::live_blocks();
  const auto program = std::make_shared<int>(2);
  int failures = 0;
  for (bool failed = true; failed; ++failures) {
    const serv_memory::failure failure(failures);
    try {
      cache.insert(here, key_of("k", "blob"), {"payload", 7}, program);
    } catch (const std::bad_alloc&) {
      ASSERT_TRUE(failure.happened());
      ASSERT_EQ(serv_memory::live_blocks(), before);
      ASSERT_EQ(program.use_count(), 1);
      ASSERT_EQ(cache.count, 1U);
      ASSERT_EQ(found(key_of("k", "blob")), 0);
    }
    failed = failure.happened();
  }
  EXPECT_EQ(failures, 5);  // the entry, its name, key and payload; then there is none
  EXPECT_EQ(found(key_of("k", "blob")), 2);
}

TEST_F(KernelCache, AKernelWithoutAHandleGoes) {
  auto& where = *insert(key_of("k"), 1);
  const serv_memory::failure failure(0);
  EXPECT_THROW(add(where, 9), std::bad_alloc);
  EXPECT_EQ(counted_kernel::living, 0);
  EXPECT_EQ(where.kernels, nullptr);
}

TEST_F(KernelCache, AFailedReferenceLeavesItAsItWas) {
  auto& where = *insert(key_of("k"), 1);
  number_layer::share_fails = true;
  EXPECT_THROW(insert(key_of("l"), 2), std::runtime_error);
  EXPECT_THROW(insert(key_of("k"), 2), std::runtime_error);
  EXPECT_THROW(cache.fetch(here, key_of("k"), true), std::runtime_error);
  number_layer::share_fails = false;
  EXPECT_EQ(cache.count, 1U);
  EXPECT_EQ(found(key_of("k")), 1);
  EXPECT_EQ(where.kernels, nullptr);
}

TEST_F(KernelCache, IsClearedBucketByBucketAProgramBeforeItsKernels) {
  struct row {
    std::uint64_t bucket;
    int number;
  };
  std::vector<row> rows;
  for (int i = 1; i <= 20; ++i) {
    const std::string name = "kernel" + std::to_string(i * i);
    const kernel_key key = key_of(name.c_str());
    auto& where = *insert(key, i);
    add(where, 100 + i);
    add(where, 200 + i);
    rows.push_back({kernel_hash(here.device, key) % 1021, i});
  }
  std::stable_sort(rows.begin(), rows.end(), [](const row& a, const row& b) {
    // In a chain the latest stands first.
    return a.bucket != b.bucket ? a.bucket < b.bucket : a.number > b.number;
  });
  std::vector<int> expected;
  for (const row& each : rows) {
    expected.insert(expected.end(), {each.number, -(200 + each.number), -(100 + each.number)});
  }
  int status = 0;
  cache.clear(&status);
  EXPECT_EQ(number_layer::released, expected);
  EXPECT_EQ(status, -1);
  EXPECT_EQ(cache.bucket_count, 0U);
  EXPECT_EQ(cache.count, 0U);
  EXPECT_EQ(cache.buckets, nullptr);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
  insert(key_of("k"), 1);
  EXPECT_EQ(number_layer::tables_made, 2);
  EXPECT_EQ(found(key_of("k")), 1);
}

TEST_F(KernelCache, TenThreadsShareAHundredPrograms) {
  constexpr int programs = 100;
  constexpr int rounds = 1000;
  constexpr int threads = 10;
  std::vector<std::string> names;
  for (int i = 0; i < programs; ++i) {
    names.push_back("k" + std::to_string(i));
  }
  std::atomic<int> wrong{0};
  const auto work = [&](int start) {
    for (int i = 0; i < rounds * programs; ++i) {
      const int number = (start + i) % programs;
      const kernel_key key = key_of(names[static_cast<std::size_t>(number)].c_str());
      auto taken = cache.fetch(here, key, true);
      if (taken.where == nullptr) {
        taken.where = insert(key, number);
      }
      if (taken.kernel == nullptr) {
        taken.kernel = add(*taken.where, number);
      }
      auto* const kernel = static_cast<counted_kernel*>(taken.kernel->kernel);
      const int before = std::exchange(kernel->number, -1);  // a race if somebody else has it
      wrong += before != number || taken.kernel->state != 1 ? 1 : 0;
      kernel->number = number;
      int status = 0;
      release_handle<number_layer>(&status, taken.kernel);
    }
  };
  std::vector<std::thread> all;
  for (int t = 0; t < threads; ++t) {
    all.emplace_back(work, t * programs / threads);
  }
  for (std::thread& thread : all) {
    thread.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(cache.count, static_cast<std::uint64_t>(programs));
  for (int i = 0; i < programs; ++i) {
    ASSERT_EQ(*cache.fetch(here, key_of(names[static_cast<std::size_t>(i)].c_str()), false)
                   .where->program,
              i);
  }
}

}  // namespace
