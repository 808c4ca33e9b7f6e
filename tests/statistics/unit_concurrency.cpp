// SPDX-License-Identifier: Apache-2.0
// Threads with streams of their own, from the very first use of the library on.
#include <thread>

#include "support.hpp"

namespace {

TEST(concurrency, threads_with_their_own_streams_do_not_disturb_each_other) {
  constexpr int threads = 6;
  constexpr std::int64_t n = 300000;  // shared among threads in its turn
  tarn_serv_set_max_threads(3);
  std::vector<std::vector<float>> r(threads, std::vector<float>(n));
  std::vector<int> failed(threads);
  std::vector<std::thread> running;
  for (int t = 0; t < threads; ++t) {
    running.emplace_back([&, t] {
      rvx_stream stream = nullptr;
      const auto i = static_cast<std::size_t>(t);
      failed[i] += rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 5) != 0;
      failed[i] += rvxSkipAheadStream(stream, 3) != 0;
      failed[i] += rvxsRngUniform(0, stream, n, r[i].data(), 0, 1) != 0;
      failed[i] += rvxDeleteStream(&stream) != 0;
    });
  }
  for (std::thread& t : running)
    t.join();
  EXPECT_EQ(failed, std::vector<int>(threads));
  for (int t = 1; t < threads; ++t)
    EXPECT_EQ(r[static_cast<std::size_t>(t)], r[0]);
}

}  // namespace
