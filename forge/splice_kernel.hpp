// SPDX-License-Identifier: Apache-2.0
// Another code body in an older device binary, for callers that want a status.
#pragma once

#include <cstddef>

namespace kestrel::tarn::forge {

inline constexpr int splice_no_elf = -1;       // or a null pointer
inline constexpr int splice_no_program = -2;   // no program section, or one below 28 bytes
inline constexpr int splice_bad_program = -3;  // not one kernel of the known layout
inline constexpr int splice_no_memory = -4;    // or sizes that do not fit fields of 32 bits
inline constexpr int splice_bad_checksum = -5;

/// What replace_kernel does, and two things more, so that the driver does not look at what it noted
/// about the former code: in the former patch list tokens of type 52 keep their first 8 bytes and
/// are zero behind them, and sections of type 0xFF000008 get type 3. Sizes are in bytes. `code` and
/// `patches` may be null when their sizes are 0.
/// Returns 0, and in `*out` a block from tarn_serv_malloc, aligned to 16 bytes, which the caller
/// frees; or one of the numbers above, and null and 0 in `*out` and `*out_size`.
int splice_kernel(const void* binary, std::size_t size, const void* code, std::size_t code_size,
                  const void* patches, std::size_t patches_size, void** out,
                  std::size_t* out_size) noexcept;

}  // namespace kestrel::tarn::forge
