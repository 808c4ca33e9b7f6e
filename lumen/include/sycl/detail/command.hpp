// SPDX-License-Identifier: Apache-2.0
// Closure records: what a command group asks to run, owned by its task. The templates hold the
// user's function and the loop over items, which thus inlines; all else sees the base classes.
#pragma once

#include <cstddef>
#include <type_traits>
#include <utility>

#include "device_copyable.hpp"
#include "group_frame.hpp"
#include "item.hpp"
#include "nd_item.hpp"

LUMEN_NAMESPACE_BEGIN

class interop_handle;

namespace detail {

// Sizes of a launch; local_range matters for groups only.
struct launch_shape {
  int dimensions = 1;
  std::size_t global_range[3] = {1, 1, 1};
  std::size_t local_range[3] = {1, 1, 1};
  std::size_t offset[3] = {0, 0, 0};
  std::size_t local_bytes = 0;

  std::size_t total() const { return global_range[0] * global_range[1] * global_range[2]; }
};

template <int Dimensions>
inline launch_shape shape_of(const range<Dimensions>& global, const id<Dimensions>& offset) {
  launch_shape shape;
  shape.dimensions = Dimensions;
  for (int d = 0; d < Dimensions; ++d) {
    shape.global_range[d] = global[d];
    shape.offset[d] = offset[d];
  }
  return shape;
}

template <int Dimensions>
inline launch_shape shape_of(const nd_range<Dimensions>& ranges) {
  launch_shape shape = shape_of(ranges.get_global_range(), ranges.get_offset());
  for (int d = 0; d < Dimensions; ++d) {
    shape.local_range[d] = ranges.get_local_range()[d];
  }
  return shape;
}

// Kernels carry bytes only: closures that own something (strings, containers, buffers, queues)
// do not go to a device. Types declared device copyable may say otherwise of themselves.
template <typename Function>
constexpr void check_kernel_type() {
  static_assert(is_device_copyable_v<Function> || std::is_trivially_destructible_v<Function>,
                "what a kernel captures must be device copyable");
}

class LUMEN_EXPORT command {
 public:
  command() = default;
  command(const command&) = delete;
  command& operator=(const command&) = delete;
  virtual ~command();
};

// Runs once on the host, on whatever thread claims it.
class LUMEN_EXPORT host_command : public command {
 public:
  ~host_command() override;
  virtual void run(const interop_handle& handle) = 0;
};

// Runs over items on a device; each kind of launch overrides its own function.
class LUMEN_EXPORT kernel_command : public command {
 public:
  ~kernel_command() override;
  // The items [begin, end) of a range, in row-major order.
  virtual void run_items(std::size_t begin, std::size_t end) const;
  // Items of one group, from frame.next_item on, until none is left or the group diverged.
  virtual void run_group(group_frame& frame) const;
  // True for a launch over an nd_range.
  virtual bool needs_groups() const;
  // Called once after the last item.
  virtual void finish();
};

template <typename Function>
class host_function final : public host_command {
 public:
  explicit host_function(Function&& function) : function_(std::move(function)) {}
  explicit host_function(const Function& function) : function_(function) {}
  void run(const interop_handle& handle) override {
    if constexpr (std::is_invocable_v<Function&, const interop_handle&>) {
      function_(handle);
    } else {
      (void)handle;
      function_();
    }
  }

 private:
  Function function_;
};

template <typename Function>
class single_kernel final : public kernel_command {
 public:
  explicit single_kernel(const Function& function) : function_(function) {}
  void run_items(std::size_t, std::size_t) const override { function_(); }

 private:
  Function function_;
};

// Calls the kernel with the item, which becomes an integer where the kernel takes one. A kernel
// may take a narrower integer than size_t: the range check makes sure that the ids fit.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wconversion"
template <typename Function, int Dimensions, typename... Rest>
SYCL_EXTERNAL inline void call_with_item(const Function& function,
                                         const item<Dimensions, true>& position, Rest&... rest) {
  if constexpr (std::is_invocable_v<const Function&, item<Dimensions, true>, Rest&...>) {
    function(position, rest...);
  } else if constexpr (std::is_invocable_v<const Function&, item<Dimensions, false>, Rest&...>) {
    function(item_maker::plain(position.get_id(), position.get_range()), rest...);
  } else {
    function(position.get_id(), rest...);
  }
}
#pragma GCC diagnostic pop

// Visits the items [begin, end) of a range in row-major order.
template <int Dimensions, typename Visit>
SYCL_EXTERNAL inline void for_items(const range<Dimensions>& sizes, const id<Dimensions>& offset,
                                    std::size_t begin, std::size_t end, const Visit& visit) {
  if constexpr (Dimensions == 1) {
    for (std::size_t i = begin; i < end; ++i) {
      visit(item_maker::with_offset<1>(id<1>(i + offset[0]), sizes, offset));
    }
  } else {
    id<Dimensions> index = index_of<Dimensions>(begin, sizes);
    for (std::size_t i = begin; i < end; ++i) {
      visit(item_maker::with_offset<Dimensions>(index + offset, sizes, offset));
      for (int d = Dimensions - 1; d >= 0 && ++index[d] == sizes[d] && d > 0; --d) {
        index[d] = 0;
      }
    }
  }
}

template <int Dimensions, typename Function>
class range_kernel final : public kernel_command {
 public:
  range_kernel(const range<Dimensions>& sizes, const id<Dimensions>& offset,
               const Function& function)
      : sizes_(sizes), offset_(offset), function_(function) {}
  // Everything that a kernel calls is inlined, as compilers for devices do: what does not vary from
  // item to item then leaves the loop.
  [[gnu::flatten]] void run_items(std::size_t begin, std::size_t end) const override {
    for_items<Dimensions>(sizes_, offset_, begin, end, [this](const item<Dimensions>& position) {
      call_with_item(function_, position);
    });
  }

 private:
  range<Dimensions> sizes_;
  id<Dimensions> offset_;
  Function function_;
};

template <int Dimensions, typename Function>
class nd_range_kernel final : public kernel_command {
 public:
  explicit nd_range_kernel(const Function& function) : function_(function) {}
  bool needs_groups() const override { return true; }
  void run_group(group_frame& frame) const override {
    while (frame.next_item < frame.item_count) {
      function_(nd_item_maker::make<Dimensions>(frame, frame.next_item++));
      if (!frame.end_item()) {
        return;
      }
    }
  }

 private:
  Function function_;
};

}  // namespace detail

LUMEN_NAMESPACE_END
