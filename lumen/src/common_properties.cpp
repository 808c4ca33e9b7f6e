// SPDX-License-Identifier: Apache-2.0
// The answers to device queries that do not depend on the device.
#include "common_properties.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
// 128-bit vectors are what every processor and GPU loads and stores at once.
void set_vector_widths(device_properties& p) {
  p.preferred_vector_width_char = p.native_vector_width_char = 16;
  p.preferred_vector_width_short = p.native_vector_width_short = 8;
  p.preferred_vector_width_int = p.native_vector_width_int = 4;
  p.preferred_vector_width_long = p.native_vector_width_long = 2;
  p.preferred_vector_width_float = p.native_vector_width_float = 4;
  p.preferred_vector_width_double = p.native_vector_width_double = 2;
  p.preferred_vector_width_half = p.native_vector_width_half = 0;
}

void set_arithmetic(device_properties& p) {
  p.single_fp_config = {info::fp_config::denorm,
                        info::fp_config::inf_nan,
                        info::fp_config::round_to_nearest,
                        info::fp_config::round_to_zero,
                        info::fp_config::round_to_inf,
                        info::fp_config::fma,
                        info::fp_config::correctly_rounded_divide_sqrt};
  p.double_fp_config = p.single_fp_config;
  p.atomic_memory_order_capabilities = {memory_order::relaxed, memory_order::acquire,
                                        memory_order::release, memory_order::acq_rel,
                                        memory_order::seq_cst};
  p.atomic_fence_order_capabilities = p.atomic_memory_order_capabilities;
  p.atomic_memory_scope_capabilities = {memory_scope::work_item, memory_scope::sub_group,
                                        memory_scope::work_group, memory_scope::device,
                                        memory_scope::system};
  p.atomic_fence_scope_capabilities = p.atomic_memory_scope_capabilities;
}
}  // namespace

device_properties common_properties() {
  device_properties p;
  p.profile = "FULL_PROFILE";
  p.max_work_item_dimensions = 3;
  p.sub_group_sizes = {1};
  set_vector_widths(p);
  p.address_bits = 8 * sizeof(void*);
  p.max_parameter_size = 4096;
  set_arithmetic(p);
  p.global_mem_cache_type = info::global_mem_cache_type::read_write;
  p.is_endian_little = __BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__;
  p.is_available = true;
  p.is_compiler_available = false;
  p.is_linker_available = false;
  p.queue_profiling = true;
  p.preferred_interop_user_sync = true;
  p.partition_type_property = info::partition_property::no_partition;
  p.partition_type_affinity_domain = info::partition_affinity_domain::not_applicable;
  return p;
}

}  // namespace detail
LUMEN_NAMESPACE_END
