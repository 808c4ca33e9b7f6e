// SPDX-License-Identifier: Apache-2.0
// The plot of the README: uniform and gaussian doubles from philox4x32x10, on one thread and on
// two, beside what most programs use today. By the clock, which is what a second thread shortens.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "distribution_peers.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

constexpr std::int64_t count = 1'000'000;  // 8 MB: neither in the first caches nor bound by memory

rvx_stream stream = nullptr;

void check(int status) {
  if (status != 0) {
    std::fprintf(stderr, "a routine failed with status %d\n", status);
    std::exit(1);
  }
}

// draw(values) writes `count` of them, into memory that was touched before. One thread is measured
// by its processor time, which other work on the machine disturbs least.
void add(const std::string& name, int threads, const std::function<void(double*)>& draw) {
  auto* added =
      benchmark::RegisterBenchmark(name.c_str(), [threads, draw](benchmark::State& state) {
        tarn_serv_set_max_threads(threads);
        std::vector<double> values(static_cast<std::size_t>(count));
        draw(values.data());
        for (auto _ : state) {
          draw(values.data());
          benchmark::ClobberMemory();
        }
        state.SetItemsProcessed(state.iterations() * count);
      });
  added->MinTime(0.1)->Repetitions(9)->ReportAggregatesOnly()->Unit(benchmark::kMillisecond);
  if (threads > 1)
    added->UseRealTime();
}

void uniform(double* values) {
  check(rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, values, 0, 1));
}
void gaussian(double* values) {
  check(rvxdRngGaussian(RVX_RNG_METHOD_GAUSSIAN_ICDF, stream, count, values, 0, 1));
}

// Of one distribution.
quotient over_peers(const std::string& what) {
  return {what + "/tarn", {what + "/std", what + "/gsl", what + "/boost"}};
}

}  // namespace

int main(int argc, char** argv) {
  if (!initialize(argc, argv))
    return 1;
  check(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1));
  add("uniform/tarn", 1, uniform);
  add("uniform/tarn, 2 threads", 2, uniform);
  add("gaussian/tarn", 1, gaussian);
  add("gaussian/tarn, 2 threads", 2, gaussian);
  for (const peers::peer<peers::fill_doubles>& peer : peers::speed_peers)
    add(peer.name, 1, [peer](double* values) { peer.fill(count, values); });
  announce_quotients("peers", {over_peers("uniform"), over_peers("gaussian")});
  benchmark::RunSpecifiedBenchmarks();
  check(rvxDeleteStream(&stream));
  return 0;
}
