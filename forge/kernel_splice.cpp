// SPDX-License-Identifier: Apache-2.0
// The splice: the file up to the kernel heap, the new heap, the rest of the kernel, the patches,
// and the rest of the file, which moves.
#include "kernel_splice.hpp"

#include <algorithm>
#include <cstring>
#include <limits>
#include <optional>

#include "binary_hash.hpp"
#include "elf_view.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr std::uint64_t prefetch_room = 64;  // bytes that hardware may read behind the code
constexpr std::uint64_t heap_rounding = 256;
constexpr std::uint32_t cleared_token = 52;

struct patch_token {
  std::uint32_t type;
  std::uint32_t size;  // of the whole token
};

bool fits_32_bits(std::uint64_t size) {
  return size <= std::numeric_limits<std::uint32_t>::max();
}

std::uint8_t* append(std::uint8_t* at, byte_view bytes) {
  if (bytes.size != 0) {  // memcpy takes no null pointer
    std::memcpy(at, bytes.data, bytes.size);
  }
  return at + bytes.size;
}

}  // namespace

binary_fault kernel_splice::plan(byte_view binary, byte_view code, byte_view patches) {
  const std::optional<elf_view> elf = elf_view::open(binary);
  if (!elf) {
    return binary_fault::no_elf;
  }
  binary_fault fault = find_program(*elf, program_);
  if (fault == binary_fault::none) {
    fault = find_kernel(*elf, program_, kernel_);
  }
  if (fault != binary_fault::none) {
    return fault;
  }
  binary_ = binary;
  code_ = code;
  patches_ = patches;
  file_header_ = elf->header();
  // The sizes by themselves first, so that the sums cannot wrap.
  if (!fits_32_bits(code.size) || !fits_32_bits(patches.size)) {
    return binary_fault::too_large;
  }
  const std::uint64_t heap = (code.size + prefetch_room + heap_rounding - 1) & ~(heap_rounding - 1);
  if (!fits_32_bits(heap) || !fits_32_bits(kernel_.header.patch_list_size + patches.size)) {
    return binary_fault::too_large;
  }
  heap_size_ = static_cast<std::uint32_t>(heap);
  growth_ = heap - kernel_.header.kernel_heap_size + patches.size;
  return section_can_grow() ? binary_fault::none : binary_fault::bad_program;
}

/// Whether the program section's size, which the file is free to choose, still holds the program
/// header afterwards, and does not wrap.
bool kernel_splice::section_can_grow() const {
  const std::uint64_t after = program_.size + growth_;
  const bool shrinks = growth_ >> 63 != 0;
  return after >= sizeof(program_header) &&
         (shrinks ? after < program_.size : after >= program_.size);
}

void kernel_splice::write(std::uint8_t* result) const {
  copy_parts(result);
  update_kernel(result);
  update_sections(result);
}

void kernel_splice::write_neutral(std::uint8_t* result) const {
  copy_parts(result);
  clear_tokens(result);
  update_kernel(result);
  update_sections(result);
  retype_sections(result);
}

void kernel_splice::copy_parts(std::uint8_t* result) const {
  const std::uint8_t* const file = binary_.data;
  std::uint8_t* at = append(result, {file, kernel_.heap});
  at = append(at, code_);
  std::memset(at, 0, heap_size_ - code_.size);
  at += heap_size_ - code_.size;
  at = append(at, {file + kernel_.states, kernel_.end - kernel_.states});
  at = append(at, patches_);
  append(at, {file + kernel_.end, binary_.size - kernel_.end});
}

/// Where a byte of the file that lies in front of the kernel or behind it is in the result.
std::uint64_t kernel_splice::moved(std::uint64_t offset) const {
  return offset >= kernel_.end ? offset + growth_ : offset;
}

/// Where the patch list is in the result.
std::uint64_t kernel_splice::new_patches() const {
  return kernel_.heap + heap_size_ + (kernel_.patches - kernel_.states);
}

/// Only the driver's own list is walked. A token that claims to go on beyond the list is cut at its
/// end; one that claims to be shorter than its own two words has no successor that could be found.
void kernel_splice::clear_tokens(std::uint8_t* result) const {
  const byte_view list(result + new_patches(), kernel_.header.patch_list_size);
  patch_token token;
  for (std::uint64_t at = 0; list.read(at, token) && token.size >= sizeof token; at += token.size) {
    const std::uint64_t end = std::min<std::uint64_t>(at + token.size, list.size);
    if (token.type == cleared_token) {
      const std::uint64_t contents = at + sizeof token;
      std::memset(result + new_patches() + contents, 0, end - contents);
    }
  }
}

void kernel_splice::update_kernel(std::uint8_t* result) const {
  kernel_header header = kernel_.header;
  header.kernel_heap_size = heap_size_;
  header.unpadded_kernel_size = static_cast<std::uint32_t>(code_.size);
  header.patch_list_size += static_cast<std::uint32_t>(patches_.size);
  const std::uint64_t end = new_patches() + header.patch_list_size;
  header.checksum = binary_hash(result + kernel_.name, end - kernel_.name);
  put(result, kernel_.header_at, header);
}

void kernel_splice::update_sections(std::uint8_t* result) const {
  Elf64_Ehdr file_header = file_header_;
  file_header.e_shoff = moved(file_header.e_shoff);
  put(result, 0, file_header);
  const elf_view elf = *elf_view::open({result, size()});
  for (unsigned i = 0; i < file_header.e_shnum; ++i) {
    Elf64_Shdr section = elf.section(i);
    section.sh_offset = moved(section.sh_offset);
    section.sh_size += i == program_.index ? growth_ : 0;
    put(result, elf.section_at(i), section);
  }
}

void kernel_splice::retype_sections(std::uint8_t* result) const {
  const elf_view elf = *elf_view::open({result, size()});
  for (unsigned i = 0; i < file_header_.e_shnum; ++i) {
    Elf64_Shdr section = elf.section(i);
    if (section.sh_type == section_type_driver_own) {
      section.sh_type = SHT_STRTAB;
      put(result, elf.section_at(i), section);
    }
  }
}

}  // namespace kestrel::tarn::forge
