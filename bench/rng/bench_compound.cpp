// SPDX-License-Identifier: Apache-2.0
// The rejecting and compound families by their device road, on the virtual GPU, against the
// standard library on one thread: what a user without a GPU would pick instead. The passes, their
// scans and their waits have to leave it ahead.
#include <cstdint>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"

namespace {

namespace rng = kestrel::tarn::rng;

constexpr std::int64_t count = 1 << 20;

template <typename Distr>
void virtual_gpu(benchmark::State& state, const Distr& distr) {
  sycl::queue queue(sycl::gpu_selector_v);
  rng::philox4x32x10 engine(queue);
  std::vector<typename Distr::result_type> values(count);
  for (auto _ : state) {
    rng::generate(distr, engine, count, values.data()).wait();
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * count);
}

template <typename Distr>
void standard(benchmark::State& state, Distr distr) {
  std::mt19937 engine;
  std::vector<typename Distr::result_type> values(count);
  for (auto _ : state) {
    for (auto& value : values) {
      value = distr(engine);
    }
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * count);
}

std::vector<quotient> quotients;

/// A family with parameters on its rejecting road, and its counterpart.
template <typename Distr, typename Standard>
void add(const std::string& name, const Distr& distr, const Standard& other) {
  quotients.push_back({name + "/virtual_gpu", {name + "/std"}, 1.0});
  const auto in_real_time = [](benchmark::internal::Benchmark* made) {
    made->UseRealTime()->Repetitions(5);
  };
  in_real_time(benchmark::RegisterBenchmark((name + "/virtual_gpu").c_str(),
                                            [=](benchmark::State& s) { virtual_gpu(s, distr); }));
  in_real_time(benchmark::RegisterBenchmark((name + "/std").c_str(),
                                            [=](benchmark::State& s) { standard(s, other); }));
}

}  // namespace

int main(int argc, char** argv) {
  setenv("LUMEN_VIRTUAL_DEVICES", "gpu,max_work_group_size=256", 0);
  add("gamma<float>", rng::gamma<float>(2.5f), std::gamma_distribution<float>(2.5f));
  add("gamma<float> small", rng::gamma<float>(0.5f), std::gamma_distribution<float>(0.5f));
  add("chi_square<float>", rng::chi_square<float>(5), std::chi_squared_distribution<float>(5.0f));
  add("binomial", rng::binomial<>(1000, 0.3), std::binomial_distribution<int>(1000, 0.3));
  add("binomial table", rng::binomial<>(50, 0.3), std::binomial_distribution<int>(50, 0.3));
  add("negative_binomial", rng::negative_binomial<>(200.0, 0.3),
      std::negative_binomial_distribution<int>(200, 0.3));
  add("poisson", rng::poisson<std::int32_t, rng::poisson_method::gaussian_icdf_based>(50.0),
      std::poisson_distribution<int>(50.0));
  add("geometric", rng::geometric<>(0.2), std::geometric_distribution<int>(0.2));
  if (!initialize(argc, argv)) {
    return 1;
  }
  announce_quotients("rejection", quotients);
  benchmark::RunSpecifiedBenchmarks();
}
