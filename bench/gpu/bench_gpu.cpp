// SPDX-License-Identifier: Apache-2.0
// generate on the first CUDA device beside cuRAND and a plain fill of the memory, in one run: every
// engine and distribution that cuRAND's host interface has as well, into memory of the device.
// Results are checked against their laws before anything is timed; runs of all are interleaved, and
// the medians of 21 count. Names read engine/variate/method. --values=N sets the count of values;
// the rest of the command line is Google Benchmark's: --benchmark_filter=..., --benchmark_out=FILE
// for JSON. Without a CUDA device there is nothing to measure.
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <benchmark/benchmark.h>

#include "../comparisons.hpp"
#include "cuda_fillers.hpp"
#include "figures.hpp"
#include "roads.hpp"
#include "tarn_filler.hpp"
#include "variates.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using gpu_bench::variate;

// Half a gigabyte of floats, far beyond every cache, and enough points of 1000 coordinates for
// their gaps to be lost in what the check of the laws allows.
constexpr std::int64_t least_values = std::int64_t{1} << 27;
std::size_t values = least_values;

std::optional<sycl::queue> owner;  // of the memory
void* memory = nullptr;  // of the device: one call after the other fills it, whoever makes it
std::vector<gpu_bench::row> rows;

// ---- the ceiling

std::vector<std::string> fills_of(std::size_t value_bytes) {
  const std::string name = "fill/" + std::to_string(value_bytes) + "_bytes/";
  return {name + "one_store_a_thread", name + "grid_stride"};
}

void check_filled(const void* drawn, std::size_t words) {
  const auto* from = static_cast<const std::uint32_t*>(drawn);
  for (std::size_t i = 0; i < words; ++i) {
    if (from[i] != i)
      throw std::runtime_error("word " + std::to_string(i) + " of the fill is wrong");
  }
}

void add_fills(std::size_t value_bytes) {
  const std::vector<std::string> names = fills_of(value_bytes);
  const std::size_t bytes = values * value_bytes;
  const auto add = [=](const std::string& name, gpu_bench::plain_fill fill) {
    gpu_bench::add_road(
        {name, values, value_bytes, memory,
         [=] { return std::make_unique<gpu_bench::plain_filler>(fill, memory, bytes); },
         [=](const void* drawn) { check_filled(drawn, bytes / sizeof(std::uint32_t)); }});
    rows.push_back({name, value_bytes, names, {}, 0, 0});
  };
  add(names[0], gpu_bench::fill_one_store_a_thread);
  add(names[1], gpu_bench::fill_grid_stride);
}

// ---- cuRAND

/// An engine on both sides: `dimensions` is 0 but for sobol.
struct contest {
  std::string engine;
  curandRngType_t peer;
  std::uint32_t dimensions;
  double asked_over_peer;  // of every row

  /// Whole points, and whole stores of the fill.
  std::size_t count() const {
    const std::size_t step = dimensions == 0 ? 4 : dimensions;
    return values / step * step;
  }
  std::string row(variate what) const { return engine + "/" + gpu_bench::name_of(what); }
  std::vector<std::string> peers(variate what) const {
    return {row(what) + "/curand", row(what) + "/curand_dynamic"};
  }
};

void add_curand(const contest& of, const gpu_bench::curand_source& source, int nth_peer) {
  const std::size_t n = of.count();
  for (const variate what : gpu_bench::all_variates) {
    gpu_bench::add_road(
        {of.peers(what)[static_cast<std::size_t>(nth_peer)], n, gpu_bench::size_of(what), memory,
         [=] { return std::make_unique<gpu_bench::curand_filler>(source, what, memory, n); },
         [=](const void* drawn) { gpu_bench::check_drawn(what, drawn, n); }});
  }
}

/// In the usual ordering, and in the one that cuRAND adapts to the device, where it has that.
void add_curand(const contest& of) {
  if (of.dimensions != 0)
    return add_curand(of, {of.peer, CURAND_ORDERING_QUASI_DEFAULT, of.dimensions}, 0);
  add_curand(of, {of.peer, CURAND_ORDERING_PSEUDO_DEFAULT, 0}, 0);
  const gpu_bench::curand_source dynamic{of.peer, CURAND_ORDERING_PSEUDO_DYNAMIC, 0};
  if (gpu_bench::offers(dynamic))
    add_curand(of, dynamic, 1);
}

// ---- generate

/// With a queue of its own, so that no work of another road stands before it.
template <typename Engine>
Engine engine_of(const contest& of) {
  const sycl::queue queue(
      owner->get_context(), owner->get_device(),
      {sycl::property::queue::in_order{}, sycl::property::queue::enable_profiling{}});
  if constexpr (std::is_same_v<Engine, rng::sobol>)
    return Engine(queue, of.dimensions);
  else
    return Engine(queue);
}

/// A row with its road. `asked_over_peer` stands beside that of the engine: the larger one counts.
template <typename Engine, typename Distr>
void add(const contest& of, variate what, const std::string& method, const Distr& distr,
         double asked_of_fill = 0, double asked_over_peer = 0) {
  const std::size_t n = of.count();
  const std::size_t bytes = gpu_bench::size_of(what);
  const std::string name = of.row(what) + "/" + method;
  gpu_bench::add_road({name, n, bytes, memory,
                       [=] {
                         return std::make_unique<gpu_bench::tarn_filler<Engine, Distr>>(
                             engine_of<Engine>(of), distr, memory, n);
                       },
                       [=](const void* drawn) { gpu_bench::check_drawn(what, drawn, n); }});
  rows.push_back({name, bytes, fills_of(bytes), of.peers(what), asked_of_fill,
                  std::max(asked_over_peer, of.asked_over_peer)});
}

constexpr auto lognormal_mean = gpu_bench::lognormal_mean;
constexpr auto lognormal_deviation = gpu_bench::lognormal_deviation;

/// What every engine has. Something may be asked of uniform<float> alone.
template <typename Engine>
void add_common(const contest& of, double uniform_of_fill = 0, double uniform_over_peer = 0) {
  using rng::gaussian_method::icdf;
  using log_icdf = rng::lognormal_method::icdf;
  add<Engine>(of, variate::words, "tarn", rng::bits<>());
  add<Engine>(of, variate::uniform_float, "tarn", rng::uniform<float>(), uniform_of_fill,
              uniform_over_peer);
  add<Engine>(of, variate::uniform_double, "tarn", rng::uniform<double>());
  add<Engine>(of, variate::gaussian_float, "icdf", rng::gaussian<float, icdf>());
  add<Engine>(of, variate::gaussian_double, "icdf", rng::gaussian<double, icdf>());
  add<Engine>(of, variate::lognormal_float, "icdf",
              rng::lognormal<float, log_icdf>(static_cast<float>(lognormal_mean),
                                              static_cast<float>(lognormal_deviation)));
  add<Engine>(of, variate::lognormal_double, "icdf",
              rng::lognormal<double, log_icdf>(lognormal_mean, lognormal_deviation));
  using poisson = rng::poisson<std::int32_t, rng::poisson_method::gaussian_icdf_based>;
  add<Engine>(of, variate::poisson, "gaussian_icdf_based", poisson(gpu_bench::poisson_rate));
}

/// Box and Muller's method, which is not for points: it would join neighbouring coordinates.
template <typename Engine>
void add_box_muller(const contest& of, double gaussian_float_over_peer = 0) {
  using rng::gaussian_method::box_muller2;
  using log_box_muller2 = rng::lognormal_method::box_muller2;
  add<Engine>(of, variate::gaussian_float, "box_muller2", rng::gaussian<float, box_muller2>(), 0,
              gaussian_float_over_peer);
  add<Engine>(of, variate::gaussian_double, "box_muller2", rng::gaussian<double, box_muller2>());
  add<Engine>(of, variate::lognormal_float, "box_muller2",
              rng::lognormal<float, log_box_muller2>(static_cast<float>(lognormal_mean),
                                                     static_cast<float>(lognormal_deviation)));
  add<Engine>(of, variate::lognormal_double, "box_muller2",
              rng::lognormal<double, log_box_muller2>(lognormal_mean, lognormal_deviation));
}

void add_engines() {
  // What is asked of philox4x32x10: nine tenths of what the memory takes, and no less than cuRAND.
  const contest philox{"philox4x32x10", CURAND_RNG_PSEUDO_PHILOX4_32_10, 0, 0};
  add_common<rng::philox4x32x10>(philox, 0.9, 1.0);
  add_box_muller<rng::philox4x32x10>(philox, 1.0);
  add_curand(philox);

  const contest mrg{"mrg32k3a", CURAND_RNG_PSEUDO_MRG32K3A, 0, 1.0};
  add_common<rng::mrg32k3a>(mrg);
  add_box_muller<rng::mrg32k3a>(mrg);
  add_curand(mrg);

  const contest mt{"mt19937", CURAND_RNG_PSEUDO_MT19937, 0, 0};
  add_common<rng::mt19937>(mt);
  add_box_muller<rng::mt19937>(mt);
  add_curand(mt);

  // Sets of smaller twisters on both sides, though of different ones.
  const contest twisters{"mt2203", CURAND_RNG_PSEUDO_MTGP32, 0, 0};
  add_common<rng::mt2203>(twisters);
  add_box_muller<rng::mt2203>(twisters);
  add_curand(twisters);

  // cuRAND gives the first coordinates of all points, then the second ones; sobol point by point.
  for (const std::uint32_t dimensions : {1u, 100u, 1000u}) {
    const contest sobol{"sobol_" + std::to_string(dimensions), CURAND_RNG_QUASI_SOBOL32, dimensions,
                        1.0};
    add_common<rng::sobol>(sobol);
    add_curand(sobol);
  }
}

// ---- the program

/// Takes --values=N out of the arguments. False if N is no count from 2^27 to 2^29.
bool take_values(int& argc, char** argv) {
  const std::string option = "--values=";
  for (int i = 1; i < argc; ++i) {
    const std::string argument = argv[i];
    if (argument.compare(0, option.size(), option) != 0)
      continue;
    const long long count = std::atoll(argument.c_str() + option.size());
    if (count < least_values || count > gpu_bench::most_values) {
      std::fprintf(stderr, "--values: from %lld to %lld\n", static_cast<long long>(least_values),
                   static_cast<long long>(gpu_bench::most_values));
      return false;
    }
    values = static_cast<std::size_t>(count) / 4 * 4;  // whole stores of the fill
    std::copy(argv + i + 1, argv + argc, argv + i);
    --argc;
    --i;
  }
  return true;
}

/// The first one in the driver's order, or none if the driver has none either.
std::optional<sycl::device> first_cuda_device() {
  for (const sycl::device& device : sycl::device::get_devices()) {
    if (device.get_backend() == sycl::backend::cuda)
      return device;
  }
  int count = 0;
  if (cudaGetDeviceCount(&count) == cudaSuccess && count > 0)
    throw std::runtime_error("CUDA has a device that the SYCL runtime does not show");
  return std::nullopt;
}

std::string version_text(int version) {  // 13000 is 13.0
  return std::to_string(version / 1000) + "." + std::to_string(version % 1000 / 10);
}

void tell_context(const sycl::device& device) {
  int driver = 0, runtime = 0, curand = 0;
  gpu_bench::check(cudaDriverGetVersion(&driver));
  gpu_bench::check(cudaRuntimeGetVersion(&runtime));
  gpu_bench::check(curandGetVersion(&curand));
  const auto name = device.get_info<sycl::info::device::name>();
  benchmark::AddCustomContext("gpu", name);
  benchmark::AddCustomContext("values", std::to_string(values));
  benchmark::AddCustomContext("cuda_driver", version_text(driver));
  benchmark::AddCustomContext("cuda_runtime", version_text(runtime));
  benchmark::AddCustomContext("curand", std::to_string(curand));
  std::printf("%s, driver for CUDA %s, CUDA %s, cuRAND %d; %zu values a call\n", name.c_str(),
              version_text(driver).c_str(), version_text(runtime).c_str(), curand, values);
}

int measure(const sycl::device& device) {
  gpu_bench::check(cudaSetDevice(0));  // the peers work on the same one
  owner.emplace(device);
  memory = sycl::malloc_device(values * sizeof(double), *owner);
  if (memory == nullptr)
    throw std::runtime_error("the device has no memory for the values");
  tell_context(device);
  add_fills(sizeof(float));
  add_fills(sizeof(double));
  add_engines();

  gpu_bench::figures figures;
  benchmark::RunSpecifiedBenchmarks(&figures);
  gpu_bench::figures::print_heading();
  for (const gpu_bench::row& row : rows)
    figures.print(row);
  sycl::free(memory, *owner);
  owner.reset();
  return gpu_bench::any_road_failed() ? 1 : 0;
}

}  // namespace

int main(int argc, char** argv) {
  if (!take_values(argc, argv) || !initialize(argc, argv))
    return 1;
  try {
    const std::optional<sycl::device> device = first_cuda_device();
    if (device)
      return measure(*device);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "bench_gpu: %s\n", error.what());
    return 1;
  }
  std::printf("skipped: no CUDA device\n");
}
