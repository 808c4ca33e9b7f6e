// SPDX-License-Identifier: Apache-2.0
// The demonstration behind `./run demo`: one seed, two devices, the same numbers. Fills 100 million
// uniform floats on the processor and 1 million on a GPU (lumen's virtual one where there is no
// other), compares the common prefix bit for bit, and shows rates and a histogram.
//
//   tarn_demo [MILLIONS]    so many floats on the processor
//
// Build: g++ -std=c++17 demo.cpp $(pkg-config --cflags --libs tarn_rng) -o demo
#include <algorithm>
#include <array>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

constexpr std::uint64_t seed = 20240229;
constexpr std::int64_t million = 1000000;
constexpr std::int64_t gpu_count = million;
constexpr int repetitions = 5;

/// Median seconds of `repetitions` runs.
template <typename Work>
double seconds_of(Work work) {
  std::array<double, repetitions> times;
  for (double& time : times) {
    const auto start = std::chrono::steady_clock::now();
    work();
    time = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  }
  std::sort(times.begin(), times.end());
  return times[repetitions / 2];
}

void print_rate(const std::string& what, std::int64_t count, double seconds) {
  const double bytes = static_cast<double>(count) * sizeof(float);
  std::printf("  %-34s %11lld floats %9.2f ms %7.2f G/s %7.2f GB/s\n", what.c_str(),
              static_cast<long long>(count), seconds * 1e3,
              static_cast<double>(count) / seconds * 1e-9, bytes / seconds * 1e-9);
}

std::string device_name(const sycl::queue& queue) {
  return queue.get_device().get_info<sycl::info::device::name>();
}

/// Fills `values` from a fresh engine on `queue`; returns the median seconds of a call.
double fill(sycl::queue& queue, float* values, std::int64_t count) {
  const rng::philox4x32x10 fresh(queue, seed);
  const rng::uniform<float> distribution(0.0f, 1.0f);
  return seconds_of([&] {
    rng::philox4x32x10 engine(fresh);
    rng::generate(distribution, engine, count, values).wait_and_throw();
  });
}

void print_histogram(const float* values, std::int64_t count) {
  constexpr int bins = 10;
  std::array<std::int64_t, bins> counts{};
  for (std::int64_t i = 0; i < count; ++i) {
    ++counts[static_cast<std::size_t>(std::min(values[i] * bins, bins - 1.0f))];
  }
  for (int bin = 0; bin < bins; ++bin) {
    const double share =
        static_cast<double>(counts[static_cast<std::size_t>(bin)]) / static_cast<double>(count);
    std::printf("  %.1f - %.1f  %8.5f  %s\n", bin / 10.0, (bin + 1) / 10.0, share,
                std::string(static_cast<std::size_t>(share * 400 + 0.5), '#').c_str());
  }
}

int demonstrate(std::int64_t cpu_count) {
  // Profiling, so that TARN_VERBOSE=2 can report device times.
  const sycl::property_list profiling{sycl::property::queue::enable_profiling{}};
  sycl::queue cpu{sycl::cpu_selector_v, profiling};
  sycl::queue gpu{sycl::gpu_selector_v, profiling};
  const std::size_t bytes = static_cast<std::size_t>(cpu_count) * sizeof(float);
  auto* cpu_values = static_cast<float*>(sycl::malloc_shared(bytes, cpu));
  auto* gpu_values = sycl::malloc_shared<float>(gpu_count, gpu);
  if (cpu_values == nullptr || gpu_values == nullptr) {
    std::fprintf(stderr, "demo: not enough memory: %lld MB are needed\n",
                 static_cast<long long>((cpu_count + gpu_count) * 4 / million));
    return EXIT_FAILURE;
  }

  std::printf("Tarn RNG: uniform<float> on [0, 1) from philox4x32x10, seed %llu\n\n",
              static_cast<unsigned long long>(seed));
  std::printf("  CPU queue: %s\n  GPU queue: %s\n\n", device_name(cpu).c_str(),
              device_name(gpu).c_str());
  std::memset(cpu_values, 1, bytes);  // pages are there before anything is timed
  std::memset(gpu_values, 1, gpu_count * sizeof(float));
  print_rate("memory set", cpu_count, seconds_of([&] { std::memset(cpu_values, 2, bytes); }));
  print_rate("generate on the CPU queue", cpu_count, fill(cpu, cpu_values, cpu_count));
  print_rate("generate on the GPU queue", gpu_count, fill(gpu, gpu_values, gpu_count));

  std::printf("\n  shares of ten equal intervals\n");
  print_histogram(cpu_values, cpu_count);

  const bool equal = std::memcmp(cpu_values, gpu_values, gpu_count * sizeof(float)) == 0;
  std::printf("\n  first %lld numbers of both queues: %s\n", static_cast<long long>(gpu_count),
              equal ? "equal bit for bit" : "DIFFERENT");
  sycl::free(gpu_values, gpu);
  sycl::free(cpu_values, cpu);
  return equal ? EXIT_SUCCESS : EXIT_FAILURE;
}

}  // namespace

int main(int argc, char** argv) {
  const std::int64_t millions = argc > 1 ? std::atoll(argv[1]) : 100;
  if (argc > 2 || millions < 1 || millions > 100000) {
    std::fprintf(stderr, "usage: tarn_demo [MILLIONS], 1 to 100000\n");
    return EXIT_FAILURE;
  }
  // A GPU for everybody: lumen shows a virtual one that runs on the processor. A value that the
  // user has set stays.
  setenv("LUMEN_VIRTUAL_DEVICES", "gpu", 0);
  try {
    return demonstrate(millions * million);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "demo: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
