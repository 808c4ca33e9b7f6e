// SPDX-License-Identifier: Apache-2.0
// SYCL contexts and queues over the native handles of OpenMP interop objects. Each is made once and
// kept until the process ends; the native objects stay their owner's. Where the backend counts no
// references, they have to live as long, since a handle that is used again names the old object.
//
// Any thread may call. When several ask for a new handle at the same time each may make an object,
// but all get the one that was first in the cache.
#pragma once

#include <sycl/sycl.hpp>

#include "tarn_gpu.h"

namespace kestrel::tarn::gpu {

/// The context over a native one.
///
/// \param backend  Level Zero: the context has one device and that device's backend, which is any
///                 but OpenCL; otherwise it is an OpenCL context with the devices that it names
/// \param device   that one device; null: the one whose native handle is `native_device_or_null`
///
/// \throws sycl::exception with errc::invalid for a device that SYCL does not show, and what the
/// runtime has against the native context
sycl::context* lookup_and_cache_lumen_context(void* native_context, void* native_device_or_null,
                                              tarn_gpu_backend_t backend, sycl::device* device);

/// The queue over a native one, on the first device of its context.
///
/// \param backend  that of the context
/// \param interop  the interop object, which tells whether the queue is in order; null: it is not
///
/// \throws sycl::exception as the runtime does
sycl::queue* lookup_and_cache_lumen_queue(void* native_queue, tarn_gpu_backend_t backend,
                                          sycl::context context, void* interop);

/// The queue of an interop object, an omp_interop_t, with its context; null when the object lacks
/// one of the properties.
///
/// \throws sycl::exception as the two above
sycl::queue* lookup_and_cache_lumen_queue_and_context(void* interop);

}  // namespace kestrel::tarn::gpu
