// SPDX-License-Identifier: Apache-2.0
// Statuses of the stream images turned into exceptions.
#include "frame/state.hpp"

#include <cstring>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail {
namespace {

void require(int status, const char* function, const char* text) {
  if (status != 0) {
    throw computation_error("rng", function, text);
  }
}

/// Deletes the placeholder and hands out an empty handle to load into.
void delete_placeholder(owned_stream& stream) {
  rvx_stream placeholder = stream.release();
  if (placeholder != nullptr) {
    require(rvxDeleteStream(&placeholder), "load_state", "failed while creating new engine");
  }
}

/// The engine's number in a stream's code; the bits below it pick a member of a set.
bool same_engine(rvx_stream stream, std::int64_t code) {
  std::uint32_t stored;
  std::memcpy(&stored, stream, sizeof stored);
  return stored >> 20 == static_cast<std::uint32_t>(code) >> 20;
}

void take_loaded(owned_stream& stream, rvx_stream loaded, int status, std::int64_t code,
                 const char* text) {
  require(status, "load_state", text);
  stream.reset(loaded);
  if (!same_engine(loaded, code)) {
    throw computation_error("rng", "load_state", text);
  }
}

}  // namespace

std::int64_t stream_size(rvx_stream stream) {
  const std::int64_t size = rvxGetStreamSize(stream);
  if (size <= 0) {
    throw computation_error("rng", "get_state_size", "failed to get state size");
  }
  return size;
}

void save_stream(rvx_stream stream, std::uint8_t* mem) {
  require(rvxSaveStreamM(stream, mem), "save_state", "failed to save state to the memory");
}

void save_stream(rvx_stream stream, const std::string& filename) {
  require(rvxSaveStreamF(stream, filename.c_str(), -1), "save_state",
          "failed to save state to the file");
}

void load_stream(owned_stream& stream, std::int64_t code, const std::uint8_t* mem) {
  delete_placeholder(stream);
  rvx_stream loaded = nullptr;
  const int status = rvxLoadStreamM(&loaded, mem);
  take_loaded(stream, loaded, status, code, "failed to load state from the memory");
}

void load_stream(owned_stream& stream, std::int64_t code, const std::string& filename) {
  delete_placeholder(stream);
  rvx_stream loaded = nullptr;
  const int status = rvxLoadStreamF(&loaded, filename.c_str(), -1);
  take_loaded(stream, loaded, status, code, "failed to load state from the file");
}

}  // namespace kestrel::tarn::rng::detail
