/* SPDX-License-Identifier: Apache-2.0 */
/* The Level Zero functions as a C program sees them, with the types that it expects. */
#include <tarn_level_zero.h>

typedef void (*any_function)(void);

void level_zero_seen_from_c(any_function seen[6]);

void level_zero_seen_from_c(any_function seen[6]) {
  ze_result_t (*properties)(ze_device_handle_t, ze_device_properties_t*) =
      tarn_zeDeviceGetProperties;
  ze_result_t (*parts)(ze_device_handle_t, uint32_t*, ze_device_handle_t*) =
      tarn_zeDeviceGetSubDevices;
  ze_result_t (*make_module)(ze_context_handle_t, ze_device_handle_t, const ze_module_desc_t*,
                             ze_module_handle_t*, ze_module_build_log_handle_t*) =
      tarn_zeModuleCreate;
  ze_result_t (*make_kernel)(ze_module_handle_t, const ze_kernel_desc_t*, ze_kernel_handle_t*) =
      tarn_zeKernelCreate;
  ze_result_t (*end_module)(ze_module_handle_t) = tarn_zeModuleDestroy;
  ze_result_t (*binary)(ze_module_handle_t, size_t*, uint8_t*) = tarn_zeModuleGetNativeBinary;
  seen[0] = (any_function)properties;
  seen[1] = (any_function)parts;
  seen[2] = (any_function)make_module;
  seen[3] = (any_function)make_kernel;
  seen[4] = (any_function)end_module;
  seen[5] = (any_function)binary;
}
