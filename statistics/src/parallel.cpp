// SPDX-License-Identifier: Apache-2.0
// The one place that uses the thread pool of oneTBB.
#include "parallel.hpp"

#include <algorithm>

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>
#include <tbb/partitioner.h>
#include <tbb/task_arena.h>

#if TARN_THREAD_SANITIZER
#include <sanitizer/tsan_interface.h>
#endif

namespace tarn::statistics {

namespace {

// Tells the thread sanitizer what the pool guarantees: all before publish(x) happens before all
// behind a later observe(x). The pool's library is not instrumented, so this file, which holds the
// pool's templates, is not either (see CMakeLists.txt); the work that it hands on is.
#if TARN_THREAD_SANITIZER
void publish(void* x) {
  __tsan_release(x);
}
void observe(void* x) {
  __tsan_acquire(x);
}
#else
void publish(void*) {}
void observe(void*) {}
#endif

}  // namespace

void for_pieces(std::size_t n, std::size_t piece, int threads,
                const std::function<void(std::size_t first, std::size_t count)>& body) {
  char started = 0, finished = 0;
  publish(&started);
  // More threads than processors gain nothing, and the pool would say so on standard error.
  tbb::task_arena arena(std::min(threads, tbb::this_task_arena::max_concurrency()));
  arena.execute([&] {
    tbb::parallel_for(tbb::blocked_range<std::size_t>(0, (n + piece - 1) / piece, 1),
                      [&](const tbb::blocked_range<std::size_t>& pieces) {
                        observe(&started);
                        for (std::size_t i = pieces.begin(); i != pieces.end(); ++i)
                          body(i * piece, std::min(piece, n - i * piece));
                        publish(&finished);
                      });
  });
  observe(&finished);
}

}  // namespace tarn::statistics
