// SPDX-License-Identifier: Apache-2.0
// Loading Level Zero, and the names of its results.
#include "level_zero_library.hpp"

#include <cstdio>
#include <string>

#include "../native_library.hpp"
#include "sycl/detail/launch_shape.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

struct loaded_level_zero {
  level_zero_functions functions;
  bool usable = true;

  loaded_level_zero() {
    const native_library library("libze_loader.so.1");
#define LEVEL_ZERO_FUNCTION(name) usable = library.find(#name, functions.name) && usable;
#include "level_zero_functions.def"
#undef LEVEL_ZERO_FUNCTION
    // Fails where the loader finds no driver.
    usable = usable && functions.zeInit(0) == ZE_RESULT_SUCCESS;
  }
  static const loaded_level_zero& instance() {
    static const loaded_level_zero only;
    return only;
  }
};

const char* name_of(ze_result_t result) {
  switch (result) {
#define LEVEL_ZERO_CODE(name) \
  case name:                  \
    return #name;
#include "level_zero_codes.def"
#undef LEVEL_ZERO_CODE
    default:
      return "unknown";
  }
}

}  // namespace

bool has_level_zero() {
  return loaded_level_zero::instance().usable;
}

const level_zero_functions& ze() {
  return loaded_level_zero::instance().functions;
}

void check_level_zero(ze_result_t result, const char* tried) {
  if (result != ZE_RESULT_SUCCESS) {
    char number[16];
    std::snprintf(number, sizeof number, "0x%x", static_cast<unsigned>(result));
    const std::string said =
        std::string("Level Zero error ") + number + " (" + name_of(result) + ")";
    throw_native(tried, said.c_str(),
                 result == ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY ||
                     result == ZE_RESULT_ERROR_OUT_OF_DEVICE_MEMORY);
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
