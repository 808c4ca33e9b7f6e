// SPDX-License-Identifier: Apache-2.0
// Reductions of parallel_for (SYCL 2020, section 4.9.2). Every run of consecutive items fills
// its own reducers; at the end the runs are combined in the order of their items, so a result
// depends on the number of threads, never on their timing.
#pragma once

#include <algorithm>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

#include "handler.hpp"
#include "known_identity.hpp"

LUMEN_NAMESPACE_BEGIN

// What a kernel adds to.
template <typename T, typename BinaryOperation>
class reducer {
 public:
  using value_type = T;
  using binary_operation = BinaryOperation;
  static constexpr int dimensions = 0;

  reducer(BinaryOperation operation, const std::optional<T>& start)
      : operation_(operation), value_(start) {}
  reducer(const reducer&) = delete;
  reducer(reducer&&) = default;
  reducer& operator=(const reducer&) = delete;

  reducer& combine(const T& partial) {
    value_ = value_ ? operation_(*value_, partial) : partial;
    return *this;
  }
  friend reducer& operator+=(reducer& r, const T& x) { return r.combine(x); }
  friend reducer& operator*=(reducer& r, const T& x) { return r.combine(x); }
  friend reducer& operator&=(reducer& r, const T& x) { return r.combine(x); }
  friend reducer& operator|=(reducer& r, const T& x) { return r.combine(x); }
  friend reducer& operator^=(reducer& r, const T& x) { return r.combine(x); }
  friend reducer& operator++(reducer& r) { return r.combine(T(1)); }

  // Empty when there is no identity and nothing was combined.
  const std::optional<T>& value() const { return value_; }

 private:
  BinaryOperation operation_;
  std::optional<T> value_;
};

namespace detail {

// Where the total goes and how it is made.
template <typename T, typename Op>
struct reduction_variable {
  T* place;
  Op operation;
  std::optional<T> identity;
  bool keep_initial;

  reducer<T, Op> start() const { return reducer<T, Op>(operation, identity); }
  void store(const std::optional<T>& total) const {
    if (!total) {
      return;
    }
    *place = keep_initial ? operation(*place, *total) : *total;
  }
};

template <typename T, typename Op>
std::optional<T> identity_or_nothing() {
  if constexpr (has_known_identity_v<Op, T>) {
    return known_identity_v<Op, T>;
  } else {
    return std::nullopt;
  }
}

// The runs of one launch: their values, by the number of their first item.
template <typename... Variables>
class reduction_runs {
 public:
  explicit reduction_runs(const Variables&... variables) : variables_(variables...) {}

  auto start() const {
    return std::apply([](const auto&... v) { return std::make_tuple(v.start()...); }, variables_);
  }
  template <typename Reducers>
  void keep(std::size_t first_item, Reducers& reducers) const {
    const std::lock_guard<std::mutex> lock(*mutex_);
    runs_->emplace_back(
        first_item, std::apply([](const auto&... r) { return values(r.value()...); }, reducers));
  }
  void finish() const {
    std::sort(runs_->begin(), runs_->end(),
              [](const auto& a, const auto& b) { return a.first < b.first; });
    store(std::index_sequence_for<Variables...>());
  }

 private:
  template <typename Variable>
  struct value_of;
  template <typename T, typename Op>
  struct value_of<reduction_variable<T, Op>> {
    using type = std::optional<T>;
  };
  using values = std::tuple<typename value_of<Variables>::type...>;

  template <std::size_t... Numbers>
  void store(std::index_sequence<Numbers...>) const {
    (store_one<Numbers>(), ...);
  }
  template <std::size_t Number>
  void store_one() const {
    const auto& variable = std::get<Number>(variables_);
    auto total = variable.start();
    for (const auto& run : *runs_) {
      if (const auto& part = std::get<Number>(run.second)) {
        total.combine(*part);
      }
    }
    variable.store(total.value());
  }

  std::tuple<Variables...> variables_;
  std::unique_ptr<std::mutex> mutex_ = std::make_unique<std::mutex>();
  std::unique_ptr<std::vector<std::pair<std::size_t, values>>> runs_ =
      std::make_unique<std::vector<std::pair<std::size_t, values>>>();
};

template <int Dimensions, typename Function, typename... Variables>
class range_reduction final : public kernel_command {
 public:
  range_reduction(const range<Dimensions>& sizes, const Function& function,
                  const Variables&... variables)
      : sizes_(sizes), function_(function), runs_(variables...) {}
  void run_items(std::size_t begin, std::size_t end) const override {
    auto reducers = runs_.start();
    std::apply(
        [&](auto&... r) {
          for_items<Dimensions>(
              sizes_, id<Dimensions>(), begin, end,
              [&](const item<Dimensions>& position) { call_with_item(function_, position, r...); });
        },
        reducers);
    runs_.keep(begin, reducers);
  }
  void finish() override { runs_.finish(); }
  bool ends_on_host() const override { return true; }

 private:
  range<Dimensions> sizes_;
  Function function_;
  reduction_runs<Variables...> runs_;
};

template <int Dimensions, typename Function, typename... Variables>
class nd_range_reduction final : public kernel_command {
 public:
  explicit nd_range_reduction(const Function& function, const Variables&... variables)
      : function_(function), runs_(variables...) {}
  bool needs_groups() const override { return true; }
  void run_group(group_frame& frame) const override {
    if (frame.next_item == frame.item_count) {
      return;
    }
    const nd_item<Dimensions> first = nd_item_maker::make<Dimensions>(frame, frame.next_item);
    const std::size_t number = first.get_group_linear_id() * frame.item_count + frame.next_item;
    auto reducers = runs_.start();
    while (frame.next_item < frame.item_count) {
      std::apply(
          [&](auto&... r) {
            function_(nd_item_maker::make<Dimensions>(frame, frame.next_item++), r...);
          },
          reducers);
      if (!frame.end_item()) {
        return;
      }
    }
    runs_.keep(number, reducers);
  }
  void finish() override { runs_.finish(); }
  bool ends_on_host() const override { return true; }

 private:
  Function function_;
  reduction_runs<Variables...> runs_;
};

template <int Dimensions, typename Function, typename... Variables>
std::unique_ptr<kernel_command> reduction_work(const range<Dimensions>& sizes,
                                               const Function& function,
                                               const Variables&... variables) {
  return std::make_unique<range_reduction<Dimensions, Function, Variables...>>(sizes, function,
                                                                               variables...);
}
template <int Dimensions, typename Function, typename... Variables>
std::unique_ptr<kernel_command> reduction_work(const nd_range<Dimensions>&,
                                               const Function& function,
                                               const Variables&... variables) {
  return std::make_unique<nd_range_reduction<Dimensions, Function, Variables...>>(function,
                                                                                  variables...);
}

inline launch_shape reduction_shape(const range<1>& r) {
  return shape_of(r, id<1>());
}
inline launch_shape reduction_shape(const range<2>& r) {
  return shape_of(r, id<2>());
}
inline launch_shape reduction_shape(const range<3>& r) {
  return shape_of(r, id<3>());
}
template <int Dimensions>
launch_shape reduction_shape(const nd_range<Dimensions>& r) {
  return shape_of(r);
}

// How the function templates below hand their work to the handler.
struct reduction_launcher {
  LUMEN_EXPORT static void launch(handler& group, const launch_shape& shape,
                                  std::unique_ptr<kernel_command> work);
};

template <typename Make, std::size_t... Numbers>
auto apply_numbers(const Make& make, std::index_sequence<Numbers...>) {
  return make(std::integral_constant<std::size_t, Numbers>()...);
}

// The kernel comes last, after its reduction variables.
template <typename Ranges, typename... Rest>
void launch_reduction(handler& group, const Ranges& ranges, const Rest&... rest) {
  const auto all = std::tie(rest...);
  constexpr std::size_t last = sizeof...(Rest) - 1;
  check_kernel_type<std::decay_t<decltype(std::get<last>(all))>>();
  const auto make = [&](auto... numbers) {
    return reduction_work(ranges, std::get<last>(all), std::get<numbers>(all)...);
  };
  reduction_launcher::launch(group, reduction_shape(ranges),
                             apply_numbers(make, std::make_index_sequence<last>()));
}

}  // namespace detail

template <typename T, typename Op>
auto reduction(T* place, Op operation, const property_list& properties = {}) {
  return detail::reduction_variable<T, Op>{
      place, operation, detail::identity_or_nothing<T, Op>(),
      !detail::property_access::has<property::reduction::initialize_to_identity>(properties)};
}
template <typename T, typename Op>
auto reduction(T* place, const T& identity, Op operation, const property_list& properties = {}) {
  return detail::reduction_variable<T, Op>{
      place, operation, identity,
      !detail::property_access::has<property::reduction::initialize_to_identity>(properties)};
}
// The first element of the buffer takes the total.
template <typename T, typename Allocator, typename Op>
auto reduction(buffer<T, 1, Allocator> variable, handler& group, Op operation,
               const property_list& properties = {}) {
  const accessor<T, 1, access_mode::read_write> bound(variable, group);
  return reduction(bound.get_pointer(), operation, properties);
}
template <typename T, typename Allocator, typename Op>
auto reduction(buffer<T, 1, Allocator> variable, handler& group, const T& identity, Op operation,
               const property_list& properties = {}) {
  const accessor<T, 1, access_mode::read_write> bound(variable, group);
  return reduction(bound.get_pointer(), identity, operation, properties);
}

LUMEN_NAMESPACE_END
