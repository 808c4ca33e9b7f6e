// SPDX-License-Identifier: Apache-2.0
// Calls of offload entries in any of their four forms, with one list of arguments.
#pragma once

#include <cstdint>
#include <type_traits>

namespace tarn_test {

/// An argument as an entry takes it: as it is, or the address of a copy where a scalar is given and
/// a pointer is taken.
template <typename Parameter, typename Given>
class passed {
  static constexpr bool as_it_is =
      std::is_arithmetic_v<Parameter> || std::is_convertible_v<Given, Parameter>;
  using stored = std::conditional_t<as_it_is, Parameter,
                                    std::remove_const_t<std::remove_pointer_t<Parameter>>>;

 public:
  explicit passed(const Given& given) : value_(static_cast<stored>(given)) {}
  Parameter get() const {
    if constexpr (as_it_is) {
      return value_;
    } else {
      return &value_;
    }
  }

 private:
  stored value_;
};

template <typename... Parameter, typename... Given>
int call(int (*entry)(Parameter...), const Given&... given) {
  static_assert(sizeof...(Parameter) == sizeof...(Given), "another number of arguments");
  return entry(passed<Parameter, Given>(given).get()...);
}

/// The type of the integers of an entry.
template <typename Entry>
struct integer_of;
template <typename Method, typename... Others>
struct integer_of<int (*)(Method, Others...)> {
  using type = std::remove_const_t<std::remove_pointer_t<Method>>;
};
template <typename Entry>
constexpr bool is_ilp64 = std::is_same_v<typename integer_of<Entry>::type, std::int64_t>;

}  // namespace tarn_test
