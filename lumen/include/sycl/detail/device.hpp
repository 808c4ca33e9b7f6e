// SPDX-License-Identifier: Apache-2.0
// platform and device (SYCL 2020, sections 4.6.2 and 4.6.4), and their selectors. Both are
// plain handles: the records behind them live as long as the process.
#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <type_traits>
#include <vector>

#include "exception.hpp"
#include "info.hpp"
#include "property.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct device_record;
struct platform_record;

// A device selector without its type: its object and how to call it.
struct selector_view {
  const void* object;
  int (*rate)(const void* object, const device& candidate);
};
// The best-rated device; the first of equals. Throws errc::runtime when every rating is
// negative.
LUMEN_EXPORT device select_device(const selector_view& selector);

template <typename Selector>
using enable_if_selector =
    std::enable_if_t<std::is_invocable_r_v<int, const Selector&, const device&> &&
                         !std::is_same_v<std::decay_t<Selector>, device>,
                     int>;
template <typename Selector>
selector_view view_of(const Selector& selector) {
  if constexpr (std::is_function_v<Selector>) {
    return {reinterpret_cast<const void*>(&selector), [](const void* object, const device& d) {
              return static_cast<int>(reinterpret_cast<Selector*>(const_cast<void*>(object))(d));
            }};
  } else {
    return {std::addressof(selector), [](const void* object, const device& d) {
              return static_cast<int>((*static_cast<const Selector*>(object))(d));
            }};
  }
}
}  // namespace detail

class LUMEN_EXPORT platform {
 public:
  // The platform of the default device.
  platform();
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  explicit platform(const Selector& selector);

  static std::vector<platform> get_platforms();
  std::vector<device> get_devices(info::device_type type = info::device_type::all) const;
  sycl::backend get_backend() const noexcept;
  bool has(aspect a) const;
  bool has_extension(const std::string& extension) const;
  template <typename Param>
  typename Param::return_type get_info() const;

  friend bool operator==(const platform& a, const platform& b) { return a.record_ == b.record_; }
  friend bool operator!=(const platform& a, const platform& b) { return a.record_ != b.record_; }

 private:
  friend class device;
  friend struct detail::device_record;
  friend struct std::hash<platform>;
  explicit platform(const detail::platform_record* record) : record_(record) {}
  const detail::platform_record* record_;
};

class LUMEN_EXPORT device {
 public:
  // The default device.
  device();
  template <typename Selector, detail::enable_if_selector<Selector> = 0>
  explicit device(const Selector& selector)
      : device(detail::select_device(detail::view_of(selector))) {}

  static std::vector<device> get_devices(info::device_type type = info::device_type::all);

  bool is_cpu() const noexcept;
  bool is_gpu() const noexcept;
  bool is_accelerator() const noexcept;
  sycl::backend get_backend() const noexcept;
  platform get_platform() const;
  bool has(aspect a) const;
  bool has_extension(const std::string& extension) const;
  template <typename Param>
  typename Param::return_type get_info() const;

  // Devices are not partitioned here: always throws errc::feature_not_supported.
  template <info::partition_property Property, typename... Arguments>
  std::vector<device> create_sub_devices(const Arguments&...) const {
    refuse_partition();
  }

  friend bool operator==(const device& a, const device& b) { return a.record_ == b.record_; }
  friend bool operator!=(const device& a, const device& b) { return a.record_ != b.record_; }

 private:
  friend struct detail::device_record;
  friend struct std::hash<device>;
  explicit device(const detail::device_record* record) : record_(record) {}
  [[noreturn]] static void refuse_partition();
  const detail::device_record* record_;
};

template <typename Selector, detail::enable_if_selector<Selector>>
platform::platform(const Selector& selector) : platform(device(selector).get_platform()) {}

LUMEN_EXPORT int default_selector_v(const device& candidate);
LUMEN_EXPORT int cpu_selector_v(const device& candidate);
LUMEN_EXPORT int gpu_selector_v(const device& candidate);
LUMEN_EXPORT int accelerator_selector_v(const device& candidate);

namespace detail {
// Rates as the default does, but only devices with all wanted and no denied aspect.
struct aspect_rating {
  std::vector<aspect> wanted;
  std::vector<aspect> denied;
  LUMEN_EXPORT int operator()(const device& candidate) const;
};
}  // namespace detail

inline detail::aspect_rating aspect_selector(const std::vector<aspect>& wanted,
                                             const std::vector<aspect>& denied = {}) {
  return {wanted, denied};
}
template <typename... Aspects, std::enable_if_t<(std::is_same_v<Aspects, aspect> && ...), int> = 0>
detail::aspect_rating aspect_selector(Aspects... wanted) {
  return {{wanted...}, {}};
}
template <aspect... Wanted>
detail::aspect_rating aspect_selector() {
  return detail::aspect_rating{{Wanted...}, {}};
}

LUMEN_NAMESPACE_END

namespace std {
template <>
struct hash<sycl::platform> {
  size_t operator()(const sycl::platform& p) const noexcept {
    return hash<const void*>()(p.record_);
  }
};
template <>
struct hash<sycl::device> {
  size_t operator()(const sycl::device& d) const noexcept { return hash<const void*>()(d.record_); }
};
}  // namespace std
