// SPDX-License-Identifier: Apache-2.0
// What an offload entry does on the host for as long as its results are many: streams of mt2203 are
// moved word by word, as the statistics library has no skip for them. Without the entry a user
// would draw and throw away.
#include <cstdint>
#include <tarn_rvx.h>
#include <vector>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "mt2203_skip.hpp"

namespace {

constexpr std::int64_t words = 1 << 20;

class mt2203_stream {
 public:
  mt2203_stream() { rvxNewStream(&stream_, RVX_BRNG_MT2203, 1); }
  ~mt2203_stream() { rvxDeleteStream(&stream_); }
  mt2203_stream(const mt2203_stream&) = delete;
  mt2203_stream& operator=(const mt2203_stream&) = delete;
  rvx_stream get() const { return stream_; }

 private:
  rvx_stream stream_ = nullptr;
};

void skip(benchmark::State& state) {
  const mt2203_stream stream;
  for (auto _ : state) {
    kestrel::tarn::rng::detail::openmp::skip_mt2203(stream.get(), words);
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * words);
}

void draw(benchmark::State& state) {
  const mt2203_stream stream;
  std::vector<std::uint32_t> values(words);
  for (auto _ : state) {
    rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream.get(), words, values.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * words);
}

}  // namespace

int main(int argc, char** argv) {
  benchmark::RegisterBenchmark("mt2203/skip", skip);
  benchmark::RegisterBenchmark("mt2203/draw", draw);
  if (!initialize(argc, argv)) {
    return 1;
  }
  announce_quotients("offload", {{"mt2203/skip", {"mt2203/draw"}, 1}});
  benchmark::RunSpecifiedBenchmarks();
}
