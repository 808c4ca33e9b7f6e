// SPDX-License-Identifier: Apache-2.0
// The conventions: BLAS and LAPACK begin with the letter of a precision (d and z are the double
// ones; i stands before it in searches for an index), DFT ends with one.
#include "kernel_name.hpp"

#include "tarn_gpu_kernel.h"

namespace kestrel::tarn::gpu {
namespace {

const char* prefix_of(std::int32_t domain) {
  switch (domain) {
    case TARN_GPU_DOMAIN_BLAS:
      return "kestrel::tarn::blas::";
    case TARN_GPU_DOMAIN_DFT:
      return "kestrel::tarn::dft::";
    case TARN_GPU_DOMAIN_LAPACK:
      return "kestrel::tarn::lapack::";
    default:
      return "";
  }
}

bool begins_double(std::string_view name) {
  return !name.empty() && (name[0] == 'd' || name[0] == 'z');
}

}  // namespace

std::string full_kernel_name(std::int32_t domain, std::string_view name) {
  return std::string(prefix_of(domain)).append(name);
}

bool seems_double(std::int32_t domain, std::string_view name) {
  constexpr std::string_view dft_ending = "_d";
  switch (domain) {
    case TARN_GPU_DOMAIN_BLAS:
      return begins_double(name) ||
             (!name.empty() && name[0] == 'i' && begins_double(name.substr(1)));
    case TARN_GPU_DOMAIN_DFT:
      return name.size() >= dft_ending.size() &&
             name.substr(name.size() - dft_ending.size()) == dft_ending;
    case TARN_GPU_DOMAIN_LAPACK:
      return begins_double(name);
    default:
      return false;
  }
}

}  // namespace kestrel::tarn::gpu
