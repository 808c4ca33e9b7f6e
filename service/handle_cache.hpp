// SPDX-License-Identifier: Apache-2.0
// Objects by native handle, each made once and kept until the cache goes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <mutex>
#include <shared_mutex>
#include <unordered_map>
#include <utility>

#include "rw_word.hpp"

namespace kestrel::tarn::gpu {

/// The hash FNV-1a of 64 bits (Fowler, Noll and Vo).
inline std::uint64_t fnv1a(const void* bytes, std::size_t size) {
  std::uint64_t hash = 0xcbf29ce484222325u;
  for (std::size_t i = 0; i < size; ++i) {
    hash = (hash ^ static_cast<const unsigned char*>(bytes)[i]) * 0x100000001b3u;
  }
  return hash;
}

struct handle_hash {
  std::size_t operator()(const void* handle) const { return fnv1a(&handle, sizeof handle); }
};

/// Any thread may call. Addresses of objects stay valid until the cache goes.
template <class Object>
class handle_cache {
 public:
  /// Null when there is none yet.
  Object* find(void* handle) {
    const std::shared_lock<rw_word> reading(word_);
    const auto found = objects_.find(handle);
    return found == objects_.end() ? nullptr : &found->second;
  }

  /// The object of the handle from now on: the one that was there first. Another one goes when the
  /// lock has been given up.
  Object* insert(void* handle, Object made) {
    const std::lock_guard<rw_word> writing(word_);
    return &objects_.try_emplace(handle, std::move(made)).first->second;
  }

 private:
  rw_word word_;
  std::unordered_map<void*, Object, handle_hash> objects_{
      8};  // buckets at least, of one object on average
};

}  // namespace kestrel::tarn::gpu
