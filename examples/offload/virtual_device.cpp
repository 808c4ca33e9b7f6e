// SPDX-License-Identifier: Apache-2.0
// An interop object of the offload runtime's double that names a queue on a virtual GPU, as the
// runtime of an OpenMP compiler would name one of its own.
#include "virtual_device.h"

#include <cstdint>
#include <cstdio>
#include <exception>

#include <sycl/sycl.hpp>

#include "omptarget.hpp"

namespace {

// Properties of an interop object, by the numbers that the runtime has for them.
enum property : int { foreign_runtime = -1, context = 5, queue = 7, kind = 8, device = 9 };

// It lives as long as the process, since the library keeps what it makes over native handles.
sycl::queue& gpu() {
  static auto* const found = new sycl::queue(sycl::gpu_selector_v);
  return *found;
}

}  // namespace

void* device_interop() {
  try {
    const sycl::queue& on = gpu();
    const omptarget::controls& runtime = omptarget::get();
    void* const object = runtime.make();
    const auto set = [&](property which, void* value) {
      runtime.set_native(object, which, 0, value);
    };
    runtime.set_int(object, foreign_runtime, 6);  // Level Zero, whose handles are plain pointers
    set(kind, reinterpret_cast<void*>(std::uintptr_t{2}));  // the same, by the runtime's own number
    set(device, sycl::detail::native_of(on.get_device()));
    set(context, sycl::detail::native_of(on.get_context()));
    set(queue, sycl::detail::native_of(on));
    return object;
  } catch (const std::exception& missing) {
    std::fprintf(stderr, "no virtual device: %s\n", missing.what());
    return nullptr;
  }
}

void device_release(void* object) {
  omptarget::get().end(object);
}

void* device_alloc(std::size_t bytes) {
  return sycl::malloc_device(bytes, gpu());
}

void device_free(void* memory) {
  sycl::free(memory, gpu());
}

void device_read(void* host, const void* memory, std::size_t bytes) {
  gpu().memcpy(host, memory, bytes).wait();
}
