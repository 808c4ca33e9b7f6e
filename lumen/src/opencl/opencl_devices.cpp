// SPDX-License-Identifier: Apache-2.0
// What clGetPlatformInfo and clGetDeviceInfo say, in the words of SYCL (SYCL 2020, section 4.6.4,
// whose queries come from those of OpenCL).
#include "opencl_devices.hpp"

#include <algorithm>
#include <cstdio>
#include <type_traits>

#include <CL/cl_ext.h>

#include "../common_properties.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

std::string platform_text(cl_platform_id id, cl_platform_info query) {
  std::size_t size = 0;
  check_opencl(cl().clGetPlatformInfo(id, query, 0, nullptr, &size), "clGetPlatformInfo");
  std::string text(size, '\0');
  check_opencl(cl().clGetPlatformInfo(id, query, size, text.data(), nullptr), "clGetPlatformInfo");
  text.resize(text.find('\0') == std::string::npos ? size : text.find('\0'));
  return text;
}

// Answers of one device; those that `if_known` asks for may be missing.
class device_answers {
 public:
  explicit device_answers(cl_device_id id) : id_(id) {}

  template <typename T>
  bool if_known(cl_device_info query, T& place) const {
    if constexpr (std::is_same_v<T, bool>) {
      cl_bool answer = CL_FALSE;
      const bool known = if_known(query, answer);
      place = known ? answer != CL_FALSE : place;
      return known;
    } else {
      T answer{};
      const bool known =
          cl().clGetDeviceInfo(id_, query, sizeof answer, &answer, nullptr) == CL_SUCCESS;
      place = known ? answer : place;
      return known;
    }
  }
  template <typename T>
  void ask(cl_device_info query, T& place) const {
    if (!if_known(query, place)) {
      throw_unanswered();
    }
  }

  template <typename T>
  std::vector<T> list(cl_device_info query) const {
    std::size_t size = 0;
    std::vector<T> all;
    if (cl().clGetDeviceInfo(id_, query, 0, nullptr, &size) == CL_SUCCESS) {
      all.resize(size / sizeof(T));
      if (cl().clGetDeviceInfo(id_, query, size, all.data(), nullptr) != CL_SUCCESS) {
        all.clear();
      }
    }
    return all;
  }
  std::string text_if_known(cl_device_info query) const {
    const std::vector<char> characters = list<char>(query);
    return {characters.begin(), std::find(characters.begin(), characters.end(), '\0')};
  }
  // Never empty: every device has a name, a vendor and versions.
  std::string text(cl_device_info query) const {
    std::string found = text_if_known(query);
    if (found.empty()) {
      throw_unanswered();
    }
    return found;
  }

 private:
  [[noreturn]] static void throw_unanswered() {
    throw exception(make_error_code(errc::platform),
                    "an OpenCL device does not answer what every device does");
  }
  cl_device_id id_;
};

std::vector<std::string> split(const std::string& text, char separator) {
  std::vector<std::string> pieces;
  for (std::size_t begin = 0; begin < text.size();) {
    const std::size_t end = std::min(text.find(separator, begin), text.size());
    if (end != begin) {
      pieces.push_back(text.substr(begin, end - begin));
    }
    begin = end + 1;
  }
  return pieces;
}

// The values whose flags are set in an answer.
template <typename T>
struct flag {
  cl_bitfield bit;
  T value;
};
template <typename T, std::size_t Size>
std::vector<T> values_of(cl_bitfield bits, const flag<T> (&flags)[Size]) {
  std::vector<T> values;
  for (const flag<T>& each : flags) {
    if ((bits & each.bit) != 0) {
      values.push_back(each.value);
    }
  }
  return values;
}

constexpr flag<info::fp_config> fp_flags[] = {
    {CL_FP_DENORM, info::fp_config::denorm},
    {CL_FP_INF_NAN, info::fp_config::inf_nan},
    {CL_FP_ROUND_TO_NEAREST, info::fp_config::round_to_nearest},
    {CL_FP_ROUND_TO_ZERO, info::fp_config::round_to_zero},
    {CL_FP_ROUND_TO_INF, info::fp_config::round_to_inf},
    {CL_FP_FMA, info::fp_config::fma},
    {CL_FP_CORRECTLY_ROUNDED_DIVIDE_SQRT, info::fp_config::correctly_rounded_divide_sqrt},
    {CL_FP_SOFT_FLOAT, info::fp_config::soft_float}};
constexpr flag<memory_order> order_flags[] = {
    {CL_DEVICE_ATOMIC_ORDER_RELAXED, memory_order::relaxed},
    {CL_DEVICE_ATOMIC_ORDER_ACQ_REL, memory_order::acquire},
    {CL_DEVICE_ATOMIC_ORDER_ACQ_REL, memory_order::release},
    {CL_DEVICE_ATOMIC_ORDER_ACQ_REL, memory_order::acq_rel},
    {CL_DEVICE_ATOMIC_ORDER_SEQ_CST, memory_order::seq_cst}};
constexpr flag<memory_scope> scope_flags[] = {
    {CL_DEVICE_ATOMIC_SCOPE_WORK_ITEM, memory_scope::work_item},
    {CL_DEVICE_ATOMIC_SCOPE_WORK_GROUP, memory_scope::sub_group},
    {CL_DEVICE_ATOMIC_SCOPE_WORK_GROUP, memory_scope::work_group},
    {CL_DEVICE_ATOMIC_SCOPE_DEVICE, memory_scope::device},
    {CL_DEVICE_ATOMIC_SCOPE_ALL_DEVICES, memory_scope::system}};
constexpr flag<info::execution_capability> execution_flags[] = {
    {CL_EXEC_KERNEL, info::execution_capability::exec_kernel},
    {CL_EXEC_NATIVE_KERNEL, info::execution_capability::exec_native_kernel}};
constexpr flag<info::partition_affinity_domain> affinity_flags[] = {
    {CL_DEVICE_AFFINITY_DOMAIN_NUMA, info::partition_affinity_domain::numa},
    {CL_DEVICE_AFFINITY_DOMAIN_L4_CACHE, info::partition_affinity_domain::L4_cache},
    {CL_DEVICE_AFFINITY_DOMAIN_L3_CACHE, info::partition_affinity_domain::L3_cache},
    {CL_DEVICE_AFFINITY_DOMAIN_L2_CACHE, info::partition_affinity_domain::L2_cache},
    {CL_DEVICE_AFFINITY_DOMAIN_L1_CACHE, info::partition_affinity_domain::L1_cache},
    {CL_DEVICE_AFFINITY_DOMAIN_NEXT_PARTITIONABLE,
     info::partition_affinity_domain::next_partitionable}};

info::device_type type_of(cl_device_type type) {
  return (type & CL_DEVICE_TYPE_GPU) != 0           ? info::device_type::gpu
         : (type & CL_DEVICE_TYPE_CPU) != 0         ? info::device_type::cpu
         : (type & CL_DEVICE_TYPE_ACCELERATOR) != 0 ? info::device_type::accelerator
                                                    : info::device_type::custom;
}

void set_names(device_properties& p, const device_answers& device) {
  cl_device_type type = 0;
  device.ask(CL_DEVICE_TYPE, type);
  p.device_type = type_of(type);
  p.name = device.text(CL_DEVICE_NAME);
  p.vendor = device.text(CL_DEVICE_VENDOR);
  device.ask(CL_DEVICE_VENDOR_ID, p.vendor_id);
  p.driver_version = device.text(CL_DRIVER_VERSION);
  p.profile = device.text(CL_DEVICE_PROFILE);
  p.version = device.text(CL_DEVICE_VERSION);  // "OpenCL 3.0 ..."
  p.backend_version = split(p.version, ' ').size() < 2 ? "" : split(p.version, ' ')[1];
  p.extensions = split(device.text_if_known(CL_DEVICE_EXTENSIONS), ' ');
  p.built_in_kernels = split(device.text_if_known(CL_DEVICE_BUILT_IN_KERNELS), ';');
}

void set_numbers(device_properties& p, const device_answers& device) {
  device.ask(CL_DEVICE_MAX_COMPUTE_UNITS, p.max_compute_units);
  device.ask(CL_DEVICE_MAX_WORK_ITEM_DIMENSIONS, p.max_work_item_dimensions);
  device.ask(CL_DEVICE_MAX_WORK_GROUP_SIZE, p.max_work_group_size);
  device.ask(CL_DEVICE_MAX_CLOCK_FREQUENCY, p.max_clock_frequency);
  device.ask(CL_DEVICE_ADDRESS_BITS, p.address_bits);
  device.ask(CL_DEVICE_MAX_PARAMETER_SIZE, p.max_parameter_size);
  device.ask(CL_DEVICE_PROFILING_TIMER_RESOLUTION, p.profiling_timer_resolution);
  device.if_known(CL_DEVICE_PRINTF_BUFFER_SIZE, p.printf_buffer_size);
  device.if_known(CL_DEVICE_MAX_NUM_SUB_GROUPS, p.max_num_sub_groups);
  device.if_known(CL_DEVICE_SUB_GROUP_INDEPENDENT_FORWARD_PROGRESS,
                  p.sub_group_independent_forward_progress);
  p.sub_group_sizes.clear();  // OpenCL tells them of kernels, not of devices
}

void set_vector_widths(device_properties& p, const device_answers& device) {
#define LUMEN_VECTOR_WIDTH(name, NAME)                                                       \
  device.if_known(CL_DEVICE_PREFERRED_VECTOR_WIDTH_##NAME, p.preferred_vector_width_##name); \
  device.if_known(CL_DEVICE_NATIVE_VECTOR_WIDTH_##NAME, p.native_vector_width_##name);
  LUMEN_VECTOR_WIDTH(char, CHAR)
  LUMEN_VECTOR_WIDTH(short, SHORT)
  LUMEN_VECTOR_WIDTH(int, INT)
  LUMEN_VECTOR_WIDTH(long, LONG)
  LUMEN_VECTOR_WIDTH(float, FLOAT)
  LUMEN_VECTOR_WIDTH(double, DOUBLE)
  LUMEN_VECTOR_WIDTH(half, HALF)
#undef LUMEN_VECTOR_WIDTH
}

void set_memory(device_properties& p, const device_answers& device) {
  device.ask(CL_DEVICE_MAX_MEM_ALLOC_SIZE, p.max_mem_alloc_size);
  device.ask(CL_DEVICE_GLOBAL_MEM_SIZE, p.global_mem_size);
  device.ask(CL_DEVICE_LOCAL_MEM_SIZE, p.local_mem_size);
  device.ask(CL_DEVICE_MEM_BASE_ADDR_ALIGN, p.mem_base_addr_align);
  device.if_known(CL_DEVICE_GLOBAL_MEM_CACHELINE_SIZE, p.global_mem_cache_line_size);
  device.if_known(CL_DEVICE_GLOBAL_MEM_CACHE_SIZE, p.global_mem_cache_size);
  device.if_known(CL_DEVICE_ERROR_CORRECTION_SUPPORT, p.error_correction_support);
  device.if_known(CL_DEVICE_HOST_UNIFIED_MEMORY, p.host_unified_memory);
  cl_device_mem_cache_type cache = CL_NONE;
  device.if_known(CL_DEVICE_GLOBAL_MEM_CACHE_TYPE, cache);
  p.global_mem_cache_type = cache == CL_READ_ONLY_CACHE    ? info::global_mem_cache_type::read_only
                            : cache == CL_READ_WRITE_CACHE ? info::global_mem_cache_type::read_write
                                                           : info::global_mem_cache_type::none;
  cl_device_local_mem_type local = CL_NONE;
  device.if_known(CL_DEVICE_LOCAL_MEM_TYPE, local);
  p.local_mem_type = local == CL_LOCAL    ? info::local_mem_type::local
                     : local == CL_GLOBAL ? info::local_mem_type::global
                                          : info::local_mem_type::none;
}

void set_images(device_properties& p, const device_answers& device) {
  device.if_known(CL_DEVICE_IMAGE_SUPPORT, p.image_support);
  device.if_known(CL_DEVICE_MAX_READ_IMAGE_ARGS, p.max_read_image_args);
  device.if_known(CL_DEVICE_MAX_WRITE_IMAGE_ARGS, p.max_write_image_args);
  device.if_known(CL_DEVICE_IMAGE2D_MAX_WIDTH, p.image2d_max_width);
  device.if_known(CL_DEVICE_IMAGE2D_MAX_HEIGHT, p.image2d_max_height);
  device.if_known(CL_DEVICE_IMAGE3D_MAX_WIDTH, p.image3d_max_width);
  device.if_known(CL_DEVICE_IMAGE3D_MAX_HEIGHT, p.image3d_max_height);
  device.if_known(CL_DEVICE_IMAGE3D_MAX_DEPTH, p.image3d_max_depth);
  device.if_known(CL_DEVICE_IMAGE_MAX_BUFFER_SIZE, p.image_max_buffer_size);
  device.if_known(CL_DEVICE_MAX_SAMPLERS, p.max_samplers);
}

void set_arithmetic(device_properties& p, const device_answers& device) {
  const auto bits = [&device](cl_device_info query) {
    cl_bitfield answer = 0;
    device.if_known(query, answer);
    return answer;
  };
  p.half_fp_config = values_of(bits(CL_DEVICE_HALF_FP_CONFIG), fp_flags);
  p.single_fp_config = values_of(bits(CL_DEVICE_SINGLE_FP_CONFIG), fp_flags);
  p.double_fp_config = values_of(bits(CL_DEVICE_DOUBLE_FP_CONFIG), fp_flags);
  // What devices before version 3.0 have, which does not ask them.
  cl_bitfield memory = CL_DEVICE_ATOMIC_ORDER_RELAXED | CL_DEVICE_ATOMIC_SCOPE_WORK_GROUP;
  cl_bitfield fence = memory | CL_DEVICE_ATOMIC_ORDER_ACQ_REL;
  device.if_known(CL_DEVICE_ATOMIC_MEMORY_CAPABILITIES, memory);
  device.if_known(CL_DEVICE_ATOMIC_FENCE_CAPABILITIES, fence);
  p.atomic_memory_order_capabilities = values_of(memory, order_flags);
  p.atomic_memory_scope_capabilities = values_of(memory, scope_flags);
  p.atomic_fence_order_capabilities = values_of(fence, order_flags);
  p.atomic_fence_scope_capabilities = values_of(fence, scope_flags);
}

void set_abilities(device_properties& p, const device_answers& device) {
  device.ask(CL_DEVICE_ENDIAN_LITTLE, p.is_endian_little);
  device.ask(CL_DEVICE_AVAILABLE, p.is_available);
  device.ask(CL_DEVICE_COMPILER_AVAILABLE, p.is_compiler_available);
  p.is_linker_available = p.is_compiler_available;  // what version 1.2 says for those before it
  device.if_known(CL_DEVICE_LINKER_AVAILABLE, p.is_linker_available);
  cl_device_exec_capabilities execution = 0;
  device.ask(CL_DEVICE_EXECUTION_CAPABILITIES, execution);
  p.execution_capabilities = values_of(execution, execution_flags);
  cl_command_queue_properties queues = 0;
  device.ask(CL_DEVICE_QUEUE_PROPERTIES, queues);
  p.queue_profiling = (queues & CL_QUEUE_PROFILING_ENABLE) != 0;
  device.if_known(CL_DEVICE_PREFERRED_INTEROP_USER_SYNC, p.preferred_interop_user_sync);
}

info::partition_property partition_of(cl_device_partition_property property) {
  return property == CL_DEVICE_PARTITION_EQUALLY     ? info::partition_property::partition_equally
         : property == CL_DEVICE_PARTITION_BY_COUNTS ? info::partition_property::partition_by_counts
         : property == CL_DEVICE_PARTITION_BY_AFFINITY_DOMAIN
             ? info::partition_property::partition_by_affinity_domain
             : info::partition_property::no_partition;
}

void set_partitions(device_properties& p, const device_answers& device) {
  device.if_known(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, p.partition_max_sub_devices);
  using property = cl_device_partition_property;
  for (const property each : device.list<property>(CL_DEVICE_PARTITION_PROPERTIES)) {
    if (partition_of(each) != info::partition_property::no_partition) {
      p.partition_properties.push_back(partition_of(each));
    }
  }
  cl_device_affinity_domain domains = 0;
  device.if_known(CL_DEVICE_PARTITION_AFFINITY_DOMAIN, domains);
  p.partition_affinity_domains = values_of(domains, affinity_flags);
  // How the device came from its parent; nothing, or zeros, for one that has none.
  const std::vector<property> type = device.list<property>(CL_DEVICE_PARTITION_TYPE);
  p.partition_type_property =
      type.empty() ? info::partition_property::no_partition : partition_of(type[0]);
  if (p.partition_type_property == info::partition_property::partition_by_affinity_domain &&
      type.size() > 1) {
    const auto found = values_of(static_cast<cl_bitfield>(type[1]), affinity_flags);
    p.partition_type_affinity_domain =
        found.empty() ? info::partition_affinity_domain::not_applicable : found[0];
  }
}

aspect aspect_of(info::device_type type) {
  return type == info::device_type::gpu           ? aspect::gpu
         : type == info::device_type::cpu         ? aspect::cpu
         : type == info::device_type::accelerator ? aspect::accelerator
                                                  : aspect::custom;
}

// Memory that the host reaches by the same addresses takes fine-grained sharing.
void add_memory_aspects(std::vector<aspect>& aspects, cl_device_svm_capabilities sharing) {
  if ((sharing & CL_DEVICE_SVM_COARSE_GRAIN_BUFFER) != 0) {
    aspects.push_back(aspect::usm_device_allocations);
  }
  if ((sharing & CL_DEVICE_SVM_FINE_GRAIN_BUFFER) != 0) {
    aspects.push_back(aspect::usm_host_allocations);
    aspects.push_back(aspect::usm_shared_allocations);
    if ((sharing & CL_DEVICE_SVM_ATOMICS) != 0) {
      aspects.push_back(aspect::usm_atomic_host_allocations);
      aspects.push_back(aspect::usm_atomic_shared_allocations);
    }
  }
  if ((sharing & CL_DEVICE_SVM_FINE_GRAIN_SYSTEM) != 0) {
    aspects.push_back(aspect::usm_system_allocations);
  }
}

std::vector<aspect> aspects_of(const device_properties& p, const device_answers& device) {
  const auto has_extension = [&p](const char* name) {
    return std::find(p.extensions.begin(), p.extensions.end(), name) != p.extensions.end();
  };
  std::vector<aspect> aspects = {aspect_of(p.device_type)};
  const std::pair<bool, aspect> others[] = {
      {!p.half_fp_config.empty(), aspect::fp16},
      {!p.double_fp_config.empty(), aspect::fp64},
      {has_extension("cl_khr_int64_base_atomics"), aspect::atomic64},
      {p.image_support, aspect::image},
      {p.is_compiler_available, aspect::online_compiler},
      {p.is_linker_available, aspect::online_linker},
      {p.queue_profiling, aspect::queue_profiling}};
  for (const auto& [has, its] : others) {
    if (has) {
      aspects.push_back(its);
    }
  }
  cl_device_svm_capabilities sharing = 0;
  device.if_known(CL_DEVICE_SVM_CAPABILITIES, sharing);
  add_memory_aspects(aspects, sharing);
  return aspects;
}

}  // namespace

std::unique_ptr<platform_record> describe_platform(cl_platform_id id) {
  auto record = std::make_unique<platform_record>();
  record->kind = backend::opencl;
  record->name = platform_text(id, CL_PLATFORM_NAME);
  record->vendor = platform_text(id, CL_PLATFORM_VENDOR);
  record->version = platform_text(id, CL_PLATFORM_VERSION);
  record->profile = platform_text(id, CL_PLATFORM_PROFILE);
  record->extensions = split(platform_text(id, CL_PLATFORM_EXTENSIONS), ' ');
  record->native = id;
  return record;
}

std::unique_ptr<device_record> describe_device(cl_device_id id, const platform_record& platform) {
  auto record = std::make_unique<device_record>();
  device_properties& p = record->properties;
  p = common_properties();
  const device_answers answers(id);
  set_names(p, answers);
  set_numbers(p, answers);
  set_vector_widths(p, answers);
  set_memory(p, answers);
  set_images(p, answers);
  set_arithmetic(p, answers);
  set_abilities(p, answers);
  set_partitions(p, answers);
  p.aspects = aspects_of(p, answers);
  record->platform = &platform;
  // Below the devices that run this program's own kernels.
  record->default_rating = p.device_type == info::device_type::gpu ? 20 : 5;
  record->detached = true;
  record->native = id;
  return record;
}

int opencl_version(const device_record& device) {
  int major = 0;
  int minor = 0;
  const int found = std::sscanf(device.properties.version.c_str(), "OpenCL %d.%d", &major, &minor);
  return found == 2 ? 100 * major + 10 * minor : 0;
}

}  // namespace detail
LUMEN_NAMESPACE_END
