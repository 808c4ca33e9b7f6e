// SPDX-License-Identifier: Apache-2.0
// What the shared object exports: the tables that the loader asks for, and the controls. Every
// function goes through entered(), which counts, fails on demand and locks.
#include "level_zero_driver.hpp"

#include <algorithm>

#include <level_zero/ze_ddi.h>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

enum function_number {
#define LEVEL_ZERO_FUNCTION(table, entry, name) number_of_##name,
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION
  number_of_functions
};

constexpr const char* function_names[] = {
#define LEVEL_ZERO_FUNCTION(table, entry, name) #name,
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION
};

int find_function(const char* wanted) {
  const auto* const found =
      std::find_if(std::begin(function_names), std::end(function_names),
                   [wanted](const char* name) { return std::strcmp(name, wanted) == 0; });
  return found == std::end(function_names) ? -1
                                           : static_cast<int>(found - std::begin(function_names));
}

// The failure that this call has to be, if any.
ze_result_t note_call(int function) {
  std::vector<failure>& failures = driver().failures;
  driver().calls[static_cast<std::size_t>(function)] += 1;
  ze_result_t code = ZE_RESULT_SUCCESS;
  for (failure& each : failures) {
    if (each.function == function && each.after-- == 0) {
      code = each.code;
      each.after = each.always ? 0 : -1;
    }
  }
  failures.erase(std::remove_if(failures.begin(), failures.end(),
                                [](const failure& each) { return each.after < 0; }),
                 failures.end());
  return code;
}

template <int Number, auto Function>
struct entered;
template <int Number, typename... Arguments, ze_result_t (*Function)(Arguments...)>
struct entered<Number, Function> {
  static ze_result_t ZE_APICALL call(Arguments... arguments) {
    const std::lock_guard<std::mutex> lock(driver().mutex);
    const ze_result_t failed = note_call(Number);
    return failed != ZE_RESULT_SUCCESS ? failed : Function(arguments...);
  }
};

const ze_dditable_t& tables() {
  static const ze_dditable_t filled = [] {
    ze_dditable_t made{};
#define LEVEL_ZERO_FUNCTION(table, entry, name) \
  made.table.pfn##entry = entered<number_of_##name, &level_zero_driver::name>::call;
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION
    return made;
  }();
  return filled;
}

void reset_all() {
  const std::lock_guard<std::mutex> lock(driver().mutex);
  driver().failures.clear();
  driver().calls.assign(number_of_functions, 0);
  driver().kernels.clear();
  driver().native_binary.clear();
  driver().held = false;
  advance();
}

constexpr controls exported_controls = {
    [](const device_description* devices, std::size_t count) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      set_devices(devices, count);
    },
    [](const char* name, std::uint32_t arguments, kernel_function function) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      driver().kernels[name] = {arguments, function};
    },
    [](const std::uint8_t* bytes, std::size_t size) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      driver().native_binary.assign(bytes, bytes + size);
    },
    [](const char* function, int after, ze_result_t code, bool always) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      const int number = find_function(function);
      if (number >= 0) {
        driver().failures.push_back({number, after, code, always});
      }
      return number >= 0;
    },
    [] {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      return static_cast<int>(driver().failures.size());
    },
    [](const char* function) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      const int number = find_function(function);
      return number < 0 ? -1 : driver().calls[static_cast<std::size_t>(number)];
    },
    [](std::size_t index) { return index < number_of_functions ? function_names[index] : nullptr; },
    [](object kind) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      return static_cast<int>(driver().living[static_cast<std::size_t>(kind)].size());
    },
    [] {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      driver().held = true;
    },
    [] {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      driver().held = false;
      advance();
    },
    [](std::uint64_t nanoseconds) {
      const std::lock_guard<std::mutex> lock(driver().mutex);
      driver().clock_zero = now() + static_cast<std::int64_t>(nanoseconds);
    },
    reset_all,
};

}  // namespace

driver_state& driver() {
  static auto& state = *[] {
    auto* const made = new driver_state;
    made->calls.assign(number_of_functions, 0);
    return made;
  }();
  return state;
}

}  // namespace level_zero_driver

extern "C" {

ZE_DLLEXPORT extern const level_zero_driver::controls level_zero_driver_controls;
const level_zero_driver::controls level_zero_driver_controls = level_zero_driver::exported_controls;

// The core's tables. The loader takes them one by one; all have to be there.
#define LEVEL_ZERO_TABLE(name, type)                                                           \
  ZE_DLLEXPORT ze_result_t ZE_APICALL zeGet##name##ProcAddrTable(ze_api_version_t version,     \
                                                                 ze_##type##_dditable_t* to) { \
    if (to == nullptr) {                                                                       \
      return ZE_RESULT_ERROR_INVALID_NULL_POINTER;                                             \
    }                                                                                          \
    if (ZE_MAJOR_VERSION(version) != 1) {                                                      \
      return ZE_RESULT_ERROR_UNSUPPORTED_VERSION;                                              \
    }                                                                                          \
    *to = level_zero_driver::tables().name;                                                    \
    return ZE_RESULT_SUCCESS;                                                                  \
  }
LEVEL_ZERO_TABLE(Global, global)
LEVEL_ZERO_TABLE(Driver, driver)
LEVEL_ZERO_TABLE(Device, device)
LEVEL_ZERO_TABLE(DeviceExp, device_exp)
LEVEL_ZERO_TABLE(Context, context)
LEVEL_ZERO_TABLE(CommandQueue, command_queue)
LEVEL_ZERO_TABLE(CommandList, command_list)
LEVEL_ZERO_TABLE(Image, image)
LEVEL_ZERO_TABLE(ImageExp, image_exp)
LEVEL_ZERO_TABLE(Fence, fence)
LEVEL_ZERO_TABLE(EventPool, event_pool)
LEVEL_ZERO_TABLE(Event, event)
LEVEL_ZERO_TABLE(EventExp, event_exp)
LEVEL_ZERO_TABLE(Module, module)
LEVEL_ZERO_TABLE(ModuleBuildLog, module_build_log)
LEVEL_ZERO_TABLE(Kernel, kernel)
LEVEL_ZERO_TABLE(KernelExp, kernel_exp)
LEVEL_ZERO_TABLE(Sampler, sampler)
LEVEL_ZERO_TABLE(PhysicalMem, physical_mem)
LEVEL_ZERO_TABLE(Mem, mem)
LEVEL_ZERO_TABLE(VirtualMem, virtual_mem)
LEVEL_ZERO_TABLE(FabricVertexExp, fabric_vertex_exp)
LEVEL_ZERO_TABLE(FabricEdgeExp, fabric_edge_exp)
#undef LEVEL_ZERO_TABLE

// Tools and system management: nothing is there.
#define LEVEL_ZERO_EMPTY_TABLE(name)                                                 \
  ZE_DLLEXPORT ze_result_t ZE_APICALL name##ProcAddrTable(ze_api_version_t, void*) { \
    return ZE_RESULT_SUCCESS;                                                        \
  }
LEVEL_ZERO_EMPTY_TABLE(zetGetCommandList)
LEVEL_ZERO_EMPTY_TABLE(zetGetContext)
LEVEL_ZERO_EMPTY_TABLE(zetGetDebug)
LEVEL_ZERO_EMPTY_TABLE(zetGetDevice)
LEVEL_ZERO_EMPTY_TABLE(zetGetKernel)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetricGroupExp)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetricGroup)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetric)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetricQueryPool)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetricQuery)
LEVEL_ZERO_EMPTY_TABLE(zetGetMetricStreamer)
LEVEL_ZERO_EMPTY_TABLE(zetGetModule)
LEVEL_ZERO_EMPTY_TABLE(zetGetTracerExp)
LEVEL_ZERO_EMPTY_TABLE(zesGetDevice)
LEVEL_ZERO_EMPTY_TABLE(zesGetDiagnostics)
LEVEL_ZERO_EMPTY_TABLE(zesGetDriver)
LEVEL_ZERO_EMPTY_TABLE(zesGetEngine)
LEVEL_ZERO_EMPTY_TABLE(zesGetFabricPort)
LEVEL_ZERO_EMPTY_TABLE(zesGetFan)
LEVEL_ZERO_EMPTY_TABLE(zesGetFirmware)
LEVEL_ZERO_EMPTY_TABLE(zesGetFrequency)
LEVEL_ZERO_EMPTY_TABLE(zesGetLed)
LEVEL_ZERO_EMPTY_TABLE(zesGetMemory)
LEVEL_ZERO_EMPTY_TABLE(zesGetPerformanceFactor)
LEVEL_ZERO_EMPTY_TABLE(zesGetPower)
LEVEL_ZERO_EMPTY_TABLE(zesGetPsu)
LEVEL_ZERO_EMPTY_TABLE(zesGetRas)
LEVEL_ZERO_EMPTY_TABLE(zesGetScheduler)
LEVEL_ZERO_EMPTY_TABLE(zesGetStandby)
LEVEL_ZERO_EMPTY_TABLE(zesGetTemperature)
#undef LEVEL_ZERO_EMPTY_TABLE
}
