// SPDX-License-Identifier: Apache-2.0
// An argument, by its position, of a kernel that was not made from a C++ function.
#pragma once

#include <cstddef>
#include <vector>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

enum class argument_kind : char { value, pointer, local_memory };

struct kernel_argument {
  int index;
  argument_kind kind;
  std::vector<unsigned char> value;  // the bytes of a value
  void* pointer;                     // into unified shared memory or a buffer's copy
  std::size_t local_bytes;           // of local memory
};

}  // namespace detail
LUMEN_NAMESPACE_END
