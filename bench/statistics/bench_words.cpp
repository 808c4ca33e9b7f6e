// SPDX-License-Identifier: Apache-2.0
// Words and uniforms of philox4x32x10 from the host statistics library, beside its peers and the
// rate of memset, in one run.
#include <cstdio>
#include <cstring>
#include <functional>
#include <thread>
#include <vector>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "peers.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

constexpr std::size_t medium = 4'000'000;   // values: 16 MB of floats
constexpr std::size_t large = 100'000'000;  // values: far above every cache
constexpr int repetitions = 9;

// One benchmark: fill(n, out) writes n values; the array is touched before. Large arrays, which
// threads share, are measured by the clock; the others by the processor time of the thread, which
// other work on the machine disturbs least.
template <class Value>
void add(const std::string& name, std::size_t n,
         const std::function<void(std::size_t, Value*)>& fill) {
  auto* added = benchmark::RegisterBenchmark(name.c_str(), [n, fill](benchmark::State& state) {
    std::vector<Value> out(n);
    fill(n, out.data());
    for (auto _ : state) {
      fill(n, out.data());
      benchmark::ClobberMemory();
    }
    const auto values = state.iterations() * static_cast<std::int64_t>(n);
    state.SetItemsProcessed(values);
    state.SetBytesProcessed(values * static_cast<std::int64_t>(sizeof(Value)));
  });
  added->MinTime(0.1)
      ->Repetitions(repetitions)
      ->ReportAggregatesOnly()
      ->Unit(benchmark::kMillisecond);
  if (n == large)
    added->UseRealTime();
}

void check(int status) {
  if (status != 0) {
    std::fprintf(stderr, "a routine failed with status %d\n", status);
    std::exit(1);
  }
}

void add_rvx(rvx_stream stream, std::size_t n, int threads, const std::string& suffix) {
  const auto count = static_cast<std::int64_t>(n);
  add<std::uint32_t>("rvx/words" + suffix, n, [=](std::size_t, std::uint32_t* out) {
    tarn_serv_set_max_threads(threads);
    check(rvxiRngUniformBits(0, stream, count, out));
  });
  add<float>("rvx/float" + suffix, n, [=](std::size_t, float* out) {
    tarn_serv_set_max_threads(threads);
    check(rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, out, 0, 1));
  });
  add<double>("rvx/double" + suffix, n, [=](std::size_t, double* out) {
    tarn_serv_set_max_threads(threads);
    check(rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, count, out, 0, 1));
  });
}

// memset of as many bytes as the floats of the same call, shared out evenly.
void add_memset(std::size_t n, int threads, const std::string& suffix) {
  add<float>("memset" + suffix, n, [threads](std::size_t count, float* out) {
    const std::size_t share = count / static_cast<std::size_t>(threads);
    std::vector<std::thread> others;
    for (int t = 1; t < threads; ++t)
      others.emplace_back(
          [=] { std::memset(out + static_cast<std::size_t>(t) * share, 1, share * sizeof *out); });
    std::memset(out, 1, share * sizeof *out);
    for (std::thread& other : others)
      other.join();
  });
}

void add_peers() {
  add<std::uint32_t>("random123/words", medium,
                     [](std::size_t n, std::uint32_t* out) { peers::random123_words(1, n, out); });
  add<float>("random123/float", medium,
             [](std::size_t n, float* out) { peers::random123_floats(1, n, out); });
  add<double>("random123/double", medium,
              [](std::size_t n, double* out) { peers::random123_doubles(1, n, out); });
  add<std::uint32_t>("std_mt19937/words", medium, peers::std_words);
  add<float>("std_mt19937/float", medium, peers::std_floats);
  add<double>("std_mt19937/double", medium, peers::std_doubles);
#if TARN_BENCH_BOOST
  add<std::uint32_t>("boost_mt19937/words", medium, peers::boost_words);
  add<float>("boost_mt19937/float", medium, peers::boost_floats);
  add<double>("boost_mt19937/double", medium, peers::boost_doubles);
#endif
}

void announce_tables() {
  std::vector<quotient> peers, threads, memory;
  for (const std::string kind : {"words", "float", "double"}) {
    const std::string here = "rvx/" + kind, shared_out = here + "/large/";
    const bool floats = kind == "float";
    peers.push_back({here, {"random123/" + kind}, floats ? 2.0 : 0});
    peers.push_back({here, {"std_mt19937/" + kind}, floats ? 6.0 : 0});
    peers.push_back({here, {"boost_mt19937/" + kind}});
    // Floats are bound by arithmetic and have to scale; words and doubles meet the memory first.
    threads.push_back({shared_out + "2threads",
                       {shared_out + "1thread"},
                       floats ? 1.8 : 0,
                       "memset/large/2threads"});
    memory.push_back({shared_out + "1thread", {"memset/large/1thread"}});
    memory.push_back({shared_out + "2threads", {"memset/large/2threads"}});
  }
  announce_quotients("peers", peers);
  announce_quotients("threads", threads);
  announce_quotients("memory", memory);
}

}  // namespace

int main(int argc, char** argv) {
  if (!initialize(argc, argv))
    return 1;

  rvx_stream stream = nullptr;
  check(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1));
  add_rvx(stream, medium, 1, "");
  add<float>("rvx/float/one_value", 1, [stream](std::size_t, float* out) {
    check(rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, 1, out, 0, 1));
  });
  add_peers();
  add_rvx(stream, large, 1, "/large/1thread");
  add_rvx(stream, large, 2, "/large/2threads");
  add_memset(large, 1, "/large/1thread");
  add_memset(large, 2, "/large/2threads");

  announce_tables();
  benchmark::RunSpecifiedBenchmarks();
  check(rvxDeleteStream(&stream));
  return 0;
}
