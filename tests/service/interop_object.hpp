// SPDX-License-Identifier: Apache-2.0
// Interop objects for the suites of the interop cache: the properties of one in one place.
#pragma once

#include <cstdint>
#include <thread>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "interop_cache.hpp"
#include "omptarget.hpp"
#include "sycl_extensions.hpp"

namespace tarn_test {

namespace gpu = kestrel::tarn::gpu;

constexpr int context_property = 5;
constexpr int device_property = 6;
constexpr int queue_property = 7;
constexpr int kind_property = 8;
constexpr int device_of_kind_2_property = 9;
constexpr int in_order_property = 10;

struct native_handles {
  void* device;
  void* context;
  void* queue;
};

/// An interop object with all the properties of its kind.
class interop_object : public omptarget::interop {
 public:
  interop_object(std::uintptr_t kind, const native_handles& handles) {
    set_native(kind_property, reinterpret_cast<void*>(kind));
    set_native(kind == 2 ? device_of_kind_2_property : device_property, handles.device);
    set_native(context_property, handles.context);
    set_native(queue_property, handles.queue);
  }
};

inline sycl::queue* queue_of(const omptarget::interop& object) {
  return gpu::lookup_and_cache_lumen_queue_and_context(object.handle());
}

/// What several threads get that ask for an object's queue at the same time.
inline std::vector<sycl::queue*> queues_of_threads(const omptarget::interop& object, int threads) {
  std::vector<sycl::queue*> found(static_cast<std::size_t>(threads), nullptr);
  std::vector<std::thread> team;
  for (sycl::queue*& mine : found) {
    team.emplace_back([&object, &mine] { mine = queue_of(object); });
  }
  for (std::thread& member : team) {
    member.join();
  }
  return found;
}

inline void expect_not_exposed(const omptarget::interop& object) {
  try {
    queue_of(object);
    ADD_FAILURE() << "the device was found";
  } catch (const sycl::exception& error) {
    EXPECT_EQ(error.code(), sycl::make_error_code(sycl::errc::invalid));
    EXPECT_EQ(error.code().value(), 8);
    EXPECT_STREQ(error.what(), "Native device isn't exposed to SYCL.");
  }
}

}  // namespace tarn_test
