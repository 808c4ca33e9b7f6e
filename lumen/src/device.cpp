// SPDX-License-Identifier: Apache-2.0
// Devices, platforms and selectors over the records of all backends.
#include "sycl/detail/device.hpp"

#include <algorithm>

#include "backend.hpp"
#include "executor.hpp"
#include "memory_place.hpp"
#include "settings.hpp"
#include "sycl/detail/context.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

namespace {

// Takes the devices of a backend into a list, each with its place where contexts have no say.
// Returns whether there are any. The records are never released, nor are their drivers: handles and
// threads may outlive main.
bool add_devices(backend_driver& driver, std::vector<const device_record*>& list) {
  const std::size_t before = list.size();
  for (std::unique_ptr<device_record>& record : driver.enumerate()) {
    record->driver = &driver;
    if (driver.native() == nullptr) {
      record->place = std::make_shared<memory_place>(*record, nullptr);
    }
    list.push_back(record.release());
  }
  return list.size() != before;
}

// The platforms whose kernels are their own, with their devices.
struct native_backends {
  native_platform* opencl = nullptr;
  native_platform* level_zero = nullptr;
  std::vector<const device_record*> devices;

  native_backends() {
    const backend_choice wanted = backends_from_environment();
    if (wanted.opencl) {
      add(make_opencl_driver(), opencl);
    }
    if (wanted.level_zero) {
      add(make_level_zero_driver(), level_zero);
    }
    if (!devices.empty()) {
      executor::stop_before_others();
    }
  }
  static const native_backends& instance() {
    static const auto& only = *new native_backends;
    return only;
  }

 private:
  void add(std::unique_ptr<backend_driver> made, native_platform*& platform) {
    platform = made->native();
    if (platform != nullptr) {
      add_devices(*made.release(), devices);
    }
  }
};

bool is_native(backend kind) {
  return kind == backend::opencl || kind == backend::ext_kestrel_level_zero;
}

std::vector<const device_record*> all_devices() {
  std::vector<const device_record*> all = own_devices();
  all.insert(all.end(), native_devices().begin(), native_devices().end());
  return all;
}

// These rate the host above every native device, so that no driver is loaded to find the best.
bool prefers_own_devices(const selector_view& selector) {
  return selector.object == reinterpret_cast<const void*>(&default_selector_v) ||
         selector.object == reinterpret_cast<const void*>(&cpu_selector_v);
}

}  // namespace

const std::vector<const device_record*>& own_devices() {
  static const auto& devices = *[] {
    auto* found = new std::vector<const device_record*>;
    const backend_choice wanted = backends_from_environment();
    const auto add = [found](std::unique_ptr<backend_driver> made) {
      if (add_devices(*made, *found)) {
        static_cast<void>(made.release());
      }
    };
    add(make_host_driver());
    add(make_detached_driver());
#if defined(LUMEN_CUDA)
    if (wanted.cuda) {
      add(make_cuda_driver());
    }
#endif
    static_cast<void>(wanted);
    return found;
  }();
  return devices;
}

const std::vector<const device_record*>& native_devices() {
  return native_backends::instance().devices;
}

native_platform& native_platform_of(backend kind) {
  const native_backends& found = native_backends::instance();
  native_platform* const platform = kind == backend::opencl ? found.opencl : found.level_zero;
  if (!is_native(kind) || platform == nullptr) {
    throw exception(make_error_code(errc::platform),
                    "the backend of the native handle is not there: its loader is missing, or "
                    "LUMEN_BACKENDS leaves it out");
  }
  return *platform;
}

device select_device(const selector_view& selector) {
  const device_record* best = nullptr;
  int best_rating = -1;
  for (const device_record* record :
       prefers_own_devices(selector) ? own_devices() : all_devices()) {
    const device candidate = device_record::handle(*record);
    const int rating = selector.rate(selector.object, candidate);
    if (rating > best_rating) {
      best_rating = rating;
      best = record;
    }
  }
  if (best == nullptr) {
    throw exception(make_error_code(errc::runtime),
                    "no device of this system is acceptable to the selector");
  }
  return device_record::handle(*best);
}

int aspect_rating::operator()(const device& candidate) const {
  const auto has = [&candidate](aspect a) { return candidate.has(a); };
  if (!std::all_of(wanted.begin(), wanted.end(), has) ||
      std::any_of(denied.begin(), denied.end(), has)) {
    return -1;
  }
  return default_selector_v(candidate);
}

}  // namespace detail

using detail::device_record;

int default_selector_v(const device& candidate) {
  return device_record::of(candidate).default_rating;
}
int cpu_selector_v(const device& candidate) {
  return candidate.is_cpu() ? default_selector_v(candidate) : -1;
}
int gpu_selector_v(const device& candidate) {
  return candidate.is_gpu() ? default_selector_v(candidate) : -1;
}
int accelerator_selector_v(const device& candidate) {
  return candidate.is_accelerator() ? default_selector_v(candidate) : -1;
}

device::device() : device(default_selector_v) {}

std::vector<device> device::get_devices(info::device_type type) {
  std::vector<device> result;
  for (const device_record* record : detail::all_devices()) {
    if (type == info::device_type::all || type == record->properties.device_type) {
      result.push_back(device(record));
    }
  }
  if (type == info::device_type::automatic) {
    result.push_back(device());
  }
  return result;
}

bool device::is_cpu() const noexcept {
  return record_->properties.device_type == info::device_type::cpu;
}
bool device::is_gpu() const noexcept {
  return record_->properties.device_type == info::device_type::gpu;
}
bool device::is_accelerator() const noexcept {
  return record_->properties.device_type == info::device_type::accelerator;
}
backend device::get_backend() const noexcept {
  return record_->platform->kind;
}
platform device::get_platform() const {
  return platform(record_->platform);
}
bool device::has(aspect a) const {
  const std::vector<aspect>& aspects = record_->properties.aspects;
  return std::find(aspects.begin(), aspects.end(), a) != aspects.end();
}
bool device::has_extension(const std::string& extension) const {
  const std::vector<std::string>& extensions = record_->properties.extensions;
  return std::find(extensions.begin(), extensions.end(), extension) != extensions.end();
}
void device::refuse_partition() {
  throw exception(make_error_code(errc::feature_not_supported),
                  "create_sub_devices: this device cannot be partitioned");
}

#define LUMEN_DEVICE_INFO(name, type)                              \
  template <>                                                      \
  LUMEN_EXPORT type device::get_info<info::device::name>() const { \
    return record_->properties.name;                               \
  }
#include "sycl/detail/info_device.def"
#undef LUMEN_DEVICE_INFO
template <>
LUMEN_EXPORT platform device::get_info<info::device::platform>() const {
  return get_platform();
}
template <>
LUMEN_EXPORT device device::get_info<info::device::parent_device>() const {
  if (record_->parent != nullptr) {
    return device(record_->parent);
  }
  throw exception(make_error_code(errc::invalid), "the device is not a sub-device");
}
template <>
LUMEN_EXPORT id<1> device::get_info<info::device::max_work_item_sizes<1>>() const {
  return id<1>(record_->properties.max_work_group_size);
}
template <>
LUMEN_EXPORT id<2> device::get_info<info::device::max_work_item_sizes<2>>() const {
  const std::size_t size = record_->properties.max_work_group_size;
  return id<2>(size, size);
}
template <>
LUMEN_EXPORT id<3> device::get_info<info::device::max_work_item_sizes<3>>() const {
  const std::size_t size = record_->properties.max_work_group_size;
  return id<3>(size, size, size);
}

platform::platform() : platform(default_selector_v) {}

std::vector<platform> platform::get_platforms() {
  std::vector<platform> result;
  for (const detail::device_record* record : detail::all_devices()) {
    const platform candidate(record->platform);
    if (std::find(result.begin(), result.end(), candidate) == result.end()) {
      result.push_back(candidate);
    }
  }
  return result;
}
std::vector<device> platform::get_devices(info::device_type type) const {
  std::vector<device> result;
  const auto& candidates =
      detail::is_native(record_->kind) ? detail::native_devices() : detail::own_devices();
  for (const device_record* candidate : candidates) {
    if (candidate->platform == record_ &&
        (type == info::device_type::all || type == candidate->properties.device_type)) {
      result.push_back(device_record::handle(*candidate));
    }
  }
  return result;
}
backend platform::get_backend() const noexcept {
  return record_->kind;
}
bool platform::has(aspect a) const {
  const std::vector<device> devices = get_devices();
  return std::all_of(devices.begin(), devices.end(), [a](const device& d) { return d.has(a); });
}
bool platform::has_extension(const std::string& extension) const {
  return std::find(record_->extensions.begin(), record_->extensions.end(), extension) !=
         record_->extensions.end();
}

template <>
LUMEN_EXPORT std::string platform::get_info<info::platform::name>() const {
  return record_->name;
}
template <>
LUMEN_EXPORT std::string platform::get_info<info::platform::vendor>() const {
  return record_->vendor;
}
template <>
LUMEN_EXPORT std::string platform::get_info<info::platform::version>() const {
  return record_->version;
}
template <>
LUMEN_EXPORT std::string platform::get_info<info::platform::profile>() const {
  return record_->profile;
}
template <>
LUMEN_EXPORT std::vector<std::string> platform::get_info<info::platform::extensions>() const {
  return record_->extensions;
}

LUMEN_NAMESPACE_END
