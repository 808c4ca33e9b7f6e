// SPDX-License-Identifier: Apache-2.0
// queue (SYCL 2020, section 4.6.5): command groups go in, events come out. In order only with
// property::queue::in_order; otherwise tasks are ordered by their dependencies alone.
#pragma once

#include <cstddef>
#include <memory>
#include <utility>
#include <vector>

#include "context.hpp"
#include "handler.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct native_access;
struct queue_handle;
}  // namespace detail

class LUMEN_EXPORT queue {
 public:
  explicit queue(const property_list& properties = {});
  explicit queue(const async_handler& handler, const property_list& properties = {});
  explicit queue(const device& dev, const property_list& properties = {});
  queue(const device& dev, const async_handler& handler, const property_list& properties = {});
  queue(const context& ctx, const device& dev, const property_list& properties = {});
  // Throws errc::invalid when the device is not of the context.
  queue(const context& ctx, const device& dev, const async_handler& handler,
        const property_list& properties = {});
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  explicit queue(const Selector& selector, const property_list& properties = {})
      : queue(device(selector), properties) {}
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  queue(const Selector& selector, const async_handler& handler,
        const property_list& properties = {})
      : queue(device(selector), handler, properties) {}
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  queue(const context& ctx, const Selector& selector, const property_list& properties = {})
      : queue(ctx, pick(ctx, detail::view_of(selector)), properties) {}
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  queue(const context& ctx, const Selector& selector, const async_handler& handler,
        const property_list& properties = {})
      : queue(ctx, pick(ctx, detail::view_of(selector)), handler, properties) {}

  sycl::backend get_backend() const noexcept;
  context get_context() const;
  device get_device() const noexcept;
  bool is_in_order() const noexcept;
  template <typename Param>
  typename Param::return_type get_info() const;
  template <typename Property>
  bool has_property() const noexcept {
    return detail::property_access::has<Property>(properties());
  }

  template <typename Property>
  Property get_property() const {
    return detail::property_access::get<Property>(properties());
  }

  template <typename CommandGroup>
  event submit(CommandGroup&& group_function) {
    handler group(core());
    group_function(group);
    return group.finish();
  }
  // Goes to the second queue when submitting to this one throws.
  template <typename CommandGroup>
  event submit(CommandGroup&& group_function, queue& secondary) {
    try {
      return submit(group_function);
    } catch (const exception&) {
      return secondary.submit(group_function);
    }
  }

  // Waits for all that was submitted before.
  void wait();
  void wait_and_throw();
  // Hands the asynchronous errors so far to the handler.
  void throw_asynchronous();

  template <typename KernelName = void, typename Function>
  event single_task(const Function& function) {
    return submit([&](handler& h) { h.single_task<KernelName>(function); });
  }
  template <typename KernelName = void, typename Function>
  event single_task(const event& after, const Function& function) {
    return submit([&](handler& h) {
      h.depends_on(after);
      h.single_task<KernelName>(function);
    });
  }
  template <typename KernelName = void, typename Function>
  event single_task(const std::vector<event>& after, const Function& function) {
    return submit([&](handler& h) {
      h.depends_on(after);
      h.single_task<KernelName>(function);
    });
  }

  // The range may be a range, an nd_range or, in one dimension, a number.
  template <typename KernelName = void, typename... Rest>
  event parallel_for(range<1> sizes, const Rest&... rest) {
    return launch<KernelName>(sizes, rest...);
  }
  template <typename KernelName = void, typename... Rest>
  event parallel_for(range<2> sizes, const Rest&... rest) {
    return launch<KernelName>(sizes, rest...);
  }
  template <typename KernelName = void, typename... Rest>
  event parallel_for(range<3> sizes, const Rest&... rest) {
    return launch<KernelName>(sizes, rest...);
  }
  template <typename KernelName = void, int Dimensions, typename... Rest>
  event parallel_for(nd_range<Dimensions> ranges, const Rest&... rest) {
    return launch<KernelName>(ranges, rest...);
  }

  // As handler::ext_kestrel_barrier.
  event ext_kestrel_submit_barrier() {
    return submit([](handler& h) { h.ext_kestrel_barrier(); });
  }
  event ext_kestrel_submit_barrier(const std::vector<event>& events) {
    return submit([&](handler& h) { h.ext_kestrel_barrier(events); });
  }

  // The commands of handler by their names: ARGUMENTS, then optionally an event or a vector of
  // events to come after.
  event memcpy(void* to, const void* from, std::size_t bytes, const std::vector<event>& after = {});
  event memcpy(void* to, const void* from, std::size_t bytes, const event& after);
  event memset(void* pointer, int value, std::size_t bytes, const std::vector<event>& after = {});
  event memset(void* pointer, int value, std::size_t bytes, const event& after);
  event prefetch(void* pointer, std::size_t bytes, const std::vector<event>& after = {});
  event prefetch(void* pointer, std::size_t bytes, const event& after);
  event mem_advise(void* pointer, std::size_t bytes, int advice,
                   const std::vector<event>& after = {});
  event mem_advise(void* pointer, std::size_t bytes, int advice, const event& after);
  template <typename T>
  event fill(void* pointer, const T& pattern, std::size_t count) {
    return submit([&](handler& h) { h.fill(pointer, pattern, count); });
  }
  template <typename T, typename After>
  event fill(void* pointer, const T& pattern, std::size_t count, const After& after) {
    return submit([&](handler& h) {
      h.depends_on(after);
      h.fill(pointer, pattern, count);
    });
  }
  template <typename T>
  event copy(const T* from, T* to, std::size_t count) {
    return this->memcpy(to, from, count * sizeof(T));
  }
  template <typename T, typename After>
  event copy(const T* from, T* to, std::size_t count, const After& after) {
    return this->memcpy(to, from, count * sizeof(T), after);
  }

  // Accessor forms take placeholders.
  template <typename T, int D, access_mode M, target G, access::placeholder P>
  event fill(accessor<T, D, M, G, P> to, const T& value) {
    return submit([&](handler& h) {
      h.require(to);
      h.fill(to, value);
    });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P>
  event update_host(accessor<T, D, M, G, P> from) {
    return submit([&](handler& h) {
      h.require(from);
      h.update_host(from);
    });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P, typename Place>
  event copy(accessor<T, D, M, G, P> from, Place to) {
    return submit([&](handler& h) {
      h.require(from);
      require_if_accessor(h, to);
      h.copy(from, to);
    });
  }
  template <typename Place, typename T, int D, access_mode M, target G, access::placeholder P,
            std::enable_if_t<!detail::is_accessor<Place>, int> = 0>
  event copy(Place from, accessor<T, D, M, G, P> to) {
    return submit([&](handler& h) {
      h.require(to);
      h.copy(from, to);
    });
  }

  friend bool operator==(const queue& a, const queue& b) { return a.handle_ == b.handle_; }
  friend bool operator!=(const queue& a, const queue& b) { return !(a == b); }

 private:
  friend struct std::hash<queue>;
  friend struct detail::native_access;
  explicit queue(std::shared_ptr<detail::queue_handle> handle) : handle_(std::move(handle)) {}

  template <typename KernelName, typename Ranges, typename First, typename... Rest>
  event launch(Ranges ranges, const First& first, const Rest&... rest) {
    return submit([&](handler& h) {
      if constexpr (std::is_same_v<First, event> || std::is_same_v<First, std::vector<event>>) {
        h.depends_on(first);
        h.parallel_for<KernelName>(ranges, rest...);
      } else {
        h.parallel_for<KernelName>(ranges, first, rest...);
      }
    });
  }
  template <typename Place>
  static void require_if_accessor(handler& h, const Place& place) {
    if constexpr (detail::is_accessor<Place>) {
      h.require(place);
    }
  }
  static device pick(const context& ctx, const detail::selector_view& selector);
  detail::queue_core& core() const noexcept;
  const property_list& properties() const noexcept;

  std::shared_ptr<detail::queue_handle> handle_;
};

LUMEN_NAMESPACE_END

namespace std {
template <>
struct hash<sycl::queue> {
  size_t operator()(const sycl::queue& q) const noexcept {
    return hash<const void*>()(q.handle_.get());
  }
};
}  // namespace std
