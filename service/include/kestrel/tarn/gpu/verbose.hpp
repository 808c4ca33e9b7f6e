// SPDX-License-Identifier: Apache-2.0
/// \file
/// Verbose reports of public calls: one line for each call, with its time on the host and on the
/// device. The mode, the output file and the banner are those of tarn_serv.h.
#pragma once

#include <sycl/sycl.hpp>

#include "tarn_gpu_api.h"

namespace kestrel::tarn::gpu {

/// \name Verbose reports
/// Nesting and events belong to the calling thread, and go with it.
///@{

/// Enters and leaves a reported call: a report at a depth other than 0 is silent, so a call made
/// inside another prints no line of its own.
TARN_GPU_API void verbose_depth_inc();
TARN_GPU_API void verbose_depth_dec();

/// In mode 2, adds an event to the device time of this thread's next report; in other modes,
/// nothing.
TARN_GPU_API void verbose_register_event(const sycl::event& event);

/// 1 for callers of the OpenMP offload interface; any other value is ignored.
TARN_GPU_API void set_verbose_gpu_iface(int value);

/// Prints "TARN_VERBOSE <text> host:<time> device:<time> GPU<position>" and forgets the registered
/// events. Silent inside a reported call and in mode 0.
///
/// The banner and, once per process, a line for each GPU of the queue's backend come first, the
/// lines cut after 399 characters in all. The position is that of the first of these GPUs that has
/// the vendor of the queue's device, and is left out if there is none.
///
/// \param queue         what the call was made on; not null
/// \param text          the call
/// \param host_seconds  its time on the host, "N/A" for 0
///
/// The device time is that from the start of the first to the end of the last registered event,
/// "N/A" without any. \throws sycl::exception for an event whose queue takes no times, after the
/// banner and the GPUs
TARN_GPU_API void print_verbose_gpu_info(sycl::queue* queue, const char* text, double host_seconds);
///@}

}  // namespace kestrel::tarn::gpu
