// SPDX-License-Identifier: Apache-2.0
// The splice with faults as exceptions.
#include "replace_kernel.hpp"

#include "kernel_splice.hpp"
#include "older_binary.hpp"

namespace kestrel::tarn::forge {

byte_vector replace_kernel(byte_view binary, byte_view code, byte_view patches) {
  kernel_splice splice;
  throw_fault(splice.plan(binary, code, patches));
  byte_vector result(splice.size());
  splice.write(result.data());
  return result;
}

}  // namespace kestrel::tarn::forge
