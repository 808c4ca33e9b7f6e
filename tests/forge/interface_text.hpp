// SPDX-License-Identifier: Apache-2.0
// The two texts of a kernel's interface as strings, and a kernel that asks for everything.
#pragma once

#include <sstream>
#include <string>

#include "kernel_interface.hpp"

namespace tarn_test {

using namespace kestrel::tarn::forge;

inline std::string source_of(const kernel_interface& kernel) {
  std::ostringstream stream;
  kernel.emit_dummy_source(stream);
  return stream.str();
}

inline std::string metadata_of(const kernel_interface& kernel) {
  std::ostringstream stream;
  kernel.emit_metadata(stream);
  return stream.str();
}

/// Every requirement and every kind of argument; not finalized.
inline kernel_interface everything(hw_code hw) {
  kernel_interface kernel(hw);
  kernel.kernel_name = "everything";
  kernel.require_stateless_4gb = true;
  kernel.thread_scheduling = 1;
  kernel.barrier_count = 3;
  kernel.use_dpas = true;
  kernel.use_global_atomics = true;
  kernel.grf_count = 256;
  kernel.need_local_id = true;
  kernel.need_local_size = true;
  kernel.use_enqueued_local_size = true;
  kernel.disable_preemption = true;
  kernel.need_half = true;
  kernel.need_double = true;
  kernel.stateless_write = false;
  kernel.skip_per_thread_offset = 64;
  kernel.scratch_size = 128;
  kernel.slm_size = 4096;
  kernel.walk_order = {2, 1, 0};
  kernel.work_group_size = {16, 2, 1};
  kernel.inline_data_registers = 1;
  kernel.new_argument("n", type_uint);
  kernel.new_argument("p", type_ulong, argument_kind::global_pointer, default_access);
  kernel.new_argument("q", type_ulong, argument_kind::global_pointer, stateless_access);
  kernel.new_argument("r", type_ulong, argument_kind::global_pointer, surface_access);
  kernel.new_argument("w", type_uint, argument_kind::local_pointer, default_access);
  return kernel;
}

}  // namespace tarn_test
