// SPDX-License-Identifier: Apache-2.0
// Interoperation with native platforms (SYCL 2020, section 4.5.1): SYCL objects over native
// handles, and native handles of SYCL objects. OpenCL counts references: get_native gives one to
// the caller, and what is made over a handle takes one of its own. Level Zero does not: `ownership`
// says who destroys the object, and what get_native gives stays the SYCL object's. What is
// transferred is lumen's from the call on, unless other arguments are refused (errc::invalid,
// backend_mismatch).
//
// Devices that are not of such a platform have handles as well (backend::host and backend::cuda),
// by which another part of the program can name them: those of contexts and queues are valid as
// long as the SYCL object that they came from.
#pragma once

#include <memory>
#include <type_traits>
#include <vector>

#include "kernel.hpp"
#include "queue.hpp"

// The handles of both platforms, as their own headers name them.
struct _cl_platform_id;
struct _cl_device_id;
struct _cl_context;
struct _cl_command_queue;
struct _cl_kernel;
struct _cl_program;
struct _cl_event;
struct _ze_driver_handle_t;
struct _ze_device_handle_t;
struct _ze_context_handle_t;
struct _ze_command_queue_handle_t;
struct _ze_kernel_handle_t;
struct _ze_module_handle_t;
struct _ze_event_handle_t;

LUMEN_NAMESPACE_BEGIN

namespace ext::kestrel {
// Whose a native object is that a SYCL object is made over.
enum class ownership { transfer, keep };
}  // namespace ext::kestrel

namespace detail {

// The run-time forms, for callers that know the backend only as a number. Handles of `kind`.

// Adds the caller's reference where the platform counts them.
LUMEN_EXPORT void* native_of(const platform& object);
LUMEN_EXPORT void* native_of(const device& object);
LUMEN_EXPORT void* native_of(const context& object);
LUMEN_EXPORT void* native_of(const queue& object);
LUMEN_EXPORT void* native_of(const kernel& object);
LUMEN_EXPORT void* native_of(const kernel_bundle<bundle_state::executable>& object);
// Waits until the command is with the device. Null for an event that the host has completed.
LUMEN_EXPORT void* native_of(const event& object);

// A sub-device is a device as any other. Throws errc::invalid for a null handle; other handles have
// to be those of devices.
LUMEN_EXPORT device make_device(void* native, backend kind);
// `devices` where the platform does not know them itself; with errc::invalid if they are missing.
LUMEN_EXPORT context make_context(void* native, const async_handler& handler, backend kind,
                                  bool keep_ownership, const std::vector<device>& devices = {});
// `dev` may be null: the queue's own, where the platform knows it, or the first of the context.
LUMEN_EXPORT queue make_queue(void* native, const context& owner, const device* dev,
                              bool keep_ownership, const property_list& properties,
                              const async_handler& handler, backend kind);
LUMEN_EXPORT kernel_bundle<bundle_state::executable> make_kernel_bundle(void* native,
                                                                        const context& owner,
                                                                        bool keep_ownership,
                                                                        backend kind);
// `bundle` is null where the platform's kernels know their program.
LUMEN_EXPORT kernel make_kernel(void* native, const context& owner,
                                const kernel_bundle<bundle_state::executable>* bundle,
                                bool keep_ownership, backend kind);

// Identity of a queue's state, for tables that must not keep the queue alive.
LUMEN_EXPORT std::shared_ptr<const void> state_of(const queue& object);

LUMEN_EXPORT void check_backend(backend asked, backend found);

using executable_bundle = kernel_bundle<bundle_state::executable>;

// What a handle of each class is, row by row.
template <backend Backend, typename Object>
struct native_type;
#define LUMEN_NATIVE_TYPE(kind, object, handle, answer) \
  template <>                                           \
  struct native_type<backend::kind, object> {           \
    using type = handle;                                \
    using return_type = answer;                         \
  };
LUMEN_NATIVE_TYPE(opencl, platform, _cl_platform_id*, _cl_platform_id*)
LUMEN_NATIVE_TYPE(opencl, device, _cl_device_id*, _cl_device_id*)
LUMEN_NATIVE_TYPE(opencl, context, _cl_context*, _cl_context*)
LUMEN_NATIVE_TYPE(opencl, queue, _cl_command_queue*, _cl_command_queue*)
LUMEN_NATIVE_TYPE(opencl, kernel, _cl_kernel*, _cl_kernel*)
LUMEN_NATIVE_TYPE(opencl, executable_bundle, _cl_program*, std::vector<_cl_program*>)
LUMEN_NATIVE_TYPE(opencl, event, _cl_event*, std::vector<_cl_event*>)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, platform, _ze_driver_handle_t*, _ze_driver_handle_t*)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, device, _ze_device_handle_t*, _ze_device_handle_t*)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, context, _ze_context_handle_t*, _ze_context_handle_t*)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, queue, _ze_command_queue_handle_t*,
                  _ze_command_queue_handle_t*)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, kernel, _ze_kernel_handle_t*, _ze_kernel_handle_t*)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, executable_bundle, _ze_module_handle_t*,
                  std::vector<_ze_module_handle_t*>)
LUMEN_NATIVE_TYPE(ext_kestrel_level_zero, event, _ze_event_handle_t*,
                  std::vector<_ze_event_handle_t*>)
LUMEN_NATIVE_TYPE(host, device, void*, void*)
LUMEN_NATIVE_TYPE(host, context, void*, void*)
LUMEN_NATIVE_TYPE(host, queue, void*, void*)
LUMEN_NATIVE_TYPE(cuda, device, void*, void*)
LUMEN_NATIVE_TYPE(cuda, context, void*, void*)
LUMEN_NATIVE_TYPE(cuda, queue, void*, void*)
#undef LUMEN_NATIVE_TYPE

// What make_* takes: the handle alone, or a record where the platform counts no references.
template <backend Backend, typename Object>
struct native_input {
  using type = typename native_type<Backend, Object>::type;
};
template <>
struct native_input<backend::ext_kestrel_level_zero, context> {
  struct type {
    _ze_context_handle_t* native_handle;
    std::vector<device> devices;
    ext::kestrel::ownership owner = ext::kestrel::ownership::transfer;
  };
};
template <>
struct native_input<backend::ext_kestrel_level_zero, queue> {
  struct type {
    _ze_command_queue_handle_t* native_handle;
    ext::kestrel::ownership owner = ext::kestrel::ownership::transfer;
    property_list properties = {};
  };
};
template <>
struct native_input<backend::ext_kestrel_level_zero, executable_bundle> {
  struct type {
    _ze_module_handle_t* native_handle;
    ext::kestrel::ownership owner = ext::kestrel::ownership::transfer;
  };
};
template <>
struct native_input<backend::ext_kestrel_level_zero, kernel> {
  struct type {
    executable_bundle bundle;
    _ze_kernel_handle_t* native_handle;
    ext::kestrel::ownership owner = ext::kestrel::ownership::transfer;
  };
};

template <backend Backend, typename Object, typename Input>
void* handle_in(const Input& input) {
  if constexpr (std::is_same_v<Input, typename native_type<Backend, Object>::type>) {
    return input;
  } else {
    return input.native_handle;
  }
}
template <typename Input>
constexpr bool keeps(const Input& input) {
  if constexpr (std::is_pointer_v<Input>) {
    return true;
  } else {
    return input.owner == ext::kestrel::ownership::keep;
  }
}
}  // namespace detail

template <backend Backend>
class backend_traits {
 public:
  template <typename Object>
  using input_type = typename detail::native_input<Backend, Object>::type;
  template <typename Object>
  using return_type = typename detail::native_type<Backend, Object>::return_type;
};
template <backend Backend, typename Object>
using backend_input_t = typename backend_traits<Backend>::template input_type<Object>;
template <backend Backend, typename Object>
using backend_return_t = typename backend_traits<Backend>::template return_type<Object>;

// Throws errc::backend_mismatch when the object is of another backend.
template <backend Backend, typename Object>
backend_return_t<Backend, Object> get_native(const Object& object) {
  using handle = typename detail::native_type<Backend, Object>::type;
  using answer = backend_return_t<Backend, Object>;
  detail::check_backend(Backend, object.get_backend());
  const auto found = static_cast<handle>(detail::native_of(object));
  if constexpr (std::is_same_v<handle, answer>) {
    return found;
  } else {
    return found == nullptr ? answer() : answer{found};
  }
}

// Each throws errc::invalid for a null handle.
template <backend Backend>
device make_device(const backend_input_t<Backend, device>& input) {
  return detail::make_device(detail::handle_in<Backend, device>(input), Backend);
}
template <backend Backend>
context make_context(const backend_input_t<Backend, context>& input,
                     const async_handler& handler = {}) {
  if constexpr (Backend == backend::ext_kestrel_level_zero) {
    return detail::make_context(input.native_handle, handler, Backend, detail::keeps(input),
                                input.devices);
  } else {
    return detail::make_context(input, handler, Backend, true);
  }
}
template <backend Backend>
queue make_queue(const backend_input_t<Backend, queue>& input, const context& owner,
                 const async_handler& handler = {}) {
  property_list properties;
  if constexpr (Backend == backend::ext_kestrel_level_zero) {
    properties = input.properties;
  }
  return detail::make_queue(detail::handle_in<Backend, queue>(input), owner, nullptr,
                            detail::keeps(input), properties, handler, Backend);
}
template <backend Backend, bundle_state State>
kernel_bundle<State> make_kernel_bundle(const backend_input_t<Backend, kernel_bundle<State>>& input,
                                        const context& owner) {
  static_assert(State == bundle_state::executable, "native programs are executable");
  return detail::make_kernel_bundle(detail::handle_in<Backend, kernel_bundle<State>>(input), owner,
                                    detail::keeps(input), Backend);
}
template <backend Backend>
kernel make_kernel(const backend_input_t<Backend, kernel>& input, const context& owner) {
  if constexpr (Backend == backend::ext_kestrel_level_zero) {
    return detail::make_kernel(input.native_handle, owner, &input.bundle, detail::keeps(input),
                               Backend);
  } else {
    return detail::make_kernel(input, owner, nullptr, true, Backend);
  }
}

LUMEN_NAMESPACE_END
