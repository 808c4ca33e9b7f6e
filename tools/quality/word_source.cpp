// SPDX-License-Identifier: Apache-2.0
// Streams of the statistics library, side by side.
#include "word_source.hpp"

#include <stdexcept>

#include "tarn_rvx.h"

namespace tarn::quality {

namespace {

void check(int status, const char* what) {
  if (status != RVX_STATUS_OK)
    throw std::runtime_error(std::string(what) + " failed with status " + std::to_string(status));
}

void delete_stream(void* handle) {
  rvxDeleteStream(&handle);
}

std::unique_ptr<void, void (*)(void*)> made(rvx_stream handle) {
  return {handle, delete_stream};
}

auto seeded(std::int64_t code, const std::vector<std::uint32_t>& words) {
  rvx_stream handle = nullptr;
  check(rvxNewStreamEx(&handle, code, static_cast<std::int64_t>(words.size()), words.data()),
        "making a stream");
  return made(handle);
}

auto copied(rvx_stream from) {
  rvx_stream handle = nullptr;
  check(rvxCopyStream(&handle, from), "copying a stream");
  return made(handle);
}

void skip(rvx_stream stream, const row& by) {
  if (by.high != 0) {
    const std::uint64_t digits[] = {by.low, by.high};
    check(rvxSkipAheadStreamEx(stream, 2, digits), "a long skip");
  } else {
    check(rvxSkipAheadStream(stream, static_cast<std::int64_t>(by.low)), "a skip");
  }
}

// Stream k of the row; `before` is stream k - 1, which has not been read.
auto stream_at(const row& wanted, std::uint32_t k, std::uint32_t seed, rvx_stream before) {
  constexpr auto count = static_cast<std::int64_t>(word_source::streams);
  switch (wanted.how) {
    case layout::family:
      return seeded(wanted.code + k, {seed});
    case layout::key:
      return seeded(wanted.code, {k, seed});
    case layout::seeds:
      return seeded(wanted.code, {static_cast<std::uint32_t>(count) * seed + k});
    case layout::leapfrog:
    case layout::stride: {
      auto stream = seeded(wanted.code, {seed});
      check(rvxLeapfrogStream(stream.get(), k, count), "a leapfrog");
      return stream;
    }
    default: {
      if (before == nullptr)
        return seeded(wanted.code, {seed});
      auto stream = copied(before);
      skip(stream.get(), wanted);
      return stream;
    }
  }
}

std::uint32_t upper_half(std::uint32_t word31) {
  return word31 >> 15;
}

}  // namespace

const std::vector<row>& rows() {
  struct engine {
    std::int64_t code;
    int word_bits;
  };
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  constexpr engine name{code, word_bits};                                                    \
  static_cast<void>(name);
#include "rng/engines/engines.def"
  static const std::vector<row> list = {
#define TARN_LAYOUT(engine, how, high, low, run) \
  {#engine, engine.code, engine.word_bits, #how, layout::how, high, low, #run},
#include "layouts.def"
  };
  return list;
}

word_source::word_source(const row& wanted, std::uint32_t seed) : word_bits_(wanted.word_bits) {
  const bool alone = wanted.how == layout::single || wanted.how == layout::stride;
  for (std::uint32_t k = 0; k < (alone ? 1 : streams); ++k)
    streams_.push_back(
        stream_at(wanted, k, seed, streams_.empty() ? nullptr : streams_.back().get()));
  raw_.resize(2 * chunk);
  words_.resize(chunk * streams_.size());
}

// `chunk` words, `streams_.size()` apart.
void word_source::draw(const stream& from, std::uint32_t* out) {
  const std::size_t apart = streams_.size();
  const bool pairs = word_bits_ == 31;
  check(rvxiRngUniformBits(0, from.get(), static_cast<std::int64_t>(pairs ? 2 * chunk : chunk),
                           raw_.data()),
        "drawing");
  for (std::size_t i = 0; i < chunk; ++i) {
    if (word_bits_ == 59)
      out[i * apart] = raw_[2 * i] >> 27 | raw_[2 * i + 1] << 5;
    else if (pairs)
      out[i * apart] = upper_half(raw_[2 * i]) | upper_half(raw_[2 * i + 1]) << 16;
    else
      out[i * apart] = raw_[i];
  }
}

const std::vector<std::uint32_t>& word_source::next() {
  for (std::size_t k = 0; k < streams_.size(); ++k)
    draw(streams_[k], words_.data() + k);
  return words_;
}

}  // namespace tarn::quality
