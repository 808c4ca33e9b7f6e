// SPDX-License-Identifier: Apache-2.0
// handler (SYCL 2020, section 4.9.4) and interop_handle: what a command group function calls.
// It runs on the submitting thread; wrong arguments throw from the call itself.
#pragma once

#include <algorithm>
#include <cstddef>
#include <memory>
#include <type_traits>
#include <utility>
#include <vector>

#include "accessor.hpp"
#include "command_group.hpp"
#include "context.hpp"
#include "local_accessor.hpp"

LUMEN_NAMESPACE_BEGIN

class kernel;
class queue;

namespace detail {
struct handler_access;
template <typename First, typename...>
struct first_type {
  using type = First;
};
template <typename... Types>
using first_of = typename first_type<Types...>::type;
// Defined in reduction.hpp.
template <typename Ranges, typename... Rest>
void launch_reduction(handler& group, const Ranges& ranges, const Rest&... rest);
}  // namespace detail

// What a host_task may ask of the backend of its queue.
class interop_handle {
 public:
  interop_handle() = delete;
  sycl::backend get_backend() const noexcept { return kind_; }

 private:
  friend class detail::task;
  explicit interop_handle(sycl::backend kind) : kind_(kind) {}
  sycl::backend kind_;
};

class LUMEN_EXPORT handler {
 public:
  handler(const handler&) = delete;
  handler& operator=(const handler&) = delete;
  ~handler();

  void depends_on(const event& dependency);
  void depends_on(const std::vector<event>& dependencies);

  template <typename T, int D, access_mode M, target G, access::placeholder P>
  void require(const accessor<T, D, M, G, P>& placeholder) {
    if (placeholder.core_ == nullptr) {
      detail::throw_invalid("require: the accessor has no buffer");
    }
    placeholder.bind(*this);
  }

  // Arguments by position are those of native kernels; lambdas and functors carry their own. What
  // is not set keeps the value of an earlier launch. An argument is a value of bytes, a pointer
  // into unified shared memory, an accessor (the start of its buffer) or a local accessor.
  template <typename T>
  void set_arg(int index, const T& argument) {
    if constexpr (detail::is_accessor<T>) {
      set_pointer(index, argument.get_pointer());
    } else if constexpr (detail::is_local_accessor<T>) {
      set_local(index, argument.byte_size());
    } else if constexpr (std::is_pointer_v<T>) {
      set_pointer(index, argument);
    } else {
      static_assert(std::is_trivially_copyable_v<T>, "an argument of a kernel is a value of bytes");
      set_value(index, &argument, sizeof(T));
    }
  }
  template <typename... Ts>
  void set_args(const Ts&... arguments) {
    int index = 0;
    (set_arg(index++, arguments), ...);
  }

  // Later command groups of the queue come after this one. It comes after all earlier ones, or
  // after the given events alone; waiting for it waits for them.
  void ext_kestrel_barrier();
  void ext_kestrel_barrier(const std::vector<event>& events);

  // In each launch a native kernel may stand for the function; throws errc::invalid when it is not
  // of the queue's context.
  template <typename KernelName = void, typename Function>
  void single_task(const Function& function) {
    if constexpr (std::is_same_v<Function, kernel>) {
      launch_native(detail::shape_of(range<1>(1), id<1>()), true, function);
    } else {
      detail::check_kernel_type<Function>();
      launch(detail::shape_of(range<1>(1), id<1>()),
             std::make_unique<detail::single_kernel<Function>>(function));
    }
  }

  // Launches throw errc::kernel_not_supported when the program has no code of the kernel for the
  // device. Throws errc::runtime when the range or an offset exceeds a signed 32-bit integer.
  // The range may also be given as a number or in braces.
  template <typename KernelName = void, typename... Rest>
  void parallel_for(range<1> sizes, const Rest&... rest) {
    launch_sizes(sizes, rest...);
  }
  template <typename KernelName = void, typename... Rest>
  void parallel_for(range<2> sizes, const Rest&... rest) {
    launch_sizes(sizes, rest...);
  }
  template <typename KernelName = void, typename... Rest>
  void parallel_for(range<3> sizes, const Rest&... rest) {
    launch_sizes(sizes, rest...);
  }
  // Throws errc::nd_range unless the groups divide the range and fit the device.
  template <typename KernelName = void, int Dimensions, typename... Rest>
  void parallel_for(nd_range<Dimensions> ranges, const Rest&... rest) {
    if constexpr (sizeof...(Rest) == 1) {
      (launch_groups(ranges, rest), ...);
    } else {
      detail::launch_reduction(*this, ranges, rest...);
    }
  }

  // Runs on the host: on a worker, or on the first thread that waits for it.
  template <typename Function>
  void host_task(Function&& function) {
    run_on_host(std::make_unique<detail::host_function<std::decay_t<Function>>>(
        std::forward<Function>(function)));
  }

  // Sizes are bytes, counts are elements; patterns and elements are trivially copyable.
  void memcpy(void* to, const void* from, std::size_t bytes);
  void memset(void* pointer, int value, std::size_t bytes);
  void prefetch(void* pointer, std::size_t bytes);
  void mem_advise(void* pointer, std::size_t bytes, int advice);
  template <typename T>
  void copy(const T* from, T* to, std::size_t count) {
    this->memcpy(to, from, count * sizeof(T));
  }
  template <typename T>
  void fill(void* pointer, const T& pattern, std::size_t count) {
    fill_bytes(pointer, &pattern, sizeof(T), count);
  }

  // Through accessors the host does the work, on its own memory.
  template <typename T, int D, access_mode M, target G, access::placeholder P>
  void fill(accessor<T, D, M, G, P> to, const T& value) {
    host_task([to = to.on_host(*this), value] {
      for (auto& element : to) {
        element = value;
      }
    });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P, typename U>
  void copy(accessor<T, D, M, G, P> from, U* to) {
    host_task([from = from.on_host(*this), to] { std::copy(from.begin(), from.end(), to); });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P, typename U>
  void copy(accessor<T, D, M, G, P> from, std::shared_ptr<U> to) {
    host_task([from = from.on_host(*this), to] { std::copy(from.begin(), from.end(), to.get()); });
  }
  template <typename U, typename T, int D, access_mode M, target G, access::placeholder P>
  void copy(const U* from, accessor<T, D, M, G, P> to) {
    host_task([from, to = to.on_host(*this)] { std::copy_n(from, to.size(), to.begin()); });
  }
  template <typename U, typename T, int D, access_mode M, target G, access::placeholder P>
  void copy(std::shared_ptr<U> from, accessor<T, D, M, G, P> to) {
    host_task([from, to = to.on_host(*this)] { std::copy_n(from.get(), to.size(), to.begin()); });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P, typename U, int E,
            access_mode N, target H, access::placeholder Q>
  void copy(accessor<T, D, M, G, P> from, accessor<U, E, N, H, Q> to) {
    if (to.size() < from.size()) {
      detail::throw_invalid("copy: the destination is smaller than the source");
    }
    host_task([from = from.on_host(*this), to = to.on_host(*this)] {
      std::copy(from.begin(), from.end(), to.begin());
    });
  }
  template <typename T, int D, access_mode M, target G, access::placeholder P>
  void update_host(accessor<T, D, M, G, P> from) {
    host_task([from = from.on_host(*this)] {});
  }

 private:
  friend class queue;
  friend struct detail::handler_access;
  explicit handler(detail::queue_core& core);

  template <int Dimensions, typename... Rest>
  void launch_sizes(const range<Dimensions>& sizes, const Rest&... rest) {
    if constexpr (sizeof...(Rest) == 1) {
      (launch_range(sizes, id<Dimensions>(), rest), ...);
    } else if constexpr (std::is_same_v<std::decay_t<detail::first_of<Rest...>>, id<Dimensions>>) {
      launch_range(sizes, rest...);
    } else {
      detail::launch_reduction(*this, sizes, rest...);
    }
  }
  template <int Dimensions, typename Function>
  void launch_range(range<Dimensions> sizes, id<Dimensions> offset, const Function& function) {
    if constexpr (std::is_same_v<Function, kernel>) {
      launch_native(detail::shape_of(sizes, offset), false, function);
    } else {
      detail::check_kernel_type<Function>();
      launch(detail::shape_of(sizes, offset),
             std::make_unique<detail::range_kernel<Dimensions, Function>>(sizes, offset, function));
    }
  }
  template <int Dimensions, typename Function>
  void launch_groups(const nd_range<Dimensions>& ranges, const Function& function) {
    if constexpr (std::is_same_v<Function, kernel>) {
      launch_native(detail::shape_of(ranges), true, function);
    } else {
      detail::check_kernel_type<Function>();
      launch(detail::shape_of(ranges),
             std::make_unique<detail::nd_range_kernel<Dimensions, Function>>(function));
    }
  }
  void launch(const detail::launch_shape& shape, std::unique_ptr<detail::kernel_command> work);
  void launch_native(const detail::launch_shape& shape, bool grouped, const kernel& native);
  void set_value(int index, const void* value, std::size_t bytes);
  void set_pointer(int index, const void* pointer);
  void set_local(int index, std::size_t bytes);
  void run_on_host(std::unique_ptr<detail::host_command> work);
  void run_on_device(std::unique_ptr<detail::device_command> work);
  void fill_bytes(void* pointer, const void* pattern, std::size_t pattern_bytes, std::size_t count);
  event finish();

  detail::command_group group_;
};

LUMEN_NAMESPACE_END
