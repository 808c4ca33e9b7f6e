// SPDX-License-Identifier: Apache-2.0
// Streams, labels and fix-ups.
#include "code_stream.hpp"

#include <stdexcept>
#include <utility>

#include "exceptions.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr std::uint32_t not_placed = 0xFFFFFFFF;
constexpr std::size_t largest_code = 0x7FFFFFFF;
constexpr std::size_t distance_bytes = 4;

void require_room(std::size_t used, std::size_t more) {
  if (more > largest_code - used) {
    throw std::length_error("code of 2 GiB or more");
  }
}

void store_distance(std::uint8_t* field, std::uint32_t distance) {
  for (std::size_t i = 0; i < distance_bytes; ++i) {
    field[i] = static_cast<std::uint8_t>(distance >> 8 * i);
  }
}

}  // namespace

code_generator::code_generator() : streams_(1) {}

void code_generator::emit(const instruction& encoded) {
  byte_vector& bytes = current().bytes_;
  require_room(bytes.size(), encoded.size());
  bytes.insert(bytes.end(), encoded.begin(), encoded.end());
}

void code_generator::emit_jump(const instruction& encoded, label& target, std::size_t field) {
  if (field > encoded.size() - distance_bytes) {
    throw invalid_operand_exception();
  }
  const std::uint32_t id = get_label_id(target);
  const std::size_t jump = current().bytes_.size();
  emit(encoded);
  current().uses_.push_back({jump, field, id});
}

void code_generator::mark(label& place) {
  const std::uint32_t id = get_label_id(place);
  if (positions_[id] != not_placed) {
    throw multiple_label_exception();
  }
  const auto offset = static_cast<std::uint32_t>(current().bytes_.size());
  current().places_.push_back({id, offset});
  positions_[id] = offset;
}

std::uint32_t code_generator::get_label_id(label& named) {
  if (named.id_ == label::without_id) {
    const auto id = static_cast<std::uint32_t>(positions_.size());
    positions_.push_back(not_placed);
    named.id_ = id;
  }
  require_known(named.id_);
  return named.id_;
}

void code_generator::push_stream() {
  streams_.emplace_back();
}

code_stream code_generator::pop_stream() {
  if (streams_.size() == 1) {
    throw invalid_object_exception();
  }
  code_stream closed = std::move(current());
  streams_.pop_back();
  for (const code_stream::label_place& place : closed.places_) {
    positions_[place.id] = not_placed;
  }
  return closed;
}

void code_generator::append(const code_stream& closed) {
  const std::size_t start = current().bytes_.size();
  require_room(start, closed.bytes_.size());
  for (const code_stream::label_use& use : closed.uses_) {
    require_known(use.id);
  }
  for (const code_stream::label_place& place : closed.places_) {
    require_known(place.id);
    if (positions_[place.id] != not_placed) {
      throw multiple_label_exception();
    }
  }
  code_stream& stream = current();
  stream.bytes_.insert(stream.bytes_.end(), closed.bytes_.begin(), closed.bytes_.end());
  for (const code_stream::label_use& use : closed.uses_) {
    stream.uses_.push_back({start + use.jump, use.field, use.id});
  }
  for (const code_stream::label_place& place : closed.places_) {
    const std::uint32_t offset = static_cast<std::uint32_t>(start) + place.offset;
    stream.places_.push_back({place.id, offset});
    positions_[place.id] = offset;
  }
}

byte_vector code_generator::get_code() const {
  if (streams_.size() > 1) {
    throw unfinished_stream_exception();
  }
  const code_stream& stream = streams_.front();
  byte_vector code = stream.bytes_;
  for (const code_stream::label_use& use : stream.uses_) {
    if (positions_[use.id] == not_placed) {
      throw dangling_label_exception();
    }
    // Wraps as two's complement does, which is how a negative distance is stored.
    store_distance(code.data() + use.jump + use.field,
                   positions_[use.id] - static_cast<std::uint32_t>(use.jump));
  }
  return code;
}

void code_generator::require_known(std::uint32_t id) const {
  if (id >= positions_.size()) {
    throw invalid_object_exception();
  }
}

}  // namespace kestrel::tarn::forge
