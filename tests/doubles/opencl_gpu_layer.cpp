// SPDX-License-Identifier: Apache-2.0
// The OpenCL layer for tests, by the interface of CL/cl_layer.h. Two dispatch tables stand above
// the driver's: one changes what the driver says (its CPU is a GPU), and above it one notes every
// call and lets it fail. Numbers are relaxed atomics, so that the layer orders no threads: a data
// race of the program stays one.
#include <algorithm>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <string_view>
#include <tuple>
#include <type_traits>

#include "opencl_layer_changes.hpp"

namespace {

using opencl_layer::object;

const cl_icd_dispatch* driver = nullptr;
cl_icd_dispatch changed{};  // the driver's functions, as opencl_layer_changes.cpp has them
cl_icd_dispatch shown{};    // what the program calls

// --- What is noted ---

enum class function {
#define OPENCL_FUNCTION(name) name,
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
};

constexpr std::string_view names[] = {
#define OPENCL_FUNCTION(name) #name,
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
};

struct function_record {
  static constexpr std::int64_t never = INT64_MAX / 2;

  std::atomic<int> calls{0};
  std::atomic<std::int64_t> before_failure{never};
  std::atomic<bool> always{false};
  std::atomic<cl_int> code{CL_SUCCESS};

  // Notes a call; the code that it fails with.
  cl_int enter() {
    calls.fetch_add(1, std::memory_order_relaxed);
    const std::int64_t before = before_failure.fetch_sub(1, std::memory_order_relaxed);
    const bool fails = before == 0 || (before < 0 && always.load(std::memory_order_relaxed));
    return fails ? code.load(std::memory_order_relaxed) : CL_SUCCESS;
  }
};

function_record records[std::size(names)];

std::atomic<int> living[static_cast<int>(object::sub_device) + 1];

void add(object kind, int number) {
  living[static_cast<int>(kind)].fetch_add(number, std::memory_order_relaxed);
}

// What a handle is a reference to, as far as that is counted.
template <typename Handle>
constexpr object kind_of = object::sub_device;
template <>
constexpr object kind_of<cl_context> = object::context;
template <>
constexpr object kind_of<cl_command_queue> = object::queue;
template <>
constexpr object kind_of<cl_mem> = object::buffer;
template <>
constexpr object kind_of<cl_program> = object::program;
template <>
constexpr object kind_of<cl_kernel> = object::kernel;
template <>
constexpr object kind_of<cl_event> = object::event;

template <typename Handle>
constexpr bool is_counted = kind_of<Handle> != object::sub_device;

template <typename Handle>
bool is_owned(Handle) {
  return is_counted<Handle>;
}
bool is_owned(cl_device_id device) {
  cl_device_id parent = nullptr;
  return driver->clGetDeviceInfo(device, CL_DEVICE_PARENT_DEVICE, sizeof parent, &parent,
                                 nullptr) == CL_SUCCESS &&
         parent != nullptr;
}

constexpr bool begins_with(std::string_view text, std::string_view beginning) {
  return text.substr(0, beginning.size()) == beginning;
}

// Commands hand an event out where the program asks for one.
template <typename T>
void add_event(T) {}
void add_event(cl_event* place) {
  add(object::event, place != nullptr ? 1 : 0);
}

int kernels_made(cl_program program, cl_uint, const cl_kernel* kernels, const cl_uint*) {
  std::size_t number = 0;
  driver->clGetProgramInfo(program, CL_PROGRAM_NUM_KERNELS, sizeof number, &number, nullptr);
  return kernels != nullptr ? static_cast<int>(number) : 0;
}

int sub_devices_made(cl_device_id device, const cl_device_partition_property* partition, cl_uint,
                     const cl_device_id* devices, const cl_uint*) {
  cl_uint number = 0;
  driver->clCreateSubDevices(device, partition, 0, nullptr, &number);
  return devices != nullptr ? static_cast<int>(number) : 0;
}

// Counts what a call that was well has made besides its result.
template <function Function, typename... A>
void count_outputs(A... arguments) {
  (add_event(arguments), ...);
  if constexpr (Function == function::clCreateKernelsInProgram) {
    add(object::kernel, kernels_made(arguments...));
  } else if constexpr (Function == function::clCreateSubDevices) {
    add(object::sub_device, sub_devices_made(arguments...));
  } else if constexpr (Function == function::clSVMAlloc) {
    add(object::svm_block, 1);
  } else if constexpr (Function == function::clEnqueueSVMFree) {
    add(object::svm_block, -static_cast<int>(std::get<1>(std::make_tuple(arguments...))));
  }
}

// What a call that fails gives back; functions that make something put the code in the last place.
template <typename R, typename... A>
R failed(cl_int code, A... arguments) {
  if constexpr (std::is_same_v<R, cl_int>) {
    return code;
  } else {
    const auto last = std::get<sizeof...(A) - 1>(std::make_tuple(arguments...));
    if constexpr (std::is_same_v<decltype(last), cl_int* const>) {
      if (last != nullptr) {
        *last = code;
      }
    }
    return nullptr;
  }
}

// What a call does to the references of the handle that it is given.
template <function Function>
constexpr int step_of(std::string_view name = names[static_cast<int>(Function)]) {
  return begins_with(name, "clRetain") ? 1 : begins_with(name, "clRelease") ? -1 : 0;
}

template <function Function, auto Member, typename Type>
struct hook;

template <function Function, auto Member, typename R, typename First, typename... Rest>
struct hook<Function, Member, R(CL_API_CALL*)(First, Rest...)> {
  static R CL_API_CALL call(First first, Rest... rest) {
    const cl_int code = records[static_cast<int>(Function)].enter();
    if (code != CL_SUCCESS) {
      return failed<R>(code, first, rest...);
    }
    const bool owned = step_of<Function>() != 0 && is_owned(first);
    const R result = (changed.*Member)(first, rest...);
    if constexpr (std::is_same_v<R, cl_int>) {
      if (result == CL_SUCCESS) {
        add(kind_of<First>, owned ? step_of<Function>() : 0);
        count_outputs<Function>(first, rest...);
      }
    } else if (result != nullptr) {
      add(kind_of<R>, is_counted<R> ? 1 : 0);
      count_outputs<Function>(first, rest...);
    }
    return result;
  }
};

// clSVMFree, which cannot fail.
template <function Function, auto Member>
struct hook<Function, Member, cl_api_clSVMFree> {
  static void CL_API_CALL call(cl_context context, void* block) {
    static_cast<void>(records[static_cast<int>(Function)].enter());
    (changed.*Member)(context, block);
    add(object::svm_block, block != nullptr ? -1 : 0);
  }
};

void note_calls() {
  shown = changed;
#define OPENCL_FUNCTION(name) \
  shown.name = hook<function::name, &cl_icd_dispatch::name, cl_api_##name>::call;
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
}

// --- What a test asks for ---

function_record* find(const char* name) {
  const auto* const found = std::find(std::begin(names), std::end(names), name);
  return found == std::end(names) ? nullptr : &records[found - names];
}

bool fail(const char* name, int after, int code, bool always) {
  function_record* const record = find(name);
  if (record != nullptr) {
    record->code.store(code, std::memory_order_relaxed);
    record->always.store(always, std::memory_order_relaxed);
    record->before_failure.store(after, std::memory_order_relaxed);
  }
  return record != nullptr;
}

bool calls(const char* name, int* number) {
  const function_record* const record = find(name);
  if (record != nullptr) {
    *number = record->calls.load(std::memory_order_relaxed);
  }
  return record != nullptr;
}

int objects(object kind) {
  return living[static_cast<int>(kind)].load(std::memory_order_relaxed);
}

void reset() {
  for (function_record& record : records) {
    record.before_failure.store(function_record::never, std::memory_order_relaxed);
  }
  reset_changes();
}

#define SHOWN __attribute__((visibility("default")))

}  // namespace

extern "C" {

SHOWN extern const opencl_layer::controls opencl_layer_controls;
const opencl_layer::controls opencl_layer_controls = {
    fail,          calls,       objects, answer, answer_fails, take_source_as_il,
    fail_commands, shift_clock, reset};

SHOWN cl_int CL_API_CALL clGetLayerInfo(cl_layer_info query, std::size_t size, void* value,
                                        std::size_t* size_ret) {
  const cl_layer_api_version version = CL_LAYER_API_VERSION_100;
  if (query != CL_LAYER_API_VERSION || (value != nullptr && size < sizeof version)) {
    return CL_INVALID_VALUE;
  }
  if (value != nullptr) {
    std::memcpy(value, &version, sizeof version);
  }
  if (size_ret != nullptr) {
    *size_ret = sizeof version;
  }
  return CL_SUCCESS;
}

SHOWN cl_int CL_API_CALL clInitLayer(cl_uint entries, const cl_icd_dispatch* target,
                                     cl_uint* entries_ret, const cl_icd_dispatch** layer) {
  constexpr cl_uint wanted = sizeof shown / sizeof(void*);
  if (target == nullptr || entries_ret == nullptr || layer == nullptr || entries < wanted) {
    return CL_INVALID_VALUE;
  }
  driver = target;
  changed = change_driver(*target);
  note_calls();
  reset();
  *entries_ret = wanted;
  *layer = &shown;
  return CL_SUCCESS;
}

}  // extern "C"
