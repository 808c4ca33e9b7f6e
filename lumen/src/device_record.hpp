// SPDX-License-Identifier: Apache-2.0
// The records behind devices and platforms. They are made once, at the first enumeration, and
// live as long as the process, so handles to them are plain pointers.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "sycl/detail/device.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class backend_driver;
struct memory_place;

// One answer for each row of the list of device queries.
struct device_properties {
#define LUMEN_DEVICE_INFO(name, type) type name{};
#include "sycl/detail/info_device.def"
#undef LUMEN_DEVICE_INFO
};

struct platform_record {
  sycl::backend kind = sycl::backend::host;
  std::string name;
  std::string vendor;
  std::string version;
  std::string profile;
  std::vector<std::string> extensions;
  void* native = nullptr;  // the platform's own handle; null where there is none
};

struct device_record {
  device_properties properties;
  backend_driver* driver = nullptr;
  const platform_record* platform = nullptr;
  // What the default selector rates the device: a GPU 200, the host 100, virtual devices less.
  int default_rating = 0;
  // Which device of its platform it is.
  int number = 0;
  // Whether its commands go through a stream while the host goes on, and buffers have a copy in
  // its memory.
  bool detached = false;
  // The platform's own handle; null where there is none.
  void* native = nullptr;
  // Of a sub-device.
  const device_record* parent = nullptr;
  // Null where the memory belongs to contexts.
  std::shared_ptr<memory_place> place;

  static const device_record& of(const device& dev) { return *dev.record_; }
  static device handle(const device_record& record) { return device(&record); }
};

// Devices of the backends that run kernels of this program, in the order of their enumeration.
const std::vector<const device_record*>& own_devices();
// Devices that run native kernels only. Asking for them loads their drivers, which takes a while.
const std::vector<const device_record*>& native_devices();

}  // namespace detail
LUMEN_NAMESPACE_END
