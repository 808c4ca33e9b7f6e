// SPDX-License-Identifier: Apache-2.0
// The table of Level Zero, and the functions that pass calls on to it.
#include "level_zero_binding.hpp"

#include <dlfcn.h>
#include <tarn_level_zero.h>
#include <tarn_serv.h>

namespace kestrel::tarn::gpu {
namespace {

constexpr const char* names[] = {
#define TARN_LEVEL_ZERO_FUNCTION(name) #name,
#include "level_zero_functions.def"
};

constexpr int standard_error = 1;
constexpr std::size_t init_index = static_cast<std::size_t>(level_zero_function::zeInit);
static_assert(init_index == 0, "zeInit is called before anything else is looked up");

/// Looks up names, and tells which one is missing.
bool find(binding_record& record, void* module, std::size_t first, std::size_t last) {
  const std::size_t stop = look_up(record, module, first, last);
  if (stop != last) {
    tarn_serv_format_print(standard_error, "Could not find '%s' in '%s'\n", 2, record.names[stop],
                           record.library);
  }
  return stop == last;
}

bool bind_or_tell(binding_record& record) {
  void* const module = ::dlopen(record.library, RTLD_NOW | RTLD_LOCAL);
  if (module == nullptr) {
    tarn_serv_format_print(standard_error, "Could not load library '%s'\n", 1, record.library);
    return false;
  }
  if (!find(record, module, init_index, init_index + 1)) {
    return false;
  }
  const auto init = reinterpret_cast<decltype(&::zeInit)>(record.functions[init_index].load());
  if (init(0) != ZE_RESULT_SUCCESS) {
    tarn_serv_format_print(standard_error, "Failed zeInit with %s\n", 1, record.library);
    return false;
  }
  return find(record, module, init_index + 1, record.size);
}

}  // namespace

std::atomic<void*> level_zero_runtime::functions[] = {};
binding_record level_zero_runtime::record{"libze_loader.so.1", names, functions, size};

int bind_level_zero() {
  std::atomic<binding_state>& state = level_zero_runtime::record.state;
  binding_state present = state.load();
  if (present == binding_state::not_tried) {
    const bool complete = bind_or_tell(level_zero_runtime::record);
    const binding_state outcome = complete ? binding_state::bound : binding_state::failed;
    if (state.compare_exchange_strong(present, outcome)) {
      present = outcome;
    }
  }
  return binding_result(present);
}

}  // namespace kestrel::tarn::gpu

namespace ze = kestrel::tarn::gpu::ze;

ze_result_t tarn_zeDeviceGetProperties(ze_device_handle_t device,
                                       ze_device_properties_t* properties) {
  return ze::zeDeviceGetProperties(device, properties);
}

ze_result_t tarn_zeDeviceGetSubDevices(ze_device_handle_t device, std::uint32_t* count,
                                       ze_device_handle_t* sub_devices) {
  return ze::zeDeviceGetSubDevices(device, count, sub_devices);
}

ze_result_t tarn_zeModuleCreate(ze_context_handle_t context, ze_device_handle_t device,
                                const ze_module_desc_t* description, ze_module_handle_t* module,
                                ze_module_build_log_handle_t*) {
  return ze::zeModuleCreate(context, device, description, module, nullptr);
}

ze_result_t tarn_zeKernelCreate(ze_module_handle_t module, const ze_kernel_desc_t* description,
                                ze_kernel_handle_t* kernel) {
  return ze::zeKernelCreate(module, description, kernel);
}

ze_result_t tarn_zeModuleDestroy(ze_module_handle_t module) {
  return ze::zeModuleDestroy(module);
}

ze_result_t tarn_zeModuleGetNativeBinary(ze_module_handle_t module, std::size_t* size,
                                         std::uint8_t* binary) {
  return ze::zeModuleGetNativeBinary(module, size, binary);
}
