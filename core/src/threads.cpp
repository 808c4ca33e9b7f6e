// SPDX-License-Identifier: Apache-2.0
// How many host threads one call may use.
#include <algorithm>
#include <atomic>
#include <cstring>
#include <sched.h>

#include "settings.hpp"
#include "tarn_serv.h"

namespace {

using namespace tarn::core;

// The CPUs that this process may run on. The mask has room for 16,384: a mask smaller than the
// kernel's own makes the call fail, and then one CPU is the safe answer.
int available_cpus() {
  cpu_set_t cpus[16];
  std::memset(cpus, 0, sizeof cpus);
  const bool known = ::sched_getaffinity(0, sizeof cpus, cpus) == 0;
  return known ? std::max(CPU_COUNT_S(sizeof cpus, cpus), 1) : 1;
}

std::atomic<int>& max_threads() {
  static std::atomic<int> threads = [] {
    const int asked = read(settings::num_threads);
    return asked > 0 ? asked : available_cpus();
  }();
  return threads;
}

}  // namespace

int tarn_serv_get_dynamic(void) {
  static const int dynamic = read(settings::dynamic);
  return dynamic;
}

int tarn_serv_get_max_threads(void) {
  return max_threads().load(std::memory_order_relaxed);
}

void tarn_serv_set_max_threads(int threads) {
  if (threads < 1) {
    const int position = 1;
    tarn_serv_xerbla(__func__, &position, static_cast<int>(std::strlen(__func__)));
    return;
  }
  max_threads().store(threads, std::memory_order_relaxed);
}
