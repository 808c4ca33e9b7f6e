// SPDX-License-Identifier: Apache-2.0
// Launches of Level Zero kernels. SYCL's last dimension varies fastest, as Level Zero's first does.
#include "level_zero_kernel.hpp"

#include <array>
#include <limits>
#include <numeric>

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

using sizes = std::array<std::uint32_t, 3>;

// A size for each of Level Zero's dimensions; `missing` for those that SYCL's launch has not.
sizes turned(const std::size_t (&of)[3], int dimensions, std::uint32_t missing) {
  sizes result = {missing, missing, missing};
  for (int d = 0; d < dimensions; ++d) {
    const std::size_t size = of[dimensions - 1 - d];
    if (size > std::numeric_limits<std::uint32_t>::max()) {
      throw exception(make_error_code(errc::nd_range),
                      "a Level Zero launch has sizes of 32 bits in every dimension");
    }
    result[static_cast<std::size_t>(d)] = static_cast<std::uint32_t>(size);
  }
  return result;
}

// What the driver suggests, or the largest part of it that divides the range.
sizes suggested_groups(ze_kernel_handle_t kernel, const sizes& global) {
  sizes local = {1, 1, 1};
  check_level_zero(ze().zeKernelSuggestGroupSize(kernel, global[0], global[1], global[2], &local[0],
                                                 &local[1], &local[2]),
                   "zeKernelSuggestGroupSize");
  for (std::size_t d = 0; d < 3; ++d) {
    local[d] = std::gcd(local[d], global[d]);
  }
  return local;
}

}  // namespace

level_zero_kernel::level_zero_kernel(std::shared_ptr<native_context> context,
                                     std::shared_ptr<native_program> program,
                                     level_zero_object<ze_kernel_handle_t> object)
    : context_(std::move(context)), program_(std::move(program)), object_(std::move(object)) {
  check_level_zero(
      ze().zeKernelSetIndirectAccess(object_.get(), ZE_KERNEL_INDIRECT_ACCESS_FLAG_HOST |
                                                        ZE_KERNEL_INDIRECT_ACCESS_FLAG_DEVICE |
                                                        ZE_KERNEL_INDIRECT_ACCESS_FLAG_SHARED),
      "zeKernelSetIndirectAccess");
}

std::string level_zero_kernel::function_name() const {
  std::size_t size = 0;
  check_level_zero(ze().zeKernelGetName(object_.get(), &size, nullptr), "zeKernelGetName");
  std::string name(size, '\0');
  check_level_zero(ze().zeKernelGetName(object_.get(), &size, name.data()), "zeKernelGetName");
  name.resize(name.find('\0') == std::string::npos ? size : name.find('\0'));
  return name;
}

ze_kernel_properties_t level_zero_kernel::properties() const {
  ze_kernel_properties_t answer{};
  answer.stype = ZE_STRUCTURE_TYPE_KERNEL_PROPERTIES;
  check_level_zero(ze().zeKernelGetProperties(object_.get(), &answer), "zeKernelGetProperties");
  return answer;
}

std::uint32_t level_zero_kernel::argument_count() const {
  return properties().numKernelArgs;
}

std::size_t level_zero_kernel::work_group_size(const device_record& device) const {
  const ze_kernel_properties_t p = properties();
  const std::size_t required =
      std::size_t{p.requiredGroupSizeX} * p.requiredGroupSizeY * p.requiredGroupSizeZ;
  return required != 0 ? required : device.properties.max_work_group_size;
}

void level_zero_kernel::set(const kernel_argument& argument) {
  std::size_t bytes = argument.value.size();
  const void* value = argument.value.data();
  if (argument.kind == argument_kind::pointer) {
    bytes = sizeof argument.pointer;
    value = &argument.pointer;
  } else if (argument.kind == argument_kind::local_memory) {
    bytes = argument.local_bytes;
    value = nullptr;
  }
  check_level_zero(ze().zeKernelSetArgumentValue(
                       object_.get(), static_cast<std::uint32_t>(argument.index), bytes, value),
                   "zeKernelSetArgumentValue");
}

void level_zero_kernel::append_to(ze_command_list_handle_t list, const native_shape& shape,
                                  const std::vector<kernel_argument>& arguments) {
  const launch_shape& asked = shape.sizes;
  const sizes global = turned(asked.global_range, asked.dimensions, 1);
  const sizes offset = turned(asked.offset, asked.dimensions, 0);
  const std::lock_guard<std::mutex> lock(mutex_);
  for (const kernel_argument& argument : arguments) {
    set(argument);
  }
  const sizes local = shape.grouped ? turned(asked.local_range, asked.dimensions, 1)
                                    : suggested_groups(object_.get(), global);
  check_level_zero(ze().zeKernelSetGroupSize(object_.get(), local[0], local[1], local[2]),
                   "zeKernelSetGroupSize");
  // An extension of the driver, which is needed for offsets only.
  const bool has_offset = offset != sizes{0, 0, 0};
  if (has_offset || offset_is_set_) {
    check_level_zero(
        ze().zeKernelSetGlobalOffsetExp(object_.get(), offset[0], offset[1], offset[2]),
        "zeKernelSetGlobalOffsetExp");
    offset_is_set_ = has_offset;
  }
  const ze_group_count_t groups = {global[0] / local[0], global[1] / local[1],
                                   global[2] / local[2]};
  check_level_zero(
      ze().zeCommandListAppendLaunchKernel(list, object_.get(), &groups, nullptr, 0, nullptr),
      "zeCommandListAppendLaunchKernel");
}

}  // namespace detail
LUMEN_NAMESPACE_END
