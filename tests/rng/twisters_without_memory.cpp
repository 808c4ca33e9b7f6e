// SPDX-License-Identifier: Apache-2.0
// The twisters on a GPU queue when an array of their state cannot be allocated: device_bad_alloc in
// the name of the engine, nothing kept, and what was there before stays.
#include <cerrno>
#include <cstdlib>
#include <dlfcn.h>
#include <string>
#include <tarn_serv.h>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

thread_local int left = 0;          // arrays until the failing one; 0: none fails
thread_local bool watched = false;  // whether allocations are arrays: not those of streams
thread_local std::vector<void*> made;

template <typename Function>
Function* next_of(const char* name, Function*) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

// The function that the runtime takes shared memory from, put before that of the C library.
[[gnu::visibility("default")]] int posix_memalign(void** pointer, std::size_t alignment,
                                                  std::size_t bytes) noexcept {
  static const auto next = next_of("posix_memalign", &posix_memalign);
  if (!watched) {
    return next(pointer, alignment, bytes);
  }
  if (left != 0 && --left == 0) {
    return ENOMEM;
  }
  const int status = next(pointer, alignment, bytes);
  if (status == 0) {
    made.push_back(*pointer);
  }
  return status;
}

// Streams take their memory here, by the same function.
void* tarn_serv_malloc(size_t size, size_t alignment) {
  static const auto next = next_of("tarn_serv_malloc", &tarn_serv_malloc);
  const bool before = std::exchange(watched, false);
  void* const block = next(size, alignment);
  watched = before;
  return block;
}

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using tarn_test::draw;
using tarn_test::gpu_queue;
using tarn_test::message_of;

/// What `call` raises when the `number`-th array fails; how many arrays it made before.
struct attempt {
  template <typename Call>
  attempt(int number, const Call& call) {
    made.clear();
    watched = true;
    left = number;
    message = message_of<tarn::device_bad_alloc>(call);
    failed = left == 0;
    left = 0;
    watched = false;
  }
  std::string message;
  bool failed;
};

/// Each array of what `call` makes fails in turn; how many there are.
template <typename Call, typename Check>
int arrays_of(const std::string& engine, const Call& call, const Check& check) {
  const sycl::queue queue = gpu_queue();
  for (int number = 1;; ++number) {
    const attempt tried(number, call);
    if (!tried.failed) {
      EXPECT_EQ(tried.message, "[nothing raised]");
      return number - 1;
    }
    EXPECT_EQ(tried.message, "kestrel::tarn::rng::" + engine + ": cannot allocate memory on " +
                                 queue.get_device().get_info<sycl::info::device::name>());
    EXPECT_EQ(static_cast<int>(made.size()), number - 1);
    for (void* const array : made) {
      EXPECT_EQ(sycl::get_pointer_type(array, queue.get_context()), sycl::usm::alloc::unknown);
    }
    check();
  }
}

template <typename Engine>
void expect_refusals(const std::string& name, int arrays) {
  const sycl::queue queue = gpu_queue();
  const auto nothing = [] {};
  EXPECT_EQ(arrays_of(
                name, [&] { Engine(queue, 7); }, nothing),
            arrays);
  EXPECT_EQ(arrays_of(
                name,
                [&] {
                  Engine(queue, {7, 8});
                },
                nothing),
            arrays);

  Engine source(queue, 7);
  draw(rng::bits<>(), source, 100);
  EXPECT_EQ(arrays_of(
                name, [&] { Engine copy(source); }, nothing),
            arrays);

  Engine assigned(queue, 9), same(queue, 9);
  EXPECT_EQ(arrays_of(
                name, [&] { assigned = source; },
                [&] { ASSERT_EQ(draw(rng::bits<>(), assigned, 9), draw(rng::bits<>(), same, 9)); }),
            arrays);
  EXPECT_EQ(draw(rng::bits<>(), assigned, 300), draw(rng::bits<>(), source, 300));
}

TEST(without_memory, mt19937_is_refused) {
  expect_refusals<rng::mt19937>("mt19937", 1);
  rng::mt19937 engine(gpu_queue(), 7);
  const auto saved = tarn_test::image_of(engine);
  EXPECT_EQ(
      arrays_of(
          "mt19937", [&] { rng::load_state<rng::mt19937>(gpu_queue(), saved.data()); }, [] {}),
      1);
}

TEST(without_memory, mt2203_is_refused) {
  expect_refusals<rng::mt2203>("mt2203", 4);
  rng::mt2203 engine(gpu_queue(), 7, 8);
  const auto saved = tarn_test::image_of(engine);
  EXPECT_EQ(arrays_of(
                "mt2203", [&] { rng::load_state<rng::mt2203>(gpu_queue(), saved.data()); }, [] {}),
            4);
  EXPECT_EQ(arrays_of(
                "mt2203", [&] { rng::mt2203(gpu_queue(), 7, 8); }, [] {}),
            4);
}

}  // namespace
