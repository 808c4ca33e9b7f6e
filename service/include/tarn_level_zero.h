/* SPDX-License-Identifier: Apache-2.0 */
/** \file
 * Level Zero as libtarn_rng.so has bound it, for libraries that want the same loaded table without
 * linking to the Level Zero loader. Usable from C and C++.
 *
 * The first call of any function loads libze_loader.so.1 and calls zeInit(0). If that fails, a line
 * on standard error says why, once; each call of a function that is missing then prints its name
 * and ends the process with status 2, or, if an exit hook keeps it alive, returns
 * ZE_RESULT_ERROR_NOT_AVAILABLE (0x70010001). Arguments and results are those that Level Zero 1.0
 * gives to the function of the same name. */
#ifndef TARN_LEVEL_ZERO_H
#define TARN_LEVEL_ZERO_H

#include <stddef.h>
#include <stdint.h>

#include <level_zero/ze_api.h>

#include "tarn_gpu_api.h"

#ifdef __cplusplus
extern "C" {
#endif

/** What there is to know of a device. */
TARN_GPU_API ze_result_t tarn_zeDeviceGetProperties(ze_device_handle_t device,
                                                    ze_device_properties_t* properties);
/** The parts of a device: how many there are if `*count` is 0, else up to so many of them. */
TARN_GPU_API ze_result_t tarn_zeDeviceGetSubDevices(ze_device_handle_t device, uint32_t* count,
                                                    ze_device_handle_t* sub_devices);
/** A module from code. `build_log` is ignored: no log is asked for. */
TARN_GPU_API ze_result_t tarn_zeModuleCreate(ze_context_handle_t context, ze_device_handle_t device,
                                             const ze_module_desc_t* description,
                                             ze_module_handle_t* module,
                                             ze_module_build_log_handle_t* build_log);
/** A kernel of a module. */
TARN_GPU_API ze_result_t tarn_zeKernelCreate(ze_module_handle_t module,
                                             const ze_kernel_desc_t* description,
                                             ze_kernel_handle_t* kernel);
/** The end of a module. */
TARN_GPU_API ze_result_t tarn_zeModuleDestroy(ze_module_handle_t module);
/** A module's code for its device: `*size` bytes, or with a null `binary` their number. */
TARN_GPU_API ze_result_t tarn_zeModuleGetNativeBinary(ze_module_handle_t module, size_t* size,
                                                      uint8_t* binary);

#ifdef __cplusplus
}
#endif

#endif
