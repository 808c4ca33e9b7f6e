// SPDX-License-Identifier: Apache-2.0
// Modules and kernels of Level Zero.
#include "level_zero_kernels.hpp"

#include <tarn_level_zero.h>

namespace kestrel::tarn::gpu {
namespace {

void check(ze_result_t code) {
  if (code != ZE_RESULT_SUCCESS) {
    throw forge::level_zero_error(static_cast<std::uint32_t>(code));
  }
}

}  // namespace

// What SYCL is given is SYCL's from then on, also when it refuses it.
service::kernel_bundle build_module(void* device, const sycl::context& context,
                                    const program_code& code) {
  ze_module_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_MODULE_DESC;
  description.format =
      code.format == program_format::binary ? ZE_MODULE_FORMAT_NATIVE : ZE_MODULE_FORMAT_IL_SPIRV;
  description.inputSize = code.size;
  description.pInputModule = static_cast<const std::uint8_t*>(code.data);
  description.pBuildFlags = code.options;
  ze_module_handle_t module = nullptr;
  check(tarn_zeModuleCreate(static_cast<ze_context_handle_t>(service::native_of(context)),
                            static_cast<ze_device_handle_t>(device), &description, &module,
                            nullptr));
  return service::make_kernel_bundle(module, context);
}

std::unique_ptr<service::kernel> create_kernel(const service::kernel_bundle& bundle,
                                               const sycl::context& context, const char* name) {
  if (service::code_of(bundle.get_backend()) != service::backend_code::level_zero) {
    throw sycl::exception(sycl::make_error_code(sycl::errc::backend_mismatch), "Backends mismatch");
  }
  ze_kernel_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_KERNEL_DESC;
  description.pKernelName = name;
  ze_kernel_handle_t kernel = nullptr;
  check(tarn_zeKernelCreate(static_cast<ze_module_handle_t>(service::native_of(bundle)),
                            &description, &kernel));
  return std::make_unique<service::kernel>(service::make_kernel(kernel, context, &bundle));
}

}  // namespace kestrel::tarn::gpu
