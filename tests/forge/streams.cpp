// SPDX-License-Identifier: Apache-2.0
// Streams of instructions, labels, and the distances of jumps.
#include <cstddef>
#include <cstdint>
#include <vector>

#include <gtest/gtest.h>

#include "code_stream.hpp"
#include "exceptions.hpp"

namespace {

using namespace kestrel::tarn::forge;

constexpr std::size_t distance_field = 8;

instruction filled(std::uint8_t value) {
  instruction encoded;
  encoded.fill(value);
  return encoded;
}

void emit_filled(code_generator& code, std::uint8_t value, int count) {
  for (int i = 0; i < count; ++i) {
    code.emit(filled(value));
  }
}

/// The distance that the jump at instruction `at` has, after a look at the bytes around it.
std::int32_t distance_at(const byte_vector& code, std::size_t at, std::uint8_t fill,
                         std::size_t field = distance_field) {
  std::uint32_t distance = 0;
  for (std::size_t i = 0; i < 16; ++i) {
    const std::uint8_t byte = code.at(16 * at + i);
    if (i >= field && i < field + 4) {
      distance |= std::uint32_t{byte} << 8 * (i - field);
    } else {
      EXPECT_EQ(byte, fill) << "byte " << i << " of instruction " << at;
    }
  }
  return static_cast<std::int32_t>(distance);
}

TEST(ForgeStreams, CodeIsWhatWasEmitted) {
  code_generator code;
  EXPECT_TRUE(code.get_code().empty());
  code.emit({0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15});
  code.emit(filled(0xA5));
  const byte_vector bytes = code.get_code();
  ASSERT_EQ(bytes.size(), 32U);
  for (std::size_t i = 0; i < 16; ++i) {
    EXPECT_EQ(bytes[i], i);
    EXPECT_EQ(bytes[16 + i], 0xA5);
  }
  EXPECT_EQ(code.get_code(), bytes) << "asking twice changes nothing";
}

TEST(ForgeStreams, LabelsAreNumberedAtFirstUse) {
  code_generator code;
  label first;
  label second;
  label third;
  code.emit_jump(filled(0), second, distance_field);
  EXPECT_EQ(code.get_label_id(second), 0U);
  code.mark(first);
  EXPECT_EQ(code.get_label_id(third), 2U);
  EXPECT_EQ(code.get_label_id(first), 1U);
  EXPECT_EQ(code.get_label_id(third), 2U);
}

TEST(ForgeStreams, JumpsForwardBackwardAndToThemselves) {
  code_generator code;
  label back;
  label self;
  label ahead;
  code.mark(back);
  code.emit_jump(filled(0x11), ahead, distance_field);  // 0
  emit_filled(code, 0, 2);
  code.mark(self);
  code.emit_jump(filled(0x22), self, distance_field);  // 3
  code.emit_jump(filled(0x33), back, distance_field);  // 4
  code.mark(ahead);                                    // the end, behind the last instruction
  const byte_vector bytes = code.get_code();
  ASSERT_EQ(bytes.size(), 80U);
  EXPECT_EQ(distance_at(bytes, 0, 0x11), 80);
  EXPECT_EQ(distance_at(bytes, 3, 0x22), 0);
  EXPECT_EQ(distance_at(bytes, 4, 0x33), -64);
}

TEST(ForgeStreams, TheFieldIsWhereTheEncodingHasIt) {
  for (const std::size_t field : {std::size_t{0}, std::size_t{5}, std::size_t{12}}) {
    code_generator code;
    label ahead;
    code.emit_jump(filled(0xEE), ahead, field);
    emit_filled(code, 0, 0x1000);
    code.mark(ahead);
    EXPECT_EQ(distance_at(code.get_code(), 0, 0xEE, field), 0x10010);
  }
}

TEST(ForgeStreams, FieldsOutsideTheInstructionAreRefused) {
  code_generator code;
  label somewhere;
  EXPECT_THROW(code.emit_jump(filled(0), somewhere, 13), invalid_operand_exception);
  EXPECT_THROW(code.emit_jump(filled(0), somewhere, SIZE_MAX), invalid_operand_exception);
  EXPECT_TRUE(code.get_code().empty());
}

TEST(ForgeStreams, ALabelHasOnePlace) {
  code_generator code;
  label place;
  code.mark(place);
  code.emit(filled(0));
  EXPECT_THROW(code.mark(place), multiple_label_exception);
  code.emit_jump(filled(0x44), place, distance_field);
  EXPECT_EQ(distance_at(code.get_code(), 1, 0x44), -16) << "it kept its first place";
}

TEST(ForgeStreams, DanglingLabelsAreRefusedUntilTheyArePlaced) {
  code_generator code;
  label unused;
  code.get_label_id(unused);  // never jumped to, hence no matter
  label ahead;
  code.emit_jump(filled(0x55), ahead, distance_field);
  EXPECT_THROW(code.get_code(), dangling_label_exception);
  code.mark(ahead);
  EXPECT_EQ(distance_at(code.get_code(), 0, 0x55), 16);
}

TEST(ForgeStreams, OpenStreamsAreRefused) {
  code_generator code;
  code.push_stream();
  EXPECT_THROW(code.get_code(), unfinished_stream_exception);
  label ahead;
  code.emit_jump(filled(0), ahead, distance_field);
  EXPECT_THROW(code.get_code(), unfinished_stream_exception) << "comes before a dangling label";
  code.pop_stream();
  EXPECT_TRUE(code.get_code().empty()) << "what was popped and not appended is gone";
  EXPECT_THROW(code.pop_stream(), invalid_object_exception);
}

TEST(ForgeStreams, OutOfLineCodeKeepsItsLabels) {
  code_generator code;
  label routine;
  label within;
  label end;
  code.emit(filled(0));
  code.emit_jump(filled(0x11), routine, distance_field);  // 1
  code.push_stream();
  code.mark(routine);
  code.emit(filled(0));
  code.mark(within);
  code.emit_jump(filled(0x22), end, distance_field);     // 1 of its stream
  code.emit_jump(filled(0x33), within, distance_field);  // 2 of its stream
  const code_stream closed = code.pop_stream();
  emit_filled(code, 0, 2);  // 2 and 3
  code.append(closed);      // 4 to 6
  code.mark(end);
  const byte_vector bytes = code.get_code();
  ASSERT_EQ(bytes.size(), 7U * 16);
  EXPECT_EQ(distance_at(bytes, 1, 0x11), 48);
  EXPECT_EQ(distance_at(bytes, 5, 0x22), 32);
  EXPECT_EQ(distance_at(bytes, 6, 0x33), -16);
}

TEST(ForgeStreams, StreamsNest) {
  code_generator code;
  label innermost;
  code.emit_jump(filled(0x11), innermost, distance_field);
  code.push_stream();
  code.emit(filled(0xA0));
  code.push_stream();
  code.emit(filled(0xB0));
  code.mark(innermost);
  code.emit(filled(0xB1));
  const code_stream inner = code.pop_stream();
  code.append(inner);
  const code_stream outer = code.pop_stream();
  code.append(outer);
  const byte_vector bytes = code.get_code();
  ASSERT_EQ(bytes.size(), 4U * 16);
  EXPECT_EQ(distance_at(bytes, 0, 0x11), 48);
  EXPECT_EQ(bytes[16], 0xA0);
  EXPECT_EQ(bytes[32], 0xB0);
  EXPECT_EQ(bytes[48], 0xB1);
}

TEST(ForgeStreams, LabelsOfAPoppedStreamHaveNoPlace) {
  code_generator code;
  label place;
  code.emit_jump(filled(0x66), place, distance_field);
  code.push_stream();
  code.mark(place);
  EXPECT_THROW(code.mark(place), multiple_label_exception) << "placed in a stream that is open";
  const code_stream closed = code.pop_stream();
  EXPECT_THROW(code.get_code(), dangling_label_exception);
  code.mark(place);
  EXPECT_EQ(distance_at(code.get_code(), 0, 0x66), 16);
  EXPECT_THROW(code.append(closed), multiple_label_exception) << "it would have two places";
  EXPECT_EQ(code.get_code().size(), 16U);
}

TEST(ForgeStreams, AStreamIsAppendedOnce) {
  code_generator code;
  label place;
  code.push_stream();
  code.mark(place);
  code.emit(filled(0));
  const code_stream closed = code.pop_stream();
  code.append(closed);
  EXPECT_THROW(code.append(closed), multiple_label_exception);
  EXPECT_EQ(code.get_code().size(), 16U);
  code.push_stream();
  code.emit(filled(0));
  const code_stream without_labels = code.pop_stream();
  code.append(without_labels);
  code.append(without_labels);
  EXPECT_EQ(code.get_code().size(), 48U);
}

TEST(ForgeStreams, ForeignLabelsAndStreamsAreRefused) {
  code_generator other;
  label foreign;
  other.push_stream();
  other.mark(foreign);
  const code_stream places_foreign = other.pop_stream();
  other.push_stream();
  other.emit_jump(filled(0), foreign, distance_field);
  const code_stream uses_foreign = other.pop_stream();
  code_generator code;
  EXPECT_THROW(code.mark(foreign), invalid_object_exception);
  EXPECT_THROW(code.get_label_id(foreign), invalid_object_exception);
  EXPECT_THROW(code.emit_jump(filled(0), foreign, distance_field), invalid_object_exception);
  EXPECT_THROW(code.append(places_foreign), invalid_object_exception);
  EXPECT_THROW(code.append(uses_foreign), invalid_object_exception);
  EXPECT_TRUE(code.get_code().empty());
}

}  // namespace
