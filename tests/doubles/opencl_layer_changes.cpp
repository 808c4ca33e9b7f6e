// SPDX-License-Identifier: Apache-2.0
// The functions of the driver that the layer for tests puts its own words into.
#include "opencl_layer_changes.hpp"

#include <algorithm>
#include <atomic>
#include <map>
#include <mutex>
#include <utility>
#include <vector>

namespace {

const cl_icd_dispatch* driver = nullptr;

struct device_answer {
  cl_int code;
  std::vector<unsigned char> bytes;
};
struct device_answers {
  std::mutex mutex;
  std::map<cl_device_info, device_answer> by_query;
};

// Never released: programs may ask while they end.
device_answers& answers() {
  static auto& all = *new device_answers;
  return all;
}

std::atomic<bool> source_is_il{false};
std::atomic<cl_int> end_of_commands{CL_COMPLETE};
std::atomic<std::int64_t> clock_shift{0};

void set_answer(cl_device_info query, device_answer answer) {
  const std::lock_guard<std::mutex> lock(answers().mutex);
  answers().by_query[query] = std::move(answer);
}

cl_int CL_API_CALL get_device_info(cl_device_id device, cl_device_info query, std::size_t size,
                                   void* value, std::size_t* size_ret) {
  const std::lock_guard<std::mutex> lock(answers().mutex);
  const auto found = answers().by_query.find(query);
  if (found == answers().by_query.end()) {
    return driver->clGetDeviceInfo(device, query, size, value, size_ret);
  }
  const auto& [code, bytes] = found->second;
  if (code != CL_SUCCESS) {
    return code;
  }
  if (value != nullptr && size < bytes.size()) {
    return CL_INVALID_VALUE;
  }
  if (value != nullptr) {
    std::copy(bytes.begin(), bytes.end(), static_cast<unsigned char*>(value));
  }
  if (size_ret != nullptr) {
    *size_ret = bytes.size();
  }
  return CL_SUCCESS;
}

// CPUs and GPUs change places.
cl_device_type swapped(cl_device_type type) {
  constexpr cl_device_type both = CL_DEVICE_TYPE_CPU | CL_DEVICE_TYPE_GPU;
  const cl_device_type asked = type & both;
  return asked == CL_DEVICE_TYPE_CPU || asked == CL_DEVICE_TYPE_GPU ? type ^ both : type;
}

cl_int CL_API_CALL get_device_ids(cl_platform_id platform, cl_device_type type, cl_uint entries,
                                  cl_device_id* devices, cl_uint* number) {
  return driver->clGetDeviceIDs(platform, swapped(type), entries, devices, number);
}

cl_context CL_API_CALL create_context_from_type(const cl_context_properties* properties,
                                                cl_device_type type,
                                                void(CL_CALLBACK* notify)(const char*, const void*,
                                                                          std::size_t, void*),
                                                void* data, cl_int* code) {
  if (type != CL_DEVICE_TYPE_CPU) {
    return driver->clCreateContextFromType(properties, swapped(type), notify, data, code);
  }
  if (code != nullptr) {  // PoCL would make a context without devices
    *code = CL_DEVICE_NOT_FOUND;
  }
  return nullptr;
}

cl_program CL_API_CALL create_program_with_il(cl_context context, const void* il,
                                              std::size_t length, cl_int* code) {
  if (!source_is_il) {
    return driver->clCreateProgramWithIL(context, il, length, code);
  }
  const char* const source = static_cast<const char*>(il);
  return driver->clCreateProgramWithSource(context, 1, const_cast<const char**>(&source), &length,
                                           code);
}

cl_int CL_API_CALL wait_for_events(cl_uint count, const cl_event* events) {
  const cl_int code = driver->clWaitForEvents(count, events);
  return code == CL_SUCCESS && end_of_commands != CL_COMPLETE
             ? CL_EXEC_STATUS_ERROR_FOR_EVENTS_IN_WAIT_LIST
             : code;
}

cl_int CL_API_CALL get_event_info(cl_event event, cl_event_info query, std::size_t size,
                                  void* value, std::size_t* size_ret) {
  const cl_int code = driver->clGetEventInfo(event, query, size, value, size_ret);
  if (code == CL_SUCCESS && query == CL_EVENT_COMMAND_EXECUTION_STATUS && value != nullptr &&
      *static_cast<cl_int*>(value) == CL_COMPLETE) {
    *static_cast<cl_int*>(value) = end_of_commands;
  }
  return code;
}

cl_int CL_API_CALL get_event_profiling_info(cl_event event, cl_profiling_info query,
                                            std::size_t size, void* value, std::size_t* size_ret) {
  const cl_int code = driver->clGetEventProfilingInfo(event, query, size, value, size_ret);
  if (code == CL_SUCCESS && value != nullptr) {
    *static_cast<cl_ulong*>(value) += static_cast<cl_ulong>(clock_shift.load());
  }
  return code;
}

}  // namespace

cl_icd_dispatch change_driver(const cl_icd_dispatch& below) {
  driver = &below;
  cl_icd_dispatch changed = below;
  changed.clGetDeviceInfo = get_device_info;
  changed.clGetDeviceIDs = get_device_ids;
  changed.clCreateContextFromType = create_context_from_type;
  changed.clCreateProgramWithIL = create_program_with_il;
  changed.clWaitForEvents = wait_for_events;
  changed.clGetEventInfo = get_event_info;
  changed.clGetEventProfilingInfo = get_event_profiling_info;
  return changed;
}

void answer(unsigned query, const void* bytes, std::size_t size) {
  const auto* const first = static_cast<const unsigned char*>(bytes);
  set_answer(query, {CL_SUCCESS, {first, first + size}});
}

void answer_fails(unsigned query, int code) {
  set_answer(query, {code, {}});
}

void take_source_as_il(bool on) {
  source_is_il = on;
}

void fail_commands(int code) {
  end_of_commands = code;
}

void shift_clock(std::int64_t nanoseconds) {
  clock_shift = nanoseconds;
}

void reset_changes() {
  source_is_il = false;
  end_of_commands = CL_COMPLETE;
  clock_shift = 0;
  {
    const std::lock_guard<std::mutex> lock(answers().mutex);
    answers().by_query.clear();
  }
  const cl_device_type gpu = CL_DEVICE_TYPE_GPU;
  answer(CL_DEVICE_TYPE, &gpu, sizeof gpu);
}
