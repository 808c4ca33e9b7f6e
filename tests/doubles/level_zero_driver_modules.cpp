// SPDX-License-Identifier: Apache-2.0
// Modules and kernels. A module holds the bytes that it was made of, and has the kernels that the
// test gives.
#include <algorithm>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

// The first word of a SPIR-V module.
bool is_spirv(const ze_module_desc_t& description) {
  constexpr std::uint32_t magic = 0x07230203;
  return description.inputSize >= sizeof magic && description.inputSize % sizeof magic == 0 &&
         std::memcmp(description.pInputModule, &magic, sizeof magic) == 0;
}

// Bytes whose number is asked for first.
template <typename Byte>
ze_result_t answer_bytes(std::size_t* size, Byte* to, const void* bytes, std::size_t available) {
  if (size == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (to != nullptr) {
    if (*size < available) {
      return ZE_RESULT_ERROR_INVALID_SIZE;
    }
    std::memcpy(to, bytes, available);
  }
  *size = available;
  return ZE_RESULT_SUCCESS;
}

void write_log(ze_module_build_log_handle_t* log, const char* text) {
  if (log != nullptr) {
    *log = make<ze_module_build_log_handle_t>({});
    (*log)->text = text;
  }
}

}  // namespace

ze_result_t zeModuleCreate(ze_context_handle_t context, ze_device_handle_t device,
                           const ze_module_desc_t* description, ze_module_handle_t* module,
                           ze_module_build_log_handle_t* log) {
  if (const ze_result_t wrong = check(context, device)) {
    return wrong;
  }
  if (description == nullptr || module == nullptr || description->pInputModule == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (description->inputSize == 0) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  if (description->format != ZE_MODULE_FORMAT_NATIVE && !is_spirv(*description)) {
    write_log(log, "no SPIR-V module");
    return ZE_RESULT_ERROR_MODULE_BUILD_FAILURE;
  }
  write_log(log, "");
  auto* const made = make<ze_module_handle_t>({context});
  made->context = context;
  made->device = device;
  made->native.assign(description->pInputModule,
                      description->pInputModule + description->inputSize);
  if (!driver().native_binary.empty()) {
    made->native = driver().native_binary;
  }
  *module = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeModuleDestroy(ze_module_handle_t module) {
  return destroy(module);
}

ze_result_t zeModuleGetNativeBinary(ze_module_handle_t module, std::size_t* size,
                                    std::uint8_t* bytes) {
  if (const ze_result_t wrong = check(module)) {
    return wrong;
  }
  return answer_bytes(size, bytes, module->native.data(), module->native.size());
}

ze_result_t zeModuleGetKernelNames(ze_module_handle_t module, std::uint32_t* count,
                                   const char** names) {
  if (const ze_result_t wrong = check(module)) {
    return wrong;
  }
  if (count == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  std::uint32_t written = 0;
  for (auto kernel = driver().kernels.begin();
       names != nullptr && kernel != driver().kernels.end() && written < *count; ++kernel) {
    names[written++] = kernel->first.c_str();
  }
  *count = names == nullptr ? static_cast<std::uint32_t>(driver().kernels.size()) : written;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeModuleBuildLogDestroy(ze_module_build_log_handle_t log) {
  return destroy(log);
}

ze_result_t zeModuleBuildLogGetString(ze_module_build_log_handle_t log, std::size_t* size,
                                      char* text) {
  if (const ze_result_t wrong = check(log)) {
    return wrong;
  }
  return answer_bytes(size, text, log->text.c_str(), log->text.size() + 1);
}

ze_result_t zeKernelCreate(ze_module_handle_t module, const ze_kernel_desc_t* description,
                           ze_kernel_handle_t* kernel) {
  if (const ze_result_t wrong = check(module)) {
    return wrong;
  }
  if (description == nullptr || description->pKernelName == nullptr || kernel == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  const auto found = driver().kernels.find(description->pKernelName);
  if (found == driver().kernels.end()) {
    return ZE_RESULT_ERROR_INVALID_KERNEL_NAME;
  }
  auto* const made = make<ze_kernel_handle_t>({module});
  made->module = module;
  made->name = found->first;
  made->entry = found->second;
  made->arguments.resize(found->second.arguments);
  *kernel = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeKernelDestroy(ze_kernel_handle_t kernel) {
  return destroy(kernel);
}

ze_result_t zeKernelSetArgumentValue(ze_kernel_handle_t kernel, std::uint32_t index,
                                     std::size_t bytes, const void* value) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  if (index >= kernel->arguments.size()) {
    return ZE_RESULT_ERROR_INVALID_KERNEL_ARGUMENT_INDEX;
  }
  if (bytes == 0) {
    return ZE_RESULT_ERROR_INVALID_KERNEL_ARGUMENT_SIZE;
  }
  const auto* const first = static_cast<const char*>(value);
  auto& argument = kernel->arguments[index];
  argument.set = true;
  argument.local = value == nullptr;
  argument.bytes.assign(bytes, 0);
  if (value != nullptr) {
    std::copy_n(first, bytes, argument.bytes.begin());
  }
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeKernelSetGroupSize(ze_kernel_handle_t kernel, std::uint32_t x, std::uint32_t y,
                                 std::uint32_t z) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  const std::uint64_t limit = kernel->module->device->description.max_group_size;
  if (x == 0 || y == 0 || z == 0 || x > limit || y > limit || z > limit ||
      std::uint64_t{x} * y * z > limit) {
    return ZE_RESULT_ERROR_INVALID_GROUP_SIZE_DIMENSION;
  }
  kernel->group_size[0] = x;
  kernel->group_size[1] = y;
  kernel->group_size[2] = z;
  return ZE_RESULT_SUCCESS;
}

// The first dimension in the largest power of two that divides it, up to 64.
ze_result_t zeKernelSuggestGroupSize(ze_kernel_handle_t kernel, std::uint32_t global_x,
                                     std::uint32_t global_y, std::uint32_t global_z,
                                     std::uint32_t* x, std::uint32_t* y, std::uint32_t* z) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  if (global_x == 0 || global_y == 0 || global_z == 0) {
    return ZE_RESULT_ERROR_INVALID_GLOBAL_WIDTH_DIMENSION;
  }
  *x = 1;
  while (*x < 64 && global_x % (2 * *x) == 0) {
    *x *= 2;
  }
  *y = 1;
  *z = 1;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeKernelSetGlobalOffsetExp(ze_kernel_handle_t kernel, std::uint32_t x, std::uint32_t y,
                                       std::uint32_t z) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  kernel->offset[0] = x;
  kernel->offset[1] = y;
  kernel->offset[2] = z;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeKernelSetIndirectAccess(ze_kernel_handle_t kernel,
                                      ze_kernel_indirect_access_flags_t) {
  return check(kernel);
}

ze_result_t zeKernelGetProperties(ze_kernel_handle_t kernel, ze_kernel_properties_t* properties) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  // No size is required, and nothing but the arguments is known.
  ze_kernel_properties_t known{};
  known.stype = properties->stype;
  known.pNext = properties->pNext;
  *properties = known;
  properties->numKernelArgs = kernel->entry.arguments;
  properties->maxSubgroupSize = 32;
  properties->maxNumSubgroups = kernel->module->device->description.max_group_size / 32;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeKernelGetName(ze_kernel_handle_t kernel, std::size_t* size, char* name) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  return answer_bytes(size, name, kernel->name.c_str(), kernel->name.size() + 1);
}

}  // namespace level_zero_driver
