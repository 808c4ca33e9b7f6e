// SPDX-License-Identifier: Apache-2.0
// Queues: construction, queries, waiting and the memory commands.
#include "sycl/detail/queue.hpp"

#include <algorithm>

#include "queue_core.hpp"

LUMEN_NAMESPACE_BEGIN

queue::queue(const property_list& properties) : queue(device(), properties) {}
queue::queue(const async_handler& handler, const property_list& properties)
    : queue(device(), handler, properties) {}
queue::queue(const device& dev, const property_list& properties)
    : queue(dev, async_handler(), properties) {}
queue::queue(const device& dev, const async_handler& handler, const property_list& properties)
    : queue(detail::default_context(dev), dev, handler, properties) {}
queue::queue(const context& ctx, const device& dev, const property_list& properties)
    : queue(ctx, dev, async_handler(), properties) {}
queue::queue(const context& ctx, const device& dev, const async_handler& handler,
             const property_list& properties) {
  const std::vector<device>& devices = detail::context_state::of(ctx).devices;
  if (std::find(devices.begin(), devices.end(), dev) == devices.end()) {
    detail::throw_invalid("the device of a queue must be of its context");
  }
  handle_ = std::make_shared<detail::queue_handle>(
      std::make_shared<detail::queue_core>(ctx, dev, handler, properties));
}

device queue::pick(const context& ctx, const detail::selector_view& selector) {
  const device* best = nullptr;
  int best_rating = -1;
  for (const device& candidate : detail::context_state::of(ctx).devices) {
    const int rating = selector.rate(selector.object, candidate);
    if (rating > best_rating) {
      best_rating = rating;
      best = &candidate;
    }
  }
  if (best == nullptr) {
    throw exception(make_error_code(errc::runtime),
                    "no device of the context is acceptable to the selector");
  }
  return *best;
}

backend queue::get_backend() const noexcept {
  return handle_->core->dev.get_backend();
}
context queue::get_context() const {
  return handle_->core->ctx;
}
device queue::get_device() const noexcept {
  return handle_->core->dev;
}
bool queue::is_in_order() const noexcept {
  return handle_->core->in_order;
}
detail::queue_core& queue::core() const noexcept {
  return *handle_->core;
}
const property_list& queue::properties() const noexcept {
  return handle_->core->properties;
}

template <>
LUMEN_EXPORT context queue::get_info<info::queue::context>() const {
  return get_context();
}
template <>
LUMEN_EXPORT device queue::get_info<info::queue::device>() const {
  return get_device();
}

void queue::wait() {
  handle_->core->wait();
}
void queue::wait_and_throw() {
  wait();
  throw_asynchronous();
}
void queue::throw_asynchronous() {
  handle_->core->throw_asynchronous();
}

event queue::memcpy(void* to, const void* from, std::size_t bytes,
                    const std::vector<event>& after) {
  return submit([&](handler& h) {
    h.depends_on(after);
    h.memcpy(to, from, bytes);
  });
}
event queue::memcpy(void* to, const void* from, std::size_t bytes, const event& after) {
  return this->memcpy(to, from, bytes, std::vector<event>{after});
}
event queue::memset(void* pointer, int value, std::size_t bytes, const std::vector<event>& after) {
  return submit([&](handler& h) {
    h.depends_on(after);
    h.memset(pointer, value, bytes);
  });
}
event queue::memset(void* pointer, int value, std::size_t bytes, const event& after) {
  return this->memset(pointer, value, bytes, std::vector<event>{after});
}
event queue::prefetch(void* pointer, std::size_t bytes, const std::vector<event>& after) {
  return submit([&](handler& h) {
    h.depends_on(after);
    h.prefetch(pointer, bytes);
  });
}
event queue::prefetch(void* pointer, std::size_t bytes, const event& after) {
  return prefetch(pointer, bytes, std::vector<event>{after});
}
event queue::mem_advise(void* pointer, std::size_t bytes, int advice,
                        const std::vector<event>& after) {
  return submit([&](handler& h) {
    h.depends_on(after);
    h.mem_advise(pointer, bytes, advice);
  });
}
event queue::mem_advise(void* pointer, std::size_t bytes, int advice, const event& after) {
  return mem_advise(pointer, bytes, advice, std::vector<event>{after});
}

LUMEN_NAMESPACE_END
