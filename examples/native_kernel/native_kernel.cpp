// SPDX-License-Identifier: Apache-2.0
// A native kernel on a SYCL queue, by the device services of the library: OpenCL C that is built
// once for a device and found in the cache from then on, launched on unified shared memory.
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <numeric>
#include <optional>
#include <vector>

#include <kestrel/tarn/gpu/device_info.hpp>
#include <kestrel/tarn/gpu/kernel.hpp>
#include <kestrel/tarn/gpu/launch.hpp>
#include <sycl/sycl.hpp>

namespace gpu = kestrel::tarn::gpu;

namespace {

// One step of a congruential generator for every item.
constexpr const char* source = R"(
  kernel void advance(global uint* x, uint factor) {
    const size_t i = get_global_id(0);
    x[i] = factor * x[i] + 1;
  }
)";
constexpr std::uint32_t factor = 69069;
constexpr std::size_t items = 1 << 16;
constexpr std::size_t group = 64;
constexpr int steps = 10;
constexpr int no_domain = 0;  // only sibling libraries have numbers of their own

using words = std::vector<std::uint32_t>;

// A queue on the first GPU whose kernels are native ones of OpenCL.
std::optional<sycl::queue> find_queue() {
  for (const sycl::device& device : sycl::device::get_devices(sycl::info::device_type::gpu)) {
    sycl::queue queue(device);
    tarn_gpu_device_info_t info;
    gpu::get_device_info(&queue, &info);
    if (info.backend == TARN_GPU_BACKEND_OPENCL) {
      return queue;
    }
  }
  return std::nullopt;
}

// Every launch waits for the one before it. Returns the event of the last.
sycl::event* launch_steps(sycl::queue& queue, void* kernel, void* numbers) {
  int status = 0;  // stays 0 in this layer: what fails is thrown
  tarn_gpu_argument_t args[2];
  gpu::tarn_gpu_set_usm_arg(&args[0], numbers);
  gpu::set_scalar_arg_internal(&args[1], &factor, sizeof factor);
  sycl::event* last = nullptr;
  for (int i = 0; i < steps; ++i) {
    const tarn_gpu_event_list_t before{&last, last == nullptr ? 0 : 1, 0};
    sycl::event* const launched =
        gpu::launch_kernel_1D_usm(&status, &queue, kernel, args, items, group, &before);
    gpu::release_event_usm(&status, last);
    last = launched;
  }
  return last;
}

words run(sycl::queue& queue, const words& start) {
  int status = 0;
  const std::size_t bytes = start.size() * sizeof start[0];
  tarn_gpu_kernel_struct_t* const handle =
      gpu::get_OCL_kernel(&status, &queue, no_domain, source, "advance", "");
  void* const numbers = gpu::alloc_temp_buffer_usm(&status, &queue, bytes);
  queue.memcpy(numbers, start.data(), bytes).wait();
  sycl::event* const last = launch_steps(queue, handle->kernel, numbers);
  gpu::host_wait_usm(&status, last);
  gpu::release_event_usm(&status, last);
  words result(start.size());
  queue.memcpy(result.data(), numbers, bytes).wait();
  gpu::free_buffer_usm(&status, numbers, &queue);
  gpu::release_kernel(&status, handle);  // back to the cache
  return result;
}

words run_on_host(words numbers) {
  for (int i = 0; i < steps; ++i) {
    std::transform(numbers.begin(), numbers.end(), numbers.begin(),
                   [](std::uint32_t x) { return factor * x + 1; });
  }
  return numbers;
}

}  // namespace

int main() {
  try {
    std::optional<sycl::queue> queue = find_queue();
    if (!queue) {
      std::printf("skipped: there is no GPU of OpenCL\n");
      return 0;
    }
    words start(items);
    std::iota(start.begin(), start.end(), 0u);
    const words built = run(*queue, start);
    const words found = run(*queue, start);  // the kernel comes from the cache
    const bool right = built == run_on_host(start) && found == built;
    std::printf("%d launches over %zu items: %s\n", 2 * steps, items, right ? "right" : "wrong");
    return right ? 0 : 1;
  } catch (const sycl::exception& error) {
    std::printf("failed: %s\n", error.what());
    return 1;
  }
}
