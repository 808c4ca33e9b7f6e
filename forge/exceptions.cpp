// SPDX-License-Identifier: Apache-2.0
// The exceptions of forge, from the rows of exceptions.def.
#include "exceptions.hpp"

#include <string>

namespace kestrel::tarn::forge {

#define TARN_FORGE_EXCEPTION(name, text)     \
  name::name() : std::runtime_error(text) {} \
  name::~name() = default;
#define TARN_FORGE_CRATE_EXCEPTION(name, text) \
  namespace crate {                            \
  TARN_FORGE_EXCEPTION(name, text)             \
  }
#include "exceptions.def"
#undef TARN_FORGE_CRATE_EXCEPTION
#undef TARN_FORGE_EXCEPTION

opencl_error::opencl_error(std::int32_t code)
    : std::runtime_error("An OpenCL error occurred: " + std::to_string(code)), status(code) {}
opencl_error::~opencl_error() = default;

level_zero_error::level_zero_error(std::uint32_t code)
    : std::runtime_error("A Level Zero error occurred."), status(code) {}
level_zero_error::~level_zero_error() = default;

}  // namespace kestrel::tarn::forge
