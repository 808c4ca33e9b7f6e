// SPDX-License-Identifier: Apache-2.0
// A layer of programs and kernels that are numbers, and a suite over its table.
#pragma once

#include <atomic>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "../devices/serv_memory.hpp"
#include "kernel_cache.hpp"

struct counted_kernel {
  explicit counted_kernel(int name) : number(name) { ++living; }
  ~counted_kernel() { --living; }
  int number;
  inline static std::atomic<int> living{0};
};

struct number_layer {
  using context = int;
  using program = std::shared_ptr<int>;
  using kernel = std::unique_ptr<counted_kernel>;

  static program share(const program& present) {
    if (share_fails) {
      throw std::runtime_error("no reference");
    }
    return present;
  }
  static void give_back(int*, program last) { released.push_back(*last); }
  static void give_back_kernel(int* status, void* last) {
    *status = *status == 0 ? -1 : *status;
    released.push_back(-static_cast<counted_kernel*>(last)->number);
    delete static_cast<counted_kernel*>(last);
  }
  static bool table_made() {
    ++tables_made;
    return !table_fails;
  }

  inline static bool share_fails = false;
  inline static bool table_fails = false;
  inline static int tables_made = 0;
  inline static std::vector<int> released;  // programs, and kernels as negative numbers
};

inline void* device_at(std::uint64_t address) {
  return reinterpret_cast<void*>(address);
}

inline const kestrel::tarn::gpu::program_place<number_layer> here{device_at(0x5000), 7,
                                                                  TARN_GPU_BACKEND_OPENCL};

inline kestrel::tarn::gpu::kernel_key key_of(const char* name, const std::string& blob = "",
                                             int domain = 3) {
  return {domain, name, {blob.data(), blob.size()}};
}

class KernelCache : public testing::Test {
 protected:
  using cache_type = kestrel::tarn::gpu::kernel_cache<number_layer>;
  using place = cache_type::place;
  using kernel_key = kestrel::tarn::gpu::kernel_key;

  void SetUp() override {
    number_layer::share_fails = number_layer::table_fails = false;
    number_layer::tables_made = 0;
    number_layer::released.clear();
    blocks = serv_memory::live_blocks();
  }
  void TearDown() override {
    int status = 0;
    cache.clear(&status);
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
    EXPECT_EQ(counted_kernel::living, 0);
  }

  cache_type::entry* insert(const kernel_key& key, int number, const place& at = here) {
    return cache.insert(at, key, {}, std::make_shared<int>(number));
  }
  /// The number of a program; 0 for none.
  int found(const kernel_key& key, const place& at = here) {
    const auto program = cache.fetch(at, key, false);
    return program.where == nullptr ? 0 : *program.reference;
  }
  tarn_gpu_kernel_struct_t* add(cache_type::entry& where, int number) {
    return cache.add(where, std::make_unique<counted_kernel>(number));
  }
  /// The bucket of a key, first entry first.
  std::vector<int> chain(const kernel_key& key) {
    std::vector<int> numbers;
    const std::uint64_t bucket =
        kestrel::tarn::gpu::kernel_hash(here.device, key) % cache_type::bucket_total;
    for (auto* each = cache.buckets[bucket]; each != nullptr; each = each->bucket_next) {
      numbers.push_back(*each->program);
    }
    return numbers;
  }

  cache_type cache;
  std::int64_t blocks = 0;
};
