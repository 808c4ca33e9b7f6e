// SPDX-License-Identifier: Apache-2.0
// Many threads call at a time, each with a stream of its own, and their first calls are the first
// of the process: results and streams are those of one thread after the other.
#include <memory>
#include <thread>
#include <vector>

#include "completions.hpp"
#include "drawn.hpp"
#include "engines.hpp"

namespace {

using namespace tarn_test;

struct transcript {
  std::vector<std::uint32_t> words;
  std::vector<double> reals;
  std::vector<std::uint8_t> image;

  template <typename T>
  static void add(std::vector<T>& all, const std::vector<T>& more) {
    all.insert(all.end(), more.begin(), more.end());
  }
};
bool operator==(const transcript& x, const transcript& y) {
  return x.words == y.words && x.reals == y.reals && x.image == y.image;
}

/// One thread's work: calls on the device and on the host in turns.
template <typename Engine>
transcript work(std::uint32_t seed) {
  using row = offload_engine<Engine>;
  constexpr std::int64_t n = 3001;
  caller_stream stream = row::at(seed, seed);
  const gpu_interop interop(common_queue());
  transcript all;
  for (int round = 0; round < 4; ++round) {
    transcript::add(all.words, draw_wide(raw_words(row::stored_words), stream, n, interop));
    transcript::add(all.words, stream.words(7, row::stored));
    const rng::gamma<double> law(2.5, 0, 1);
    transcript::add(all.reals,
                    draw_wide(drawing_of<offload::vdGamma>(0, taken::by_rejection, law, 2.5, 0, 1),
                              stream, 500, interop));
  }
  all.image = stream.image();
  return all;
}

constexpr std::size_t team_size = 16;

/// Each engine more than once.
transcript work_of(std::size_t number) {
  constexpr transcript (*works[])(std::uint32_t) = {
      work<rng::mt2203>, work<rng::mcg31m1>, work<rng::mrg32k3a>,     work<rng::mcg59>,
      work<rng::sobol>,  work<rng::mt19937>, work<rng::philox4x32x10>};
  return works[number % std::size(works)](static_cast<std::uint32_t>(number + 1));
}

TEST(offload_threads, have_the_results_of_one_thread) {
  std::vector<transcript> together(team_size);
  std::vector<std::thread> team;
  for (std::size_t i = 0; i < team_size; ++i) {
    team.emplace_back([&mine = together[i], i] { mine = work_of(i); });
  }
  for (std::thread& member : team) {
    member.join();
  }
  for (std::size_t i = 0; i < team_size; ++i) {
    EXPECT_EQ(together[i].words.size() % (4 * (3001 + 7)), 0u);
    EXPECT_TRUE(together[i] == work_of(i)) << "thread " << i;
  }
  EXPECT_EQ(omptarget::mistakes(), 0);
}

TEST(offload_threads, need_not_wait_for_their_calls) {
  constexpr std::int64_t n = 5000;
  std::vector<std::vector<std::uint32_t>> together(team_size);
  // All there at the same time, so that none has the handle of one that has gone.
  std::vector<std::unique_ptr<gpu_interop>> interops;
  for (std::size_t i = 0; i < team_size; ++i) {
    interops.push_back(std::make_unique<gpu_interop>(common_queue()));
    interops.back()->set_nowait(true);
    interops.back()->set_completion(completions::note);
  }
  std::vector<std::thread> team;
  for (std::size_t i = 0; i < team_size; ++i) {
    team.emplace_back([&mine = together[i], &interop = *interops[i], i] {
      const caller_stream stream(RVX_BRNG_PHILOX4X32X10, {static_cast<std::uint32_t>(i)});
      const results<std::uint32_t> out(common_queue(), 3 * n);
      for (std::int64_t call = 0; call < 3; ++call) {
        EXPECT_EQ(tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, n, out.get() + call * n,
                                                              interop.handle()),
                  0);
      }
      completions::all().wait_for(interop.handle(), 3);
      mine = out.values();
    });
  }
  for (std::thread& member : team) {
    member.join();
  }
  for (std::size_t i = 0; i < team_size; ++i) {
    caller_stream serial(RVX_BRNG_PHILOX4X32X10, {static_cast<std::uint32_t>(i)});
    EXPECT_EQ(together[i], serial.words(3 * n)) << "thread " << i;
  }
  EXPECT_EQ(completions::all().count(), 3 * team_size);
  EXPECT_EQ(omptarget::mistakes(), 0);
}

}  // namespace
