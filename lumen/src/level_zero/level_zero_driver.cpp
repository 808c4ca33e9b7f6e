// SPDX-License-Identifier: Apache-2.0
// The Level Zero backend: devices of every driver that the machine's loader finds, memory of every
// kind in contexts, and objects over handles that come in.
#include <algorithm>
#include <mutex>

#include "../backend.hpp"
#include "level_zero_kernel.hpp"
#include "level_zero_stream.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// Level Zero counts no references: an object that somebody keeps is never destroyed here, and one
// that is handed over is, even where nothing can be made over it.
template <typename Handle>
level_zero_object<Handle> adopted(void* handle, ownership owner) {
  return level_zero_object<Handle>(handle, owner == ownership::transfer);
}

ze_device_mem_alloc_desc_t device_memory() {
  ze_device_mem_alloc_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_DEVICE_MEM_ALLOC_DESC;
  return description;
}
ze_host_mem_alloc_desc_t host_memory() {
  ze_host_mem_alloc_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_HOST_MEM_ALLOC_DESC;
  return description;
}

bool is_shortage(ze_result_t result) {
  return result == ZE_RESULT_ERROR_OUT_OF_DEVICE_MEMORY ||
         result == ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY ||
         result == ZE_RESULT_ERROR_UNSUPPORTED_SIZE ||
         result == ZE_RESULT_ERROR_UNSUPPORTED_ALIGNMENT;
}

class level_zero_driver final : public backend_driver, public native_platform {
 public:
  std::vector<std::unique_ptr<device_record>> enumerate() override;

  void* allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                 std::size_t bytes) override;
  void release(const memory_place& place, usm::alloc, void* pointer) noexcept override {
    static_cast<void>(ze().zeMemFree(context_of(place).get(), pointer));
  }
  std::unique_ptr<command_stream> make_stream(const memory_place& place, bool timed) override {
    return make_level_zero_stream(place, timed);
  }
  void copy(const memory_place& place, void* to, const void* from, std::size_t bytes) override {
    context_of(place).copy(handle_of(place.device), to, from, bytes);
  }
  native_platform* native() noexcept override { return has_level_zero() ? this : nullptr; }

  const device_record& device_of(void* handle) override;
  std::shared_ptr<native_context> make_context(
      const std::vector<const device_record*>& devices) override;
  std::shared_ptr<native_context> adopt_context(void* handle, ownership owner) override {
    return std::make_shared<level_zero_context>(adopted<ze_context_handle_t>(handle, owner));
  }
  // Level Zero does not tell.
  std::vector<const device_record*> devices_of(const native_context&) override { return {}; }
  std::unique_ptr<command_stream> adopt_queue(const memory_place& place, void* handle,
                                              ownership owner, bool timed) override {
    return make_level_zero_stream(place, timed, adopted<ze_command_queue_handle_t>(handle, owner));
  }
  queue_traits traits_of_queue(void*) override { return {false, false, nullptr}; }
  std::shared_ptr<native_program> adopt_program(const std::shared_ptr<native_context>& context,
                                                void* handle, ownership owner) override {
    return std::make_shared<level_zero_program>(context,
                                                adopted<ze_module_handle_t>(handle, owner));
  }
  std::shared_ptr<native_kernel> adopt_kernel(const std::shared_ptr<native_context>& context,
                                              const std::shared_ptr<native_program>& program,
                                              void* handle, ownership owner) override {
    return std::make_shared<level_zero_kernel>(context, program,
                                               adopted<ze_kernel_handle_t>(handle, owner));
  }
  void share(native_kind, void*) override {}

 private:
  void add_devices(ze_driver_handle_t driver, std::vector<std::unique_ptr<device_record>>& found);
  void add_parts(const device_record& whole);
  const device_record* known(const void* handle) const;

  std::vector<std::unique_ptr<platform_record>> platforms_;
  std::mutex mutex_;                           // guards the sub-devices
  std::vector<const device_record*> devices_;  // those enumerated, then sub-devices
  std::size_t asked_for_parts_ = 0;            // how many of them
  std::vector<std::unique_ptr<device_record>> parts_;
};

// What cannot answer is left out: a driver with its devices, or a device alone.
template <typename Call>
void if_it_answers(Call call) {
  try {
    call();
  } catch (const exception&) {
  }
}

std::vector<std::unique_ptr<device_record>> level_zero_driver::enumerate() {
  std::vector<std::unique_ptr<device_record>> found;
  std::vector<ze_driver_handle_t> drivers;
  if (has_level_zero()) {
    if_it_answers(
        [&] { drivers = list_of("zeDriverGet", ze_driver_handle_t{}, ze().zeDriverGet); });
  }
  for (const ze_driver_handle_t driver : drivers) {
    if_it_answers([&] { add_devices(driver, found); });
  }
  return found;
}

void level_zero_driver::add_devices(ze_driver_handle_t driver,
                                    std::vector<std::unique_ptr<device_record>>& found) {
  platforms_.push_back(describe_platform(driver));
  int number = 0;
  for (const ze_device_handle_t device :
       list_of("zeDeviceGet", ze_device_handle_t{}, ze().zeDeviceGet, driver)) {
    if_it_answers([&] {
      std::unique_ptr<device_record> record = describe_device(device, *platforms_.back());
      record->number = number++;
      found.push_back(std::move(record));
      devices_.push_back(found.back().get());
    });
  }
}

void* level_zero_driver::allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                                  std::size_t bytes) {
  const ze_context_handle_t context = context_of(place).get();
  const ze_device_handle_t device = handle_of(place.device);
  const ze_device_mem_alloc_desc_t of_device = device_memory();
  const ze_host_mem_alloc_desc_t of_host = host_memory();
  void* pointer = nullptr;
  const ze_result_t result =
      kind == usm::alloc::device
          ? ze().zeMemAllocDevice(context, &of_device, bytes, alignment, device, &pointer)
      : kind == usm::alloc::host
          ? ze().zeMemAllocHost(context, &of_host, bytes, alignment, &pointer)
          : ze().zeMemAllocShared(context, &of_device, &of_host, bytes, alignment, device,
                                  &pointer);
  if (is_shortage(result)) {
    return nullptr;
  }
  check_level_zero(result, "zeMemAlloc");
  return pointer;
}

const device_record* level_zero_driver::known(const void* handle) const {
  const auto found =
      std::find_if(devices_.begin(), devices_.end(),
                   [handle](const device_record* record) { return record->native == handle; });
  return found == devices_.end() ? nullptr : *found;
}

void level_zero_driver::add_parts(const device_record& whole) {
  std::vector<std::unique_ptr<device_record>> made;
  for (const ze_device_handle_t part : parts_of(handle_of(whole))) {
    made.push_back(describe_device(part, *whole.platform));
    made.back()->driver = this;
    made.back()->parent = &whole;
    made.back()->number = whole.number;
  }
  for (std::unique_ptr<device_record>& each : made) {
    devices_.push_back(each.get());
    parts_.push_back(std::move(each));
  }
}

// Only handles that the platform gave out are looked at: whatever else comes in may point anywhere.
const device_record& level_zero_driver::device_of(void* handle) {
  const std::lock_guard<std::mutex> lock(mutex_);
  for (; known(handle) == nullptr && asked_for_parts_ < devices_.size(); ++asked_for_parts_) {
    add_parts(*devices_[asked_for_parts_]);
  }
  const device_record* const found = known(handle);
  if (found == nullptr) {
    throw_invalid("the native handle is that of no device");
  }
  return *found;
}

std::shared_ptr<native_context> level_zero_driver::make_context(
    const std::vector<const device_record*>& devices) {
  std::vector<ze_device_handle_t> handles;
  for (const device_record* record : devices) {
    handles.push_back(handle_of(*record));
  }
  ze_context_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_CONTEXT_DESC;
  level_zero_object<ze_context_handle_t> context;
  check_level_zero(
      ze().zeContextCreateEx(static_cast<ze_driver_handle_t>(devices.front()->platform->native),
                             &description, static_cast<std::uint32_t>(handles.size()),
                             handles.data(), context.place()),
      "zeContextCreateEx");
  return std::make_shared<level_zero_context>(std::move(context));
}

}  // namespace

std::unique_ptr<backend_driver> make_level_zero_driver() {
  return std::make_unique<level_zero_driver>();
}

}  // namespace detail
LUMEN_NAMESPACE_END
