// SPDX-License-Identifier: Apache-2.0
// Prints verbose reports, one for each argument: what is printed once per process needs a process
// for each case.
//
//   cpu, gpu, opencl, level_zero        a report of half a second on such a queue
//   level_zero:2                        on the device with that number
//   timed:opencl                        with an event of the queue, which fills memory
//   threads                             16 reports on CPU queues, one from each of 16 threads
//   iface:1                             set_verbose_gpu_iface(1)
//   remove:file                         removes the file
//   ip_version:0x03000000               of all OpenCL devices
//   devices:vendor,ip_version,tiles...  the devices of the Level Zero driver, three numbers each
#include <atomic>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <sstream>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "level_zero_driver.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"
#include "verbose.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

constexpr unsigned ip_version_query = 0x4250;  // of clGetDeviceInfo

sycl::backend backend_called(const std::string& name) {
  return name == "opencl"       ? sycl::backend::opencl
         : name == "level_zero" ? sycl::backend::ext_kestrel_level_zero
                                : sycl::backend::host;
}

sycl::queue queue_of(const std::string& name, std::size_t number) {
  const sycl::property_list timed{sycl::property::queue::enable_profiling{}};
  if (name == "cpu") {
    return sycl::queue(sycl::cpu_selector_v, timed);
  }
  for (const sycl::device& device : sycl::device::get_devices(sycl::info::device_type::gpu)) {
    if (device.get_backend() == backend_called(name) && number-- == 0) {
      return sycl::queue(device, timed);
    }
  }
  throw std::invalid_argument("no such device: " + name);
}

void report(sycl::queue queue, const std::string& name) {
  gpu::print_verbose_gpu_info(&queue, (name + " call").c_str(), 0.5);
}

void report_timed(const std::string& name) {
  constexpr std::size_t size = 1 << 20;
  sycl::queue queue = queue_of(name, 0);
  auto* const memory = sycl::malloc_device<unsigned char>(size, queue);
  sycl::event filled = queue.memset(memory, 1, size);
  filled.wait();
  gpu::verbose_register_event(filled);
  report(queue, name);
  sycl::free(memory, queue);
}

// All at the same time, as far as processors go.
void report_from_threads() {
  constexpr int threads = 16;
  std::atomic<int> missing{threads};
  std::vector<std::thread> team;
  for (int t = 0; t < threads; ++t) {
    team.emplace_back([&missing] {
      const sycl::queue queue = queue_of("cpu", 0);
      for (--missing; missing != 0;) {
        std::this_thread::yield();
      }
      report(queue, "cpu");
    });
  }
  for (std::thread& member : team) {
    member.join();
  }
}

std::uint32_t number_of(const std::string& text) {
  return static_cast<std::uint32_t>(std::stoul(text, nullptr, 0));
}

void set_devices(const std::string& list) {
  std::istringstream numbers(list);
  std::vector<level_zero_driver::device_description> devices;
  for (std::string vendor, version, tiles; std::getline(numbers, vendor, ',') &&
                                           std::getline(numbers, version, ',') &&
                                           std::getline(numbers, tiles, ',');) {
    devices.emplace_back();
    devices.back().vendor_id = number_of(vendor);
    devices.back().ip_version = number_of(version);
    devices.back().sub_devices = number_of(tiles);
  }
  level_zero_driver::devices(devices);
}

void act(const std::string& argument) {
  const std::size_t colon = argument.find(':');
  const std::string name = argument.substr(0, colon);
  const std::string value = colon == std::string::npos ? "" : argument.substr(colon + 1);
  if (name == "threads") {
    report_from_threads();
  } else if (name == "timed") {
    report_timed(value);
  } else if (name == "iface") {
    gpu::set_verbose_gpu_iface(std::stoi(value));
  } else if (name == "remove") {
    std::remove(value.c_str());
  } else if (name == "ip_version") {
    static_cast<void>(opencl_loader::first_gpu());  // loads the layer, which then forgets answers
    opencl_layer::answer(ip_version_query, number_of(value));
  } else if (name == "devices") {
    set_devices(value);
  } else {
    report(queue_of(name, value.empty() ? 0 : std::stoul(value)), name);
  }
}

}  // namespace

int main(int argc, char** argv) {
  try {
    for (int i = 1; i < argc; ++i) {
      act(argv[i]);
    }
  } catch (const std::exception& error) {
    std::fprintf(stderr, "%s\n", error.what());
    return 1;
  }
  return 0;
}
