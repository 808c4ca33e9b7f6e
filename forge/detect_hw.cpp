// SPDX-License-Identifier: Apache-2.0
// Detection: the driver's own word first, then what its compiler writes into a binary.
#include "detect_hw.hpp"

#include <algorithm>
#include <cstddef>

#include "exceptions.hpp"
#include "hw_detect_module.hpp"
#include "opencl_program.hpp"
#include "parse_binary.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr cl_device_info device_ip_version = 0x4250;  // a query of the vendor, 4 bytes

void check(ze_result_t status) {
  if (status != ZE_RESULT_SUCCESS) {
    throw level_zero_error(status);
  }
}

/// 0 if the driver does not know.
std::uint32_t ip_version(const opencl_calls& opencl, cl_device_id device) {
  cl_uint version = 0;
  const cl_int status =
      opencl.clGetDeviceInfo(device, device_ip_version, sizeof version, &version, nullptr);
  return status == CL_SUCCESS ? version : 0;
}

std::uint32_t ip_version(const level_zero_calls& level_zero, ze_device_handle_t device) {
  device_ip_version_ext version;
  ze_device_properties_t properties{};
  properties.stype = ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES;
  properties.pNext = &version;
  const ze_result_t status = level_zero.zeDeviceGetProperties(device, &properties);
  return status == ZE_RESULT_SUCCESS ? version.ipVersion : 0;
}

/// Owns a module, so that it is destroyed on every road out.
class owned_module {
 public:
  owned_module(const level_zero_calls& level_zero, ze_module_handle_t module)
      : level_zero_(level_zero), module_(module) {}
  owned_module(const owned_module&) = delete;
  owned_module& operator=(const owned_module&) = delete;
  ~owned_module() {
    if (module_ != nullptr) {
      level_zero_.zeModuleDestroy(module_);
    }
  }

  ze_result_t destroy() {
    const ze_module_handle_t module = module_;
    module_ = nullptr;
    return level_zero_.zeModuleDestroy(module);
  }

 private:
  const level_zero_calls& level_zero_;
  ze_module_handle_t module_;
};

byte_vector compile_module(const level_zero_calls& level_zero, ze_context_handle_t context,
                           ze_device_handle_t device) {
  ze_module_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_MODULE_DESC;
  description.format = ZE_MODULE_FORMAT_IL_SPIRV;
  description.inputSize = sizeof hw_detect_module;
  description.pInputModule = reinterpret_cast<const std::uint8_t*>(hw_detect_module);
  ze_module_handle_t made = nullptr;
  check(level_zero.zeModuleCreate(context, device, &description, &made, nullptr));
  owned_module module(level_zero, made);
  std::size_t size = 0;
  check(level_zero.zeModuleGetNativeBinary(made, &size, nullptr));
  byte_vector binary(size);
  check(level_zero.zeModuleGetNativeBinary(made, &size, binary.data()));
  binary.resize(std::min(size, binary.size()));
  check(module.destroy());
  return binary;
}

}  // namespace

detected_hw detect_hw(const native_queue& queue, native_backend backend,
                      const detection_calls& calls) {
  if (backend == native_backend::opencl) {
    const auto device = static_cast<cl_device_id>(queue.device);
    const detected_hw told = hw_of_ip_version(ip_version(calls.opencl, device));
    return told.hw != hw_unknown
               ? told
               : parse_binary(compile_program(calls.opencl, static_cast<cl_context>(queue.context),
                                              device, "kernel void _forge_hw_detect(){}", ""));
  }
  if (backend == native_backend::level_zero) {
    const auto device = static_cast<ze_device_handle_t>(queue.device);
    const detected_hw told = hw_of_ip_version(ip_version(calls.level_zero, device));
    return told.hw != hw_unknown
               ? told
               : parse_binary(compile_module(
                     calls.level_zero, static_cast<ze_context_handle_t>(queue.context), device));
  }
  return {};
}

}  // namespace kestrel::tarn::forge
