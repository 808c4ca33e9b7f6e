// SPDX-License-Identifier: Apache-2.0
// The scripted drivers.
#include "fake_drivers.hpp"

#include <algorithm>
#include <cstring>

namespace tarn_test {

driver_script script;
int device_object = 0;
int context_object = 0;

namespace {

int program_object = 0;
int other_devices[8] = {};

/// Notes a call; its failure, or 0.
std::int32_t enter(const char* name) {
  script.calls.emplace_back(name);
  const auto times = std::count(script.calls.begin(), script.calls.end(), name);
  return name == script.failing_call && times == script.failing_occurrence ? script.failure : 0;
}

void expect(bool fact, const char* what) {
  if (!fact) {
    script.mistakes.emplace_back(what);
  }
}

bool is(const void* handle, const int& object) {
  return handle == &object;
}

cl_int get_device_info(cl_device_id device, cl_device_info what, size_t size, void* value,
                       size_t* size_ret) {
  const std::int32_t failure = enter("clGetDeviceInfo");
  expect(is(device, device_object) && what == 0x4250 && size == 4 && size_ret == nullptr,
         "clGetDeviceInfo");
  if (!script.knows_ip_version) {
    return CL_INVALID_VALUE;
  }
  std::memcpy(value, &script.ip_version, size);  // also by a call that fails
  return failure;
}

cl_program create_with_source(cl_context context, cl_uint count, const char** sources,
                              const size_t* lengths, cl_int* status) {
  *status = enter("clCreateProgramWithSource");
  expect(is(context, context_object) && count == 1 && lengths == nullptr,
         "clCreateProgramWithSource");
  script.source = sources[0];
  if (*status != CL_SUCCESS) {
    return nullptr;
  }
  ++script.programs;
  return reinterpret_cast<cl_program>(&program_object);
}

cl_program create_with_binary(cl_context context, cl_uint count, const cl_device_id* devices,
                              const size_t* lengths, const unsigned char** binaries,
                              cl_int* binary_status, cl_int* status) {
  const std::int32_t failure = enter("clCreateProgramWithBinary");
  expect(is(context, context_object) && count == 1 && is(devices[0], device_object),
         "clCreateProgramWithBinary");
  script.module.assign(binaries[0], binaries[0] + lengths[0]);
  if (binary_status != nullptr) {
    *binary_status = failure;
  }
  if (status != nullptr) {
    *status = failure;
  }
  if (failure != CL_SUCCESS) {
    return nullptr;
  }
  ++script.programs;
  return reinterpret_cast<cl_program>(&program_object);
}

cl_int build(cl_program program, cl_uint count, const cl_device_id* devices, const char* options,
             void (*)(cl_program, void*), void*) {
  expect(is(program, program_object) && count == 1 && is(devices[0], device_object),
         "clBuildProgram");
  script.options = options;
  return enter("clBuildProgram");
}

/// Copies `count` values out, if they are as many as asked for.
template <typename T>
cl_int answer(const std::vector<T>& values, size_t size, void* place) {
  expect(size == values.size() * sizeof(T), "clGetProgramInfo: size");
  if (size < values.size() * sizeof(T)) {
    return CL_INVALID_VALUE;
  }
  std::copy(values.begin(), values.end(), static_cast<T*>(place));
  return CL_SUCCESS;
}

cl_int get_program_info(cl_program program, cl_program_info what, size_t size, void* value,
                        size_t*) {
  const std::int32_t failure = enter("clGetProgramInfo");
  expect(is(program, program_object), "clGetProgramInfo");
  if (failure != 0) {
    return failure;
  }
  const std::size_t own = script.devices_before;
  const std::size_t count = own + (script.lists_device ? 1 : 0);
  switch (what) {
    case CL_PROGRAM_NUM_DEVICES:
      return answer<cl_uint>({static_cast<cl_uint>(count)}, size, value);
    case CL_PROGRAM_DEVICES: {
      std::vector<void*> devices(count, &device_object);
      std::fill_n(devices.begin(), own, &other_devices[0]);
      return answer(devices, size, value);
    }
    case CL_PROGRAM_BINARY_SIZES: {
      std::vector<std::size_t> sizes(count, script.binary.size());
      std::fill_n(sizes.begin(), own, std::size_t{100});
      return answer(sizes, size, value);
    }
    case CL_PROGRAM_BINARIES: {
      std::vector<unsigned char*> places(count);
      expect(size == count * sizeof(void*), "CL_PROGRAM_BINARIES: size");
      std::memcpy(places.data(), value, count * sizeof(void*));
      for (std::size_t i = 0; i < count; ++i) {
        expect((places[i] != nullptr) == (i == own && !script.binary.empty()),
               "CL_PROGRAM_BINARIES: places");
      }
      std::copy(script.binary.begin(), script.binary.end(), places[own]);
      return CL_SUCCESS;
    }
    default:
      expect(false, "clGetProgramInfo: what");
      return CL_INVALID_VALUE;
  }
}

cl_int release(cl_program program) {
  expect(is(program, program_object), "clReleaseProgram");
  --script.programs;
  return enter("clReleaseProgram");
}

ze_result_t enter_level_zero(const char* name) {
  return static_cast<ze_result_t>(enter(name));
}

ze_result_t get_properties(ze_device_handle_t device, ze_device_properties_t* properties) {
  const ze_result_t status = enter_level_zero("zeDeviceGetProperties");
  const auto* extension =
      static_cast<kestrel::tarn::forge::device_ip_version_ext*>(properties->pNext);
  expect(is(device, device_object) && properties->stype == 3 && extension->stype == 0x1000F &&
             extension->pNext == nullptr,
         "zeDeviceGetProperties");
  if (script.knows_ip_version) {
    static_cast<kestrel::tarn::forge::device_ip_version_ext*>(properties->pNext)->ipVersion =
        script.ip_version;
  }
  return status;
}

ze_result_t create_module(ze_context_handle_t context, ze_device_handle_t device,
                          const ze_module_desc_t* description, ze_module_handle_t* module,
                          ze_module_build_log_handle_t* log) {
  const ze_result_t status = enter_level_zero("zeModuleCreate");
  expect(is(context, context_object) && is(device, device_object) && log == nullptr,
         "zeModuleCreate");
  expect(description->stype == 27 && description->pNext == nullptr && description->format == 0 &&
             description->pBuildFlags == nullptr && description->pConstants == nullptr,
         "zeModuleCreate: description");
  script.module.assign(description->pInputModule,
                       description->pInputModule + description->inputSize);
  if (status == ZE_RESULT_SUCCESS) {
    ++script.programs;
    *module = reinterpret_cast<ze_module_handle_t>(&program_object);
  }
  return status;
}

ze_result_t get_native_binary(ze_module_handle_t module, size_t* size, std::uint8_t* place) {
  const ze_result_t status = enter_level_zero("zeModuleGetNativeBinary");
  expect(is(module, program_object), "zeModuleGetNativeBinary");
  if (status != ZE_RESULT_SUCCESS) {
    return status;
  }
  if (place == nullptr) {
    *size = script.binary.size();
    return status;
  }
  expect(*size == script.binary.size(), "zeModuleGetNativeBinary: size");
  std::copy_n(script.binary.begin(), std::min(*size, script.binary.size()), place);
  return status;
}

ze_result_t destroy_module(ze_module_handle_t module) {
  expect(is(module, program_object), "zeModuleDestroy");
  --script.programs;
  return enter_level_zero("zeModuleDestroy");
}

}  // namespace

const kestrel::tarn::forge::opencl_calls fake_opencl = {
    get_device_info, create_with_source, create_with_binary, build, get_program_info, release};
const kestrel::tarn::forge::level_zero_calls fake_level_zero = {get_properties, create_module,
                                                                get_native_binary, destroy_module};

}  // namespace tarn_test
