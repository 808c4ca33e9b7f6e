// SPDX-License-Identifier: Apache-2.0
// What there is on this machine: the devices that programs see, the versions of the library's parts
// that are loaded, the threads, and the instruction set that the host kernels use. To be put into
// reports of bugs.
//
// Build: g++ -std=c++17 show_devices.cpp $(pkg-config --cflags --libs tarn_rng) -o show_devices
#include <array>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <exception>
#include <link.h>
#include <stdexcept>
#include <string>
#include <tarn_version.h>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;
namespace device_info = sycl::info::device;

const char* kind_of(const sycl::device& device) {
  return device.is_cpu()           ? "CPU"
         : device.is_gpu()         ? "GPU"
         : device.is_accelerator() ? "accelerator"
                                   : "other";
}

void show(const sycl::device& device) {
  const auto mib = device.get_info<device_info::global_mem_size>() >> 20;
  std::printf("%s\n", device.get_info<device_info::name>().c_str());
  std::printf("  kind           %s\n", kind_of(device));
  std::printf("  platform       %s\n",
              device.get_platform().get_info<sycl::info::platform::name>().c_str());
  std::printf("  driver         %s\n", device.get_info<device_info::driver_version>().c_str());
  std::printf("  compute units  %u\n", device.get_info<device_info::max_compute_units>());
  std::printf("  work-group     %zu items at most\n",
              device.get_info<device_info::max_work_group_size>());
  std::printf("  memory         %llu MiB\n", static_cast<unsigned long long>(mib));
  std::printf("  USM           %s%s%s%s\n",
              device.has(sycl::aspect::usm_device_allocations) ? " device" : "",
              device.has(sycl::aspect::usm_host_allocations) ? " host" : "",
              device.has(sycl::aspect::usm_shared_allocations) ? " shared" : "",
              device.has(sycl::aspect::usm_system_allocations) ? " system" : "");
  std::printf("  double         %s\n", device.has(sycl::aspect::fp64) ? "yes" : "no");
}

// The files of the library that this process has loaded; their names end with the version.
std::vector<std::string> loaded_parts() {
  std::vector<std::string> files;
  dl_iterate_phdr(
      [](dl_phdr_info* object, std::size_t, void* list) {
        const std::string file = object->dlpi_name;
        if (file.find("/libtarn_") != std::string::npos) {
          std::array<char, PATH_MAX> whole{};
          static_cast<std::vector<std::string>*>(list)->push_back(
              realpath(file.c_str(), whole.data()) != nullptr ? whole.data() : file);
        }
        return 0;
      },
      &files);
  return files;
}

// A function of a loaded library. These are no calls for programs, and no installed header
// declares them; they are exported for reports such as this one.
template <class Function>
Function* find(const std::string& library, const char* name) {
  void* const module = dlopen(library.c_str(), RTLD_NOW | RTLD_NOLOAD);
  void* const found = module == nullptr ? nullptr : dlsym(module, name);
  if (found == nullptr) {
    throw std::runtime_error(library + " has no " + name);
  }
  return reinterpret_cast<Function*>(found);
}

// Draws on the processor: this loads the statistics library, which chooses its instruction set.
void draw() {
  sycl::queue queue{sycl::cpu_selector_v};
  rng::philox4x32x10 engine(queue, 42);
  std::array<float, 4096> values{};
  rng::generate(rng::uniform<float>(), engine, values.size(), values.data()).wait_and_throw();
}

// Whether all parts are of the version that this program was compiled for.
bool show_library() {
  draw();
  bool same = true;
  std::printf("Tarn RNG\n  headers        " TARN_VERSION "\n");
  for (const std::string& file : loaded_parts()) {
    const std::string ending = ".so." TARN_VERSION;
    const bool right = file.compare(file.size() - ending.size(), ending.size(), ending) == 0;
    std::printf("  loaded         %s%s\n", file.c_str(), right ? "" : ": ANOTHER VERSION");
    same = same && right;
    if (file.find("/libtarn_core.") != std::string::npos) {
      std::printf("  threads        %d at most\n",
                  find<int()>(file, "tarn_serv_get_max_threads")());
    } else if (file.find("/libtarn_vlx.") != std::string::npos) {
      // By its name in Highway.
      std::printf("  SIMD target    %s\n", find<const char*()>(file, "__rvxGetSimdTarget")());
    }
  }
  return same;
}

}  // namespace

int main() {
  try {
    for (const sycl::device& device : sycl::device::get_devices()) {
      show(device);
    }
    return show_library() ? EXIT_SUCCESS : EXIT_FAILURE;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "show_devices: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
