// SPDX-License-Identifier: Apache-2.0
// Every use of names that standard SYCL does not have, with what stands in for them elsewhere:
// native handles whose backend is known at run time only, SYCL objects over them, the identity of a
// queue, barriers in a queue.
#pragma once

#include <cstdio>
#include <exception>
#include <memory>
#include <vector>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::service {

/// Backends by the numbers that interop objects and native callers use.
enum class backend_code : int { host = 0, opencl = 1, level_zero = 2, other = -1 };

#if defined(SYCL_IMPLEMENTATION_LUMEN)

inline backend_code code_of(sycl::backend kind) {
  switch (kind) {
    case sycl::backend::opencl:
      return backend_code::opencl;
    case sycl::backend::ext_kestrel_level_zero:
      return backend_code::level_zero;
    case sycl::backend::host:
      return backend_code::host;
    default:
      return backend_code::other;
  }
}

/// The native handle of a device, context or queue of any backend. OpenCL: with a reference that
/// the caller has to release.
template <typename Object>
void* native_of(const Object& object) {
  return sycl::detail::native_of(object);
}

/// What native handles become. The native objects stay the caller's. A context of OpenCL knows its
/// devices, others are over the one given.
inline sycl::context make_opencl_context(void* native) {
  return sycl::detail::make_context(native, {}, sycl::backend::opencl, true);
}
inline sycl::context make_context(void* native, const sycl::device& device) {
  return sycl::detail::make_context(native, {}, device.get_backend(), true, {device});
}
inline sycl::queue make_queue(void* native, const sycl::context& context,
                              const sycl::device& device, bool in_order) {
  const sycl::property_list properties =
      in_order ? sycl::property_list(sycl::property::queue::in_order{}) : sycl::property_list();
  // Nobody could catch what would end the process when the queue goes.
  const sycl::async_handler tell = [](const sycl::exception_list& errors) {
    for (const std::exception_ptr& error : errors) {
      try {
        std::rethrow_exception(error);
      } catch (const std::exception& told) {
        std::fprintf(stderr, "Tarn RNG: sycl::exception what: %s \n", told.what());
      }
    }
  };
  return sycl::detail::make_queue(native, context, &device, true, properties, tell,
                                  context.get_backend());
}

/// Native programs and kernels, and what becomes of them. OpenCL: the SYCL object takes a reference
/// of its own. Level Zero: it takes the native object over, and needs the bundle that a kernel is
/// of.
using kernel_bundle = sycl::kernel_bundle<sycl::bundle_state::executable>;
using kernel = sycl::kernel;
inline kernel_bundle make_kernel_bundle(void* native, const sycl::context& context) {
  const bool keep = context.get_backend() == sycl::backend::opencl;
  return sycl::detail::make_kernel_bundle(native, context, keep, context.get_backend());
}
inline kernel make_kernel(void* native, const sycl::context& context, const kernel_bundle* bundle) {
  const bool keep = context.get_backend() == sycl::backend::opencl;
  return sycl::detail::make_kernel(native, context, bundle, keep, context.get_backend());
}
inline unsigned argument_count(const kernel& native) {
  return native.get_info<sycl::info::kernel::num_args>();
}

/// The arguments of a native kernel by position, and its launch, within a command group.
template <typename T>
void set_argument(sycl::handler& group, int index, const T& argument) {
  group.set_arg(index, argument);
}
template <int Dimensions>
void launch(sycl::handler& group, const sycl::nd_range<Dimensions>& ranges, const kernel& native) {
  group.parallel_for(ranges, native);
}

/// What a queue and its copies share. It has no other owners: when the queue is gone, weak
/// references to it have expired.
inline std::shared_ptr<const void> state_of(const sycl::queue& queue) {
  return sycl::detail::state_of(queue);
}

/// An event that is complete when all of them are; what is submitted later comes after it.
inline sycl::event submit_barrier(sycl::queue& queue, const std::vector<sycl::event>& events) {
  return queue.ext_kestrel_submit_barrier(events);
}

#else

// No native handles without extensions: there, the services know every device as one of another
// backend, and nothing is made from handles.

inline backend_code code_of(sycl::backend) {
  return backend_code::other;
}

template <typename Object>
void* native_of(const Object&) {
  return nullptr;
}

[[noreturn]] inline void refuse_native_handles() {
  throw sycl::exception(sycl::make_error_code(sycl::errc::feature_not_supported),
                        "this SYCL makes no objects from native handles");
}
inline sycl::context make_opencl_context(void*) {
  refuse_native_handles();
}
inline sycl::context make_context(void*, const sycl::device&) {
  refuse_native_handles();
}
inline sycl::queue make_queue(void*, const sycl::context&, const sycl::device&, bool) {
  refuse_native_handles();
}
struct kernel_bundle {
  sycl::backend get_backend() const { refuse_native_handles(); }
};
struct kernel {};
inline kernel_bundle make_kernel_bundle(void*, const sycl::context&) {
  refuse_native_handles();
}
inline kernel make_kernel(void*, const sycl::context&, const kernel_bundle*) {
  refuse_native_handles();
}
inline unsigned argument_count(const kernel&) {
  return 0;
}
template <typename T>
void set_argument(sycl::handler&, int, const T&) {}
template <int Dimensions>
void launch(sycl::handler&, const sycl::nd_range<Dimensions>&, const kernel&) {
  refuse_native_handles();
}

/// Expired at once: nothing is found again by it.
inline std::shared_ptr<const void> state_of(const sycl::queue& queue) {
  return std::make_shared<sycl::queue>(queue);
}

inline sycl::event submit_barrier(sycl::queue&, const std::vector<sycl::event>& events) {
  sycl::event::wait(events);
  return {};
}

#endif

}  // namespace kestrel::tarn::service
