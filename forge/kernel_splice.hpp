// SPDX-License-Identifier: Apache-2.0
// Another code body in the kernel of an older device binary: what the two ways to ask for it share.
#pragma once

#include <cstdint>

#include "bytes.hpp"
#include "older_binary.hpp"

namespace kestrel::tarn::forge {

/// A splice that has been thought through; it looks at the caller's bytes, which must stay.
class kernel_splice {
 public:
  /// Checks the binary and finds the size of the result. Nothing else may be called unless the
  /// answer is none.
  binary_fault plan(byte_view binary, byte_view code, byte_view patches);

  /// Of the result, in bytes.
  std::uint64_t size() const { return binary_.size + growth_; }

  /// Writes the result, `size()` bytes: the code, padded, for the kernel heap; the patches behind
  /// the patch list; all sizes, section offsets and the checksum brought up to date.
  void write(std::uint8_t* result) const;

  /// The same for a driver that shall not look at what it knew of the former code: zeros for the
  /// contents of certain tokens of the former patch list, and a plain type for its own sections.
  void write_neutral(std::uint8_t* result) const;

 private:
  bool section_can_grow() const;
  void copy_parts(std::uint8_t* result) const;
  void clear_tokens(std::uint8_t* result) const;
  void update_kernel(std::uint8_t* result) const;
  void update_sections(std::uint8_t* result) const;
  void retype_sections(std::uint8_t* result) const;
  std::uint64_t moved(std::uint64_t offset) const;
  std::uint64_t new_patches() const;

  byte_view binary_;
  byte_view code_;
  byte_view patches_;
  Elf64_Ehdr file_header_{};
  program_section program_;
  kernel_parts kernel_;
  std::uint32_t heap_size_ = 0;  // of the new kernel heap
  std::uint64_t growth_ = 0;     // of the file, modulo 2^64
};

}  // namespace kestrel::tarn::forge
