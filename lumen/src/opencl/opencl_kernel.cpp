// SPDX-License-Identifier: Apache-2.0
// What an OpenCL kernel says of itself, and its arguments.
#include "opencl_kernel.hpp"

#include "opencl_devices.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

std::string opencl_kernel::function_name() const {
  std::size_t size = 0;
  check_opencl(cl().clGetKernelInfo(kernel_.get(), CL_KERNEL_FUNCTION_NAME, 0, nullptr, &size),
               "clGetKernelInfo");
  std::string name(size, '\0');
  check_opencl(
      cl().clGetKernelInfo(kernel_.get(), CL_KERNEL_FUNCTION_NAME, size, name.data(), nullptr),
      "clGetKernelInfo");
  return name.substr(0, name.find('\0'));
}

std::uint32_t opencl_kernel::argument_count() const {
  cl_uint count = 0;
  check_opencl(
      cl().clGetKernelInfo(kernel_.get(), CL_KERNEL_NUM_ARGS, sizeof count, &count, nullptr),
      "clGetKernelInfo");
  return count;
}

std::size_t opencl_kernel::work_group_size(const device_record& device) const {
  std::size_t size = 0;
  check_opencl(
      cl().clGetKernelWorkGroupInfo(kernel_.get(), id_of(device), CL_KERNEL_WORK_GROUP_SIZE,
                                    sizeof size, &size, nullptr),
      "clGetKernelWorkGroupInfo");
  return size;
}

void opencl_kernel::set(const std::vector<kernel_argument>& arguments) {
  for (const kernel_argument& each : arguments) {
    const auto index = static_cast<cl_uint>(each.index);
    if (each.kind == argument_kind::pointer && each.pointer != nullptr) {
      check_opencl(cl().clSetKernelArgSVMPointer(kernel_.get(), index, each.pointer),
                   "clSetKernelArgSVMPointer");
    } else if (each.kind == argument_kind::pointer) {
      // A null pointer is said as a null memory object: not every driver takes it as the other.
      check_opencl(cl().clSetKernelArg(kernel_.get(), index, sizeof(cl_mem), nullptr),
                   "clSetKernelArg");
    } else {
      const bool local = each.kind == argument_kind::local_memory;
      check_opencl(
          cl().clSetKernelArg(kernel_.get(), index, local ? each.local_bytes : each.value.size(),
                              local ? nullptr : each.value.data()),
          "clSetKernelArg");
    }
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
