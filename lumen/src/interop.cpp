// SPDX-License-Identifier: Apache-2.0
// SYCL objects over native handles, and native handles of SYCL objects.
//
// Where the host or CUDA runs the kernels, a handle is the address of what stands behind the
// object: the device's record, the context's state, the queue's handle.
#include <algorithm>

#include "backend.hpp"
#include "event_access.hpp"
#include "native_access.hpp"
#include "sycl/detail/backend.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

native_platform* platform_behind(const device& dev) {
  return device_record::of(dev).driver->native();
}

// The handle, with a reference for the caller.
void* shared_handle(native_platform& platform, native_kind kind, void* handle) {
  platform.share(kind, handle);
  return handle;
}

void check_handle(const void* native) {
  if (native == nullptr) {
    throw_invalid("the native handle is null");
  }
}

ownership owner_of(bool keep) {
  return keep ? ownership::keep : ownership::transfer;
}

bool has_own_handles(backend kind) {
  return kind == backend::host || kind == backend::cuda;
}

// With what the native queue does by itself.
property_list with_traits(const property_list& wanted, const queue_traits& traits) {
  const bool in_order = traits.in_order || property_access::has<property::queue::in_order>(wanted);
  const bool timed =
      traits.timed || property_access::has<property::queue::enable_profiling>(wanted);
  using property::queue::enable_profiling;
  if (in_order) {
    return timed ? property_list(property::queue::in_order{}, enable_profiling{})
                 : property_list(property::queue::in_order{});
  }
  return timed ? property_list(enable_profiling{}) : property_list();
}

}  // namespace

void check_backend(backend asked, backend found) {
  if (asked != found) {
    throw exception(make_error_code(errc::backend_mismatch), "Backends mismatch");
  }
}

void* native_of(const platform& object) {
  for (const device_record* record : native_devices()) {
    if (record->driver->native() != nullptr &&
        device_record::handle(*record).get_platform() == object) {
      return record->platform->native;
    }
  }
  throw_invalid("the platform has no native handle");
}

void* native_of(const device& object) {
  const device_record& record = device_record::of(object);
  if (native_platform* const platform = record.driver->native()) {
    return shared_handle(*platform, native_kind::device, record.native);
  }
  return const_cast<device_record*>(&record);
}

void* native_of(const context& object) {
  const std::shared_ptr<context_state>& state = context_state::shared(object);
  if (native_platform* const platform = platform_behind(state->devices.front())) {
    return shared_handle(*platform, native_kind::context, state->native->handle());
  }
  return state.get();
}

void* native_of(const queue& object) {
  const std::shared_ptr<queue_handle>& handle = native_access::handle(object);
  if (native_platform* const platform = handle->core->record.driver->native()) {
    return shared_handle(*platform, native_kind::queue, handle->core->stream->native_handle());
  }
  return handle.get();
}

void* native_of(const kernel& object) {
  const kernel_state& state = native_access::state(object);
  return shared_handle(native_platform_of(object.get_backend()), native_kind::kernel,
                       state.native->handle());
}

void* native_of(const executable_bundle& object) {
  const bundle_state_record& state = native_access::state(object);
  return shared_handle(native_platform_of(object.get_backend()), native_kind::program,
                       state.native->handle());
}

void* native_of(const event& object) {
  const task_ref& task = event_access::task_of(object);
  const std::shared_ptr<stream_mark> mark = task ? task->wait_for_mark() : nullptr;
  void* const handle = mark ? mark->native_handle() : nullptr;
  return handle == nullptr
             ? nullptr
             : shared_handle(*task->queue()->record.driver->native(), native_kind::event, handle);
}

device make_device(void* native, backend kind) {
  check_handle(native);
  if (!has_own_handles(kind)) {
    return device_record::handle(native_platform_of(kind).device_of(native));
  }
  const std::vector<const device_record*>& all = own_devices();
  const auto found = std::find(all.begin(), all.end(), native);
  if (found == all.end()) {
    throw_invalid("the native handle is that of no device");
  }
  return device_record::handle(**found);
}

context make_context(void* native, const async_handler& handler, backend kind, bool keep_ownership,
                     const std::vector<device>& devices) {
  check_handle(native);
  if (has_own_handles(kind)) {
    return context_state::make(static_cast<context_state*>(native)->shared_from_this());
  }
  native_platform& platform = native_platform_of(kind);
  // Before anything is taken over: Level Zero's contexts do not tell their devices.
  if (devices.empty() && kind == backend::ext_kestrel_level_zero) {
    throw_invalid("the devices of the native context are not known");
  }
  for (const device& dev : devices) {
    check_backend(kind, dev.get_backend());
  }
  auto state = std::make_shared<context_state>();
  state->handler = handler;
  state->native = platform.adopt_context(native, owner_of(keep_ownership));
  state->devices = devices;
  if (devices.empty()) {
    for (const device_record* record : platform.devices_of(*state->native)) {
      state->devices.push_back(device_record::handle(*record));
    }
  }
  state->make_places();
  return context_state::make(std::move(state));
}

queue make_queue(void* native, const context& owner, const device* dev, bool keep_ownership,
                 const property_list& properties, const async_handler& handler, backend kind) {
  check_handle(native);
  check_backend(kind, owner.get_backend());
  if (has_own_handles(kind)) {
    return native_access::make(static_cast<queue_handle*>(native)->shared_from_this());
  }
  native_platform& platform = native_platform_of(kind);
  const queue_traits traits = platform.traits_of_queue(native);
  const device where = dev != nullptr             ? *dev
                       : traits.device != nullptr ? device_record::handle(*traits.device)
                                                  : context_state::of(owner).devices.front();
  const property_list all = with_traits(properties, traits);
  std::unique_ptr<command_stream> stream = platform.adopt_queue(
      *context_state::of(owner).place_of(where), native, owner_of(keep_ownership),
      property_access::has<property::queue::enable_profiling>(all));
  return native_access::make(std::make_shared<queue_handle>(
      std::make_shared<queue_core>(owner, where, handler, all, std::move(stream))));
}

executable_bundle make_kernel_bundle(void* native, const context& owner, bool keep_ownership,
                                     backend kind) {
  check_handle(native);
  check_backend(kind, owner.get_backend());
  std::shared_ptr<native_program> program = native_platform_of(kind).adopt_program(
      context_state::of(owner).native, native, owner_of(keep_ownership));
  return native_access::make(
      std::make_shared<bundle_state_record>(bundle_state_record{owner, std::move(program)}));
}

kernel make_kernel(void* native, const context& owner, const executable_bundle* bundle,
                   bool keep_ownership, backend kind) {
  check_handle(native);
  check_backend(kind, owner.get_backend());
  std::shared_ptr<native_program> program;
  if (bundle != nullptr) {
    check_backend(kind, bundle->get_backend());
    program = native_access::state(*bundle).native;
  }
  std::shared_ptr<native_kernel> made = native_platform_of(kind).adopt_kernel(
      context_state::of(owner).native, program, native, owner_of(keep_ownership));
  return native_access::make(std::make_shared<kernel_state>(kernel_state{owner, std::move(made)}));
}

std::shared_ptr<const void> state_of(const queue& object) {
  return native_access::handle(object);
}

}  // namespace detail
LUMEN_NAMESPACE_END
