// SPDX-License-Identifier: Apache-2.0
// The environment variables of lumen, read once each. A malformed value is reported on the error
// stream with its place and then counts as not given.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// LUMEN_NUM_THREADS: 1 to 4096, otherwise the number of hardware threads.
unsigned number_of_threads();

// One device of LUMEN_VIRTUAL_DEVICES.
struct virtual_device_setting {
  bool is_gpu = true;
  std::uint32_t compute_units = 0;      // 0: as the host
  std::size_t max_work_group_size = 0;  // 0: as the host
  bool own_memory = false;              // buffers have a copy there; commands go through a stream
};

struct virtual_device_parse {
  std::vector<virtual_device_setting> devices;
  std::string error;       // empty when the text is well formed
  std::size_t column = 0;  // of the error, from 1
};

// kind[,setting=number]... joined by ';'. Kinds: gpu, accelerator. Settings: compute_units
// (1 to 65536; no kernel of the device has more threads), max_work_group_size (1 to 4096), memory
// (own: as a GPU with memory of its own has it).
virtual_device_parse parse_virtual_devices(const std::string& text);
const std::vector<virtual_device_setting>& virtual_devices_from_environment();

// LUMEN_CUDA_SHARED=managed: shared allocations on CUDA devices are managed memory, which moves
// between host and device by pages, otherwise (pinned) memory of the host that the device reaches.
bool cuda_shared_is_managed();

// The optional backends that are used: LUMEN_BACKENDS, a list of virtual, cuda, opencl and
// level_zero separated by ';'. All where it is not set.
struct backend_choice {
  bool virtual_devices = false;
  bool cuda = false;
  bool opencl = false;
  bool level_zero = false;
};
struct backend_parse {
  backend_choice choice;
  std::string error;  // empty: none
  std::size_t column = 0;
};
backend_parse parse_backends(const std::string& text);
backend_choice backends_from_environment();

}  // namespace detail
LUMEN_NAMESPACE_END
