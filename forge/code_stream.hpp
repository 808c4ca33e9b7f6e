// SPDX-License-Identifier: Apache-2.0
// The bytes of a kernel while they are being made: streams of instructions, labels, and the jumps
// to them. Instructions come here encoded; how, differs from one generation of hardware to the
// next.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "bytes.hpp"

namespace kestrel::tarn::forge {

/// One instruction, encoded.
using instruction = std::array<std::uint8_t, 16>;

/// A place in the code of one generator, named before or after it is known.
class label {
 public:
  label() = default;
  label(const label&) = delete;  // the two would part at the first use
  label& operator=(const label&) = delete;

 private:
  friend class code_generator;
  static constexpr std::uint32_t without_id = 0xFFFFFFFF;
  std::uint32_t id_ = without_id;
};

/// Code built out of line, until it is put in its place.
class code_stream {
  friend class code_generator;

  // A jump that waits for its distance.
  struct label_use {
    std::size_t jump;   // offset of the instruction in bytes
    std::size_t field;  // offset within it of the 32 bits of the distance
    std::uint32_t id;
  };
  struct label_place {
    std::uint32_t id;
    std::uint32_t offset;
  };

  byte_vector bytes_;
  std::vector<label_use> uses_;
  std::vector<label_place> places_;
};

/// A stack of streams that starts with one. The streams and labels of a generator are no use to
/// another one; where that shows, invalid_object_exception is thrown. A call that is refused leaves
/// the code as it was.
class code_generator {
 public:
  code_generator();

  /// Appends an instruction to the current stream. All code together stays below 2 GiB, so that
  /// distances fit their 32 bits; throws std::length_error.
  void emit(const instruction& encoded);

  /// Appends a jump: the signed distance in bytes, from this instruction to the label, goes as 32
  /// little-endian bits to byte `field` of it. Throws invalid_operand_exception for a field that
  /// does not lie within the instruction.
  void emit_jump(const instruction& encoded, label& target, std::size_t field);

  /// Places the label at the current stream's end. Throws multiple_label_exception if it has a
  /// place.
  void mark(label& place);

  /// The label's identifier, given at its first use: 0, 1, 2, ...
  std::uint32_t get_label_id(label& named);

  /// Opens a stream, which becomes the current one.
  void push_stream();

  /// Closes the current stream and hands it out; its labels have no place until it is appended.
  /// Throws invalid_object_exception for the last stream.
  code_stream pop_stream();

  /// Puts a closed stream at the end of the current one. Throws multiple_label_exception if one of
  /// its labels has got a place meanwhile, as by being appended before.
  void append(const code_stream& closed);

  /// The finished code: all jumps know their distance. Throws unfinished_stream_exception while
  /// more than one stream is open, dangling_label_exception if a jump's label has no place.
  byte_vector get_code() const;

 private:
  code_stream& current() { return streams_.back(); }
  void require_known(std::uint32_t id) const;

  std::vector<code_stream> streams_;
  std::vector<std::uint32_t> positions_;  // byte offsets by label, each in its own open stream
};

}  // namespace kestrel::tarn::forge
