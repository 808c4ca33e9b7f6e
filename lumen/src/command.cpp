// SPDX-License-Identifier: Apache-2.0
// The virtual tables of closure records, the functions that a launch does not use, and what native
// code has to say.
#include "sycl/detail/command.hpp"

#include <string>

#include "backend.hpp"
#include "sycl/detail/exception.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

command::~command() = default;
host_command::~host_command() = default;
device_command::~device_command() = default;
void device_command::finish() {}
bool device_command::ends_on_host() const {
  return false;
}
kernel_command::~kernel_command() = default;
void kernel_command::enqueue(command_stream& stream, const launch_shape& shape) {
  stream.launch(shape, *this);
}
void kernel_command::run_items(std::size_t, std::size_t) const {}
void kernel_command::run_group(group_frame&) const {}
bool kernel_command::needs_groups() const {
  return false;
}
bool kernel_command::serves(backend kind) const {
  return kind == backend::host;
}
void kernel_command::launch_native(const native_launch&) const {
  throw exception(make_error_code(errc::kernel_not_supported),
                  "the program holds no code of this kernel for the device");
}

void command_stream::launch(const native_shape&, native_kernel&,
                            const std::vector<kernel_argument>&) {
  throw exception(make_error_code(errc::kernel_not_supported),
                  "the device does not run native kernels");
}

void throw_native(const char* tried, const char* said, bool memory) {
  throw exception(make_error_code(memory ? errc::memory_allocation : errc::runtime),
                  std::string(tried) + ": " + said);
}

}  // namespace detail
LUMEN_NAMESPACE_END
