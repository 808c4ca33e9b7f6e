// SPDX-License-Identifier: Apache-2.0
// Requests, and the splice.
#include "kernel_acquisition.hpp"

#include "splice_kernel.hpp"

namespace kestrel::tarn::gpu {

kernel_request source_request(std::int32_t domain, const char* program_name, const char* source,
                              const char* kernel_name, const char* options) {
  return {{domain, program_name, text_bytes(options)},
          kernel_name,
          {program_format::source, source, 0, options}};
}

kernel_request spirv_request(std::int32_t domain, const tarn_gpu_spirv_kernel_t& spirv,
                             const char* kernel_name, const char* options) {
  return {{domain, kernel_name, text_bytes(options)},
          kernel_name,
          {program_format::spirv, spirv.code, spirv.code_size, options}};
}

kernel_request keyed_request(std::int32_t domain, const char* kernel_name, forge::byte_view blob) {
  return {{domain, kernel_name, blob}, kernel_name};
}

void hand_out(forge::byte_view payload, const void** data, std::size_t* size) {
  if (data != nullptr) {
    *data = payload.data;
  }
  if (size != nullptr) {
    *size = payload.size;
  }
}

spliced_binary splice(forge::byte_view container, forge::byte_view code) {
  constexpr int first_splice_code = -2000;
  void* out = nullptr;
  std::size_t size = 0;
  const int failure = forge::splice_kernel(container.data, container.size, code.data, code.size,
                                           nullptr, 0, &out, &size);
  check_opencl(failure == 0 ? 0 : failure + first_splice_code);
  return {std::unique_ptr<void, serv_free>(out), size};
}

}  // namespace kestrel::tarn::gpu
