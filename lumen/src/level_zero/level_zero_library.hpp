// SPDX-License-Identifier: Apache-2.0
// The machine's Level Zero loader: its functions, failures as exceptions, and owners of its
// objects. Nothing is linked to it; where the loader or one of the functions is missing there is no
// Level Zero.
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include <level_zero/ze_api.h>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct level_zero_functions {
#define LEVEL_ZERO_FUNCTION(name) decltype(&::name) name = nullptr;
#include "level_zero_functions.def"
#undef LEVEL_ZERO_FUNCTION
};

// Whether there is Level Zero; loads and initialises it when first asked.
bool has_level_zero();
// To be asked for where there is.
const level_zero_functions& ze();

// Throws errc::memory_allocation if memory was short, else errc::runtime. `tried` is the function
// that was called; the text has the number and the name of the result.
void check_level_zero(ze_result_t result, const char* tried);

// What a query with a counter gives of its owner, if it has one: how many there are, then all of
// them, each made from `blank`.
template <typename Item, typename Query, typename... Owner>
std::vector<Item> list_of(const char* tried, const Item& blank, Query query, Owner... owner) {
  std::uint32_t count = 0;
  check_level_zero(query(owner..., &count, nullptr), tried);
  std::vector<Item> items(count, blank);
  if (count != 0) {
    check_level_zero(query(owner..., &count, items.data()), tried);
    items.resize(count, blank);
  }
  return items;
}

#define LUMEN_LEVEL_ZERO_OBJECT(handle, name)        \
  inline ze_result_t destroy_object(handle object) { \
    return ze().ze##name##Destroy(object);           \
  }
LUMEN_LEVEL_ZERO_OBJECT(ze_context_handle_t, Context)
LUMEN_LEVEL_ZERO_OBJECT(ze_command_queue_handle_t, CommandQueue)
LUMEN_LEVEL_ZERO_OBJECT(ze_command_list_handle_t, CommandList)
LUMEN_LEVEL_ZERO_OBJECT(ze_event_pool_handle_t, EventPool)
LUMEN_LEVEL_ZERO_OBJECT(ze_event_handle_t, Event)
LUMEN_LEVEL_ZERO_OBJECT(ze_module_handle_t, Module)
LUMEN_LEVEL_ZERO_OBJECT(ze_kernel_handle_t, Kernel)
#undef LUMEN_LEVEL_ZERO_OBJECT

// An object that is destroyed at the end, unless it is somebody else's.
template <typename Handle>
class level_zero_object {
 public:
  level_zero_object() = default;
  level_zero_object(void* object, bool owned) noexcept
      : object_(static_cast<Handle>(object)), owned_(owned) {}
  level_zero_object(level_zero_object&& other) noexcept
      : object_(std::exchange(other.object_, nullptr)), owned_(other.owned_) {}
  level_zero_object& operator=(level_zero_object&& other) noexcept {
    std::swap(object_, other.object_);
    std::swap(owned_, other.owned_);
    return *this;
  }
  ~level_zero_object() {
    if (object_ != nullptr && owned_) {
      static_cast<void>(destroy_object(object_));
    }
  }

  Handle get() const noexcept { return object_; }
  // Where a call puts a new object.
  Handle* place() noexcept { return &object_; }

 private:
  Handle object_ = nullptr;
  bool owned_ = true;
};

}  // namespace detail
LUMEN_NAMESPACE_END
