// SPDX-License-Identifier: Apache-2.0
// Calls that are not waited for when the system has no thread to wait for them, or no memory at any
// one place of the call: they are refused and nothing of them goes on, or they give their results
// and are told of.
#include <cerrno>
#include <dlfcn.h>
#include <map>
#include <pthread.h>
#include <thread>
#include <vector>

#include "completions.hpp"
#include "drawn.hpp"
#include "engines.hpp"
#include "tests/rng/failing_memory.hpp"

namespace {

thread_local bool threads_are_out = false;
thread_local int threads_refused = 0;

}  // namespace

/// In the place of the system's.
extern "C" __attribute__((visibility("default"))) int pthread_create(
    pthread_t* thread, const pthread_attr_t* attributes, void* (*body)(void*),
    void* argument) noexcept {
  using function = int (*)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
  static const auto next = reinterpret_cast<function>(::dlsym(RTLD_NEXT, "pthread_create"));
  if (threads_are_out) {
    ++threads_refused;
    return EAGAIN;
  }
  return next(thread, attributes, body, argument);
}

namespace {

using namespace tarn_test;

/// While it lives, this thread starts no other.
class no_threads {
 public:
  no_threads() {
    threads_refused = 0;
    threads_are_out = true;
  }
  no_threads(const no_threads&) = delete;
  no_threads& operator=(const no_threads&) = delete;
  ~no_threads() { threads_are_out = false; }
};

template <typename Engine>
class offload_scarcity : public testing::Test {
 protected:
  static constexpr std::int64_t n = 3000;
  static constexpr std::int64_t stored = offload_engine<Engine>::stored_words;

  offload_scarcity() {
    // Threads and records that the first call makes and keeps are not the ones to be missed.
    const gpu_interop waiting(common_queue());
    const caller_stream stream = offload_engine<Engine>::at(3);
    draw_wide(raw_words(stored), stream, n, waiting);
    interop_.set_nowait(true);
    interop_.set_completion(completions::note);
  }
  ~offload_scarcity() override {
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  int call(const caller_stream& stream, const results<std::uint32_t>& out) {
    return tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, n, out.get(), interop_.handle());
  }

  static constexpr std::size_t size = n * stored;
  gpu_interop interop_{common_queue()};
};
TYPED_TEST_SUITE(offload_scarcity, offload_engines, offload_engine_name);

TYPED_TEST(offload_scarcity, of_threads_has_the_caller_wait_and_tell) {
  using row = offload_engine<TypeParam>;
  const caller_stream stream = row::at(3);
  caller_stream serial(stream);
  const results<std::uint32_t> out(common_queue(), this->size);
  {
    const no_threads scope;
    ASSERT_EQ(this->call(stream, out), 0);
  }
  EXPECT_EQ(threads_refused, 1);
  ASSERT_EQ(completions::all().count(), 1u) << "when the entry returns";
  const auto told = completions::all().take(1);
  EXPECT_EQ(told[0].interop, this->interop_.handle());
  EXPECT_EQ(told[0].thread, std::this_thread::get_id());
  EXPECT_EQ(out.values(), serial.words(this->n, row::stored));
  EXPECT_EQ(stream.image(), serial.image());
  // The next one has its thread again.
  ASSERT_EQ(this->call(stream, out), 0);
  const auto next = completions::all().take(1);
  ASSERT_EQ(next.size(), 1u);
  EXPECT_NE(next[0].thread, std::this_thread::get_id());
  EXPECT_EQ(out.values(), serial.words(this->n, row::stored));
}

enum class fate { refused, served, not_hit };

/// A call whose allocation of that number fails, if it has so many.
template <typename Engine>
class call_without_memory {
  using row = offload_engine<Engine>;

 public:
  explicit call_without_memory(std::int64_t n) : expected_(after_.words(n, row::stored)) {}

  template <typename Call>
  fate of(int number, const Call& call) {
    const caller_stream stream(start_);
    const results<std::uint32_t> out(common_queue(), expected_.size());
    bool happened = false;
    int status = 77;
    {
      failing_memory memory(number, failing::one);
      status = call(stream, out);
      happened = memory.happened();
    }
    if (status == 0) {
      EXPECT_EQ(completions::all().take(1).size(), 1u);
      EXPECT_EQ(out.values(), expected_);
      EXPECT_EQ(stream.image(), after_.image());
      return happened ? fate::served : fate::not_hit;
    }
    EXPECT_TRUE(happened);
    EXPECT_LT(status, 0);
    const auto left = out.values();
    sycl::queue(common_queue()).wait();
    EXPECT_EQ(out.values(), left) << "a kernel ran on";
    EXPECT_EQ(completions::all().count(), 0u);
    return fate::refused;
  }

 private:
  caller_stream start_ = row::at(3);
  caller_stream after_{start_};
  std::vector<std::uint32_t> expected_;
};

// How many allocations are this thread's hangs on which thread runs the kernels, so a walk ends
// after some calls that none has failed in, and is made again until it has met those of the ending.
TYPED_TEST(offload_scarcity, of_memory_anywhere_refuses_the_call_or_leaves_it_whole) {
  call_without_memory<TypeParam> calls(this->n);
  std::map<fate, int> times;
  testing::internal::CaptureStderr();
  for (int walk = 0; walk < 50 && times[fate::served] < 2; ++walk) {
    for (int number = 1, not_hit = 0; not_hit < 10; ++number) {
      SCOPED_TRACE(number);
      const fate seen = calls.of(
          number, [this](const auto& stream, const auto& out) { return this->call(stream, out); });
      ++times[seen];
      not_hit += seen == fate::not_hit ? 1 : 0;
    }
  }
  testing::internal::GetCapturedStderr();
  EXPECT_GT(times[fate::refused], 3);
  EXPECT_GE(times[fate::served], 2) << "what the ending allocates is not missed";
}

}  // namespace
