// SPDX-License-Identifier: Apache-2.0
// Locks on plain 32-bit words. The words live in records of other libraries, some written in C,
// so that they cannot be std::atomic objects; the compiler's atomic operations work on them.
#include <algorithm>
#include <time.h>

#include "tarn_serv.h"

namespace {

static_assert(sizeof(int) == 4, "a lock is a 32-bit word");

constexpr int free_word = 0;
constexpr int taken_word = 1;

// Critical sections here last a few hundred nanoseconds, or milliseconds when a driver is asked.
// The first kind is met by spinning; for the second a waiter sleeps for doubling periods.
constexpr int spins_before_sleep = 256;
constexpr long first_sleep_ns = 2'000;
constexpr long longest_sleep_ns = 1'000'000;

void pause_a_little() {
#if defined(__x86_64__) || defined(__i386__)
  __builtin_ia32_pause();
#elif defined(__aarch64__)
  asm volatile("yield");
#endif
}

bool try_lock(int* word) {
  return __atomic_load_n(word, __ATOMIC_RELAXED) == free_word &&
         __atomic_exchange_n(word, taken_word, __ATOMIC_ACQUIRE) == free_word;
}

}  // namespace

void tarn_serv_lock(int* word) {
  for (int spin = 0; spin < spins_before_sleep; ++spin) {
    if (try_lock(word)) {
      return;
    }
    pause_a_little();
  }
  long sleep_ns = first_sleep_ns;
  while (!try_lock(word)) {
    const timespec period{0, sleep_ns};
    ::nanosleep(&period, nullptr);
    sleep_ns = std::min(2 * sleep_ns, longest_sleep_ns);
  }
}

void tarn_serv_unlock(int* word) {
  __atomic_store_n(word, free_word, __ATOMIC_RELEASE);
}
