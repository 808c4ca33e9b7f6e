// SPDX-License-Identifier: Apache-2.0
// The virtual tables of closure records, and the functions that a launch does not use.
#include "sycl/detail/command.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

command::~command() = default;
host_command::~host_command() = default;
kernel_command::~kernel_command() = default;
void kernel_command::run_items(std::size_t, std::size_t) const {}
void kernel_command::run_group(group_frame&) const {}
bool kernel_command::needs_groups() const {
  return false;
}
void kernel_command::finish() {}

}  // namespace detail
LUMEN_NAMESPACE_END
