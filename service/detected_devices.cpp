// SPDX-License-Identifier: Apache-2.0
// The list of GPUs, filled once and kept until the process ends.
#include "detected_devices.hpp"

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <string>
#include <tarn_serv.h>
#include <vector>

#include "level_zero_binding.hpp"
#include "opencl_binding.hpp"
#include "report_text.hpp"
#include "serv_lock.hpp"
#include "sycl_extensions.hpp"
#include "tarn_sycl_device.hpp"

namespace kestrel::tarn::gpu {
namespace {

std::vector<sycl::device> detected_device_list;  // written once, before `detected_reported`
std::atomic<std::uint32_t> detected_reported{0};
int report_lock = 0;

const char* display_name(tarn_gpu_arch_t architecture) {
  switch (architecture) {
    case TARN_GPU_ARCH_FIR:
      return "Brine(R)_Fir";
    case TARN_GPU_ARCH_ELM:
      return "Brine(R)_Elm";
    case TARN_GPU_ARCH_ASH:
      return "Brine(R)_Ash";
    case TARN_GPU_ARCH_OAK:
      return "Brine(R)_Oak";
    case TARN_GPU_ARCH_YEW:
      return "Brine(R)_Yew";
    case TARN_GPU_ARCH_PINE:
      return "Brine(R)_Pine";
    case TARN_GPU_ARCH_LARCH:
      return "Brine(R)_Larch";
    default:
      return "Unknown_GPU";
  }
}

const char* display_name(tarn_gpu_backend_t backend) {
  switch (backend) {
    case TARN_GPU_BACKEND_OPENCL:
      return "OpenCL";
    case TARN_GPU_BACKEND_LEVEL_ZERO:
      return "Level_Zero";
    default:
      return "Unknown_backend";
  }
}

/// A function of a driver that cannot be bound ends the process when it is called; a report only
/// tells less.
bool can_be_asked(const sycl::queue& queue) {
  switch (service::code_of(queue.get_backend())) {
    case service::backend_code::opencl:
      return bind_opencl() == 0;
    case service::backend_code::level_zero:
      return bind_level_zero() == 0;
    default:
      return true;
  }
}

void append_line(report_text& text, std::size_t number, sycl::queue& queue) {
  constexpr char line[] =
      "TARN_VERBOSE Detected GPU%zu %s Backend:%s VE:%d Stack:%d maxWGsize:%d\n";
  if (!can_be_asked(queue)) {
    const bool is_opencl = service::code_of(queue.get_backend()) == service::backend_code::opencl;
    text.append(line, number, display_name(TARN_GPU_ARCH_UNKNOWN),
                display_name(is_opencl ? TARN_GPU_BACKEND_OPENCL : TARN_GPU_BACKEND_LEVEL_ZERO), 0,
                1, 0);
    return;
  }
  int status = 0;
  text.append(line, number, display_name(get_architecture(&status, &queue)),
              display_name(get_backend(&queue)), get_eu_count(&queue), get_tile_count(&queue),
              tarn_gpu_get_max_workgroup_size(&queue));
}

}  // namespace

void report_detected_devices(const sycl::queue& queue) {
  if (detected_reported.load(std::memory_order_acquire) != 0) {
    return;
  }
  const serv_lock hold(&report_lock);
  if (detected_reported.load(std::memory_order_relaxed) != 0) {
    return;
  }
  std::vector<sycl::device> kept;
  report_text text;
  for (const sycl::device& device : sycl::device::get_devices(sycl::info::device_type::gpu)) {
    // SYCL's backends: the services' own know the devices of all others as one.
    sycl::queue of_device(device);
    if (of_device.get_backend() == queue.get_backend()) {
      append_line(text, kept.size(), of_device);
      kept.push_back(device);
    }
  }
  tarn_serv_print_verbose_text((text.c_str() + std::string("\n")).c_str());
  detected_device_list = std::move(kept);
  detected_reported.store(1, std::memory_order_release);
}

int detected_position(const sycl::device& device) {
  const auto vendor = device.get_info<sycl::info::device::vendor_id>();
  const auto found = std::find_if(detected_device_list.begin(), detected_device_list.end(),
                                  [vendor](const sycl::device& gpu) {
                                    return gpu.get_info<sycl::info::device::vendor_id>() == vendor;
                                  });
  return found == detected_device_list.end()
             ? -1
             : static_cast<int>(found - detected_device_list.begin());
}

}  // namespace kestrel::tarn::gpu
