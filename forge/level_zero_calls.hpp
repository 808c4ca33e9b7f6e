// SPDX-License-Identifier: Apache-2.0
// The calls of Level Zero that this folder makes, handed in as those of OpenCL are.
#pragma once

#include <cstdint>

#include <level_zero/ze_api.h>

namespace kestrel::tarn::forge {

/// Each member has the name and the type of the function that it stands for, and is never null.
struct level_zero_calls {
  decltype(&::zeDeviceGetProperties) zeDeviceGetProperties;
  decltype(&::zeModuleCreate) zeModuleCreate;
  decltype(&::zeModuleGetNativeBinary) zeModuleGetNativeBinary;
  decltype(&::zeModuleDestroy) zeModuleDestroy;
};

/// ze_device_ip_version_ext_t of Level Zero (extension "Device IP Version"),
/// which headers of API version 1.4 do not have yet. Hangs in the pNext of the device properties.
struct device_ip_version_ext {
  ze_structure_type_t stype = static_cast<ze_structure_type_t>(0x1000F);
  const void* pNext = nullptr;
  std::uint32_t ipVersion = 0;
};

}  // namespace kestrel::tarn::forge
