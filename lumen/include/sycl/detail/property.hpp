// SPDX-License-Identifier: Apache-2.0
// Properties (SYCL 2020, section 4.5.4): flags as bits, the one that carries data as a member.
#pragma once

#include <mutex>
#include <type_traits>

#include "config.hpp"
#include "exception.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct property_access;
enum class property_bit : unsigned {
  in_order = 1,
  enable_profiling = 2,
  no_init = 4,
  use_host_ptr = 8,
  use_mutex = 16,
  initialize_to_identity = 32,
};
}  // namespace detail

namespace property {
namespace queue {
class in_order {};
class enable_profiling {};
}  // namespace queue
class no_init {};
namespace buffer {
class use_host_ptr {};
// Names the mutex that the user holds while touching the host memory of the buffer.
class use_mutex {
 public:
  explicit use_mutex(std::mutex& reference) : mutex_(&reference) {}
  std::mutex* get_mutex_ptr() const { return mutex_; }

 private:
  std::mutex* mutex_;
};
}  // namespace buffer
namespace reduction {
class initialize_to_identity {};
}  // namespace reduction
}  // namespace property

inline constexpr property::no_init no_init{};

template <typename Property>
struct is_property : std::false_type {};
template <typename Property, typename Object>
struct is_property_of : std::false_type {};
template <typename Property>
inline constexpr bool is_property_v = is_property<Property>::value;
template <typename Property, typename Object>
inline constexpr bool is_property_of_v = is_property_of<Property, Object>::value;

class queue;

#define LUMEN_PROPERTY(type, bit)                                           \
  template <>                                                               \
  struct is_property<type> : std::true_type {                               \
    static constexpr detail::property_bit mask = detail::property_bit::bit; \
  };
LUMEN_PROPERTY(property::queue::in_order, in_order)
LUMEN_PROPERTY(property::queue::enable_profiling, enable_profiling)
LUMEN_PROPERTY(property::no_init, no_init)
LUMEN_PROPERTY(property::buffer::use_host_ptr, use_host_ptr)
LUMEN_PROPERTY(property::buffer::use_mutex, use_mutex)
LUMEN_PROPERTY(property::reduction::initialize_to_identity, initialize_to_identity)
#undef LUMEN_PROPERTY
template <>
struct is_property_of<property::queue::in_order, queue> : std::true_type {};
template <>
struct is_property_of<property::queue::enable_profiling, queue> : std::true_type {};

class property_list {
 public:
  property_list() = default;
  template <
      typename... Properties,
      std::enable_if_t<
          (sizeof...(Properties) > 0) && (is_property_v<std::decay_t<Properties>> && ...), int> = 0>
  property_list(Properties... properties) {
    (add(properties), ...);
  }

 private:
  friend struct detail::property_access;
  template <typename Property>
  void add(const Property& property) {
    bits_ |= static_cast<unsigned>(is_property<Property>::mask);
    if constexpr (std::is_same_v<Property, property::buffer::use_mutex>) {
      mutex_ = property.get_mutex_ptr();
    }
  }

  unsigned bits_ = 0;
  std::mutex* mutex_ = nullptr;
};

namespace detail {
// How the runtime reads a list; users ask the object that they gave it to.
struct property_access {
  template <typename Property>
  static bool has(const property_list& list) noexcept {
    return (list.bits_ & static_cast<unsigned>(is_property<Property>::mask)) != 0;
  }
  // Throws errc::invalid unless the list has the property.
  template <typename Property>
  static Property get(const property_list& list) {
    if (!has<Property>(list)) {
      throw exception(make_error_code(errc::invalid), "the object lacks the property asked for");
    }
    if constexpr (std::is_same_v<Property, property::buffer::use_mutex>) {
      return Property(*list.mutex_);
    } else {
      return Property();
    }
  }
};
}  // namespace detail

LUMEN_NAMESPACE_END
