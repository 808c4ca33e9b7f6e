// SPDX-License-Identifier: Apache-2.0
// The count of announced pieces of work, and the wait for them.
#include "background.hpp"

#include <condition_variable>
#include <cstdlib>
#include <mutex>
#include <pthread.h>

namespace kestrel::tarn::rng::detail::openmp {
namespace {

struct register_of_work {
  std::mutex mutex;
  std::condition_variable fewer;
  int announced = 0;
  bool over = false;  // the process has done its waiting
};

// Never destroyed: the last of the work may be on its way out of a lock when the process ends.
register_of_work& work() {
  static auto* const all = new register_of_work;
  return *all;
}

thread_local int own_work = 0;  // pieces that this thread carries out

void wait_for_all() {
  std::unique_lock<std::mutex> lock(work().mutex);
  work().fewer.wait(lock, [] { return work().announced <= own_work; });
  work().over = true;
}

// At the first announcement: the wait comes before the end of the SYCL runtime and of the drivers,
// which have been called by then. Static objects made later are gone when it begins.
bool watch_the_process() {
  pthread_atfork([] { work().mutex.lock(); }, [] { work().mutex.unlock(); },
                 [] {
                   work().announced = own_work;
                   work().mutex.unlock();
                 });
  return std::atexit(wait_for_all) == 0;
}

}  // namespace

bool announce_background_work() {
  static const bool watched = watch_the_process();
  const std::lock_guard<std::mutex> lock(work().mutex);
  if (!watched || work().over) {
    return false;
  }
  ++work().announced;
  return true;
}

void withdraw_background_work() {
  const std::lock_guard<std::mutex> lock(work().mutex);
  --work().announced;
  work().fewer.notify_all();
}

background_work::background_work() {
  ++own_work;
}

background_work::~background_work() {
  --own_work;
  withdraw_background_work();
}

}  // namespace kestrel::tarn::rng::detail::openmp
