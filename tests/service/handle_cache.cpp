// SPDX-License-Identifier: Apache-2.0
// The cache of objects by handle: who comes first stays, and what comes late goes when the lock has
// been given up.
#include "handle_cache.hpp"

#include <cstdint>
#include <cstring>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace {

using kestrel::tarn::gpu::fnv1a;
using kestrel::tarn::gpu::handle_cache;
using kestrel::tarn::gpu::handle_hash;

void* handle(std::uintptr_t number) {
  return reinterpret_cast<void*>(number);
}

std::uint64_t hash_of(const std::string& text) {
  return fnv1a(text.data(), text.size());
}

// The values that the authors publish for these texts.
TEST(handle_cache, hashes_as_published) {
  EXPECT_EQ(hash_of(""), 0xcbf29ce484222325u);
  EXPECT_EQ(hash_of("a"), 0xaf63dc4c8601ec8cu);
  EXPECT_EQ(hash_of("foobar"), 0x85944171f73967e8u);
}

TEST(handle_cache, hashes_the_eight_bytes_of_the_handle) {
  const std::string text = "eight by";
  void* key = nullptr;
  static_assert(sizeof key == 8);
  std::memcpy(&key, text.data(), sizeof key);
  EXPECT_EQ(handle_hash()(key), hash_of(text));
}

TEST(handle_cache, finds_nothing_before_and_the_same_object_after) {
  handle_cache<int> cache;
  EXPECT_EQ(cache.find(handle(1)), nullptr);
  int* const kept = cache.insert(handle(1), 10);
  ASSERT_NE(kept, nullptr);
  EXPECT_EQ(*kept, 10);
  EXPECT_EQ(cache.find(handle(1)), kept);
  EXPECT_EQ(cache.find(handle(2)), nullptr);
}

TEST(handle_cache, the_first_object_stays) {
  handle_cache<int> cache;
  int* const first = cache.insert(handle(1), 10);
  EXPECT_EQ(cache.insert(handle(1), 20), first);
  EXPECT_EQ(*first, 10);
}

TEST(handle_cache, objects_stay_where_they_are_when_it_grows) {
  handle_cache<std::uintptr_t> cache;
  std::vector<std::uintptr_t*> places;
  for (std::uintptr_t i = 0; i < 1000; ++i) {
    places.push_back(cache.insert(handle(8 * i), i));
  }
  for (std::uintptr_t i = 0; i < 1000; ++i) {
    ASSERT_EQ(cache.find(handle(8 * i)), places[i]);
    EXPECT_EQ(*places[i], i);
  }
}

// What destroys itself by asking the cache would wait for ever if the cache still held its lock.
struct asks_when_it_goes {
  handle_cache<asks_when_it_goes>* cache;
  bool* asked;

  asks_when_it_goes(handle_cache<asks_when_it_goes>* c, bool* a) : cache(c), asked(a) {}
  asks_when_it_goes(asks_when_it_goes&& other) noexcept : cache(other.cache), asked(other.asked) {
    other.asked = nullptr;
  }
  asks_when_it_goes& operator=(asks_when_it_goes&&) = delete;
  ~asks_when_it_goes() {
    if (asked != nullptr) {
      *asked = cache->find(handle(1)) != nullptr;
    }
  }
};

TEST(handle_cache, a_late_object_goes_after_the_lock) {
  bool first_gone = false;
  bool second_gone = false;
  handle_cache<asks_when_it_goes> cache;
  cache.insert(handle(1), asks_when_it_goes(&cache, &first_gone))->asked = nullptr;
  cache.insert(handle(1), asks_when_it_goes(&cache, &second_gone));
  EXPECT_TRUE(second_gone);
  EXPECT_FALSE(first_gone);
}

TEST(handle_cache, threads_agree_on_one_object_for_each_handle) {
  constexpr std::uintptr_t handles = 64;
  constexpr int threads = 16;
  handle_cache<int> cache;
  std::vector<std::vector<int*>> seen(threads);
  std::vector<std::thread> team;
  for (int t = 0; t < threads; ++t) {
    team.emplace_back([&, t] {
      for (std::uintptr_t i = 0; i < handles; ++i) {
        int* known = cache.find(handle(i));
        seen[static_cast<std::size_t>(t)].push_back(known != nullptr ? known
                                                                     : cache.insert(handle(i), t));
      }
    });
  }
  for (std::thread& member : team) {
    member.join();
  }
  for (const std::vector<int*>& of_thread : seen) {
    EXPECT_EQ(of_thread, seen[0]);
  }
  EXPECT_EQ(std::set<int*>(seen[0].begin(), seen[0].end()).size(), handles);
}

}  // namespace
