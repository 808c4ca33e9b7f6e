// SPDX-License-Identifier: Apache-2.0
// What goes wrong in forge, each with a class and a text of its own (exceptions.def): in `forge`
// while a kernel is made, in `forge::crate` about binaries that a driver made.
#pragma once

#include <cstdint>
#include <stdexcept>

namespace kestrel::tarn::forge {

// The destructors stand in the source, which is so the one home of each class's type information.
#define TARN_FORGE_EXCEPTION(name, text)   \
  class name : public std::runtime_error { \
   public:                                 \
    name();                                \
    ~name() override;                      \
  };
#define TARN_FORGE_CRATE_EXCEPTION(name, text) \
  namespace crate {                            \
  TARN_FORGE_EXCEPTION(name, text)             \
  }
#include "exceptions.def"
#undef TARN_FORGE_CRATE_EXCEPTION
#undef TARN_FORGE_EXCEPTION

/// "An OpenCL error occurred: " and the code.
class opencl_error : public std::runtime_error {
 public:
  explicit opencl_error(std::int32_t status);
  ~opencl_error() override;

  std::int32_t status;  // the code that the call returned
};

/// "A Level Zero error occurred."; only the member tells the code.
class level_zero_error : public std::runtime_error {
 public:
  explicit level_zero_error(std::uint32_t status);
  ~level_zero_error() override;

  std::uint32_t status;  // the code that the call returned
};

}  // namespace kestrel::tarn::forge
