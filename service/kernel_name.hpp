// SPDX-License-Identifier: Apache-2.0
// What the name of a kernel tells, by the conventions of the library that it comes from.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace kestrel::tarn::gpu {

/// The kernel's name for people, with the namespace of its library before it.
std::string full_kernel_name(std::int32_t domain, std::string_view name);

/// Whether the kernel works in double precision, as far as its name tells. This is a guess, good
/// enough to choose a message by.
bool seems_double(std::int32_t domain, std::string_view name);

}  // namespace kestrel::tarn::gpu
