// SPDX-License-Identifier: Apache-2.0
// Pi by the Monte Carlo method, on any queue: the share of random points of the unit square that
// lie in the quarter of a circle is pi / 4. Points are drawn and counted on the device; only the
// counts of its work-items come back. One seed gives one estimate on every device.
//
//   tarn_pi [cpu|gpu] [POINTS]     a queue of the default selector and 2^22 points without
//   arguments
//
// Build: g++ -std=c++17 pi.cpp $(pkg-config --cflags --libs tarn_rng) -o pi
// LUMEN_VIRTUAL_DEVICES=gpu shows a GPU where there is none.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <numeric>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

constexpr double pi = 3.14159265358979323846;
constexpr std::int64_t block = 1 << 20;  // points that are drawn at a time: 8 MiB of floats
constexpr std::size_t items = 1024;      // work-items that count

// A kernel is a class of its own with data that can be copied to a device as they are.
struct count_inside {
  const float* xy;
  std::int64_t points;
  std::int64_t* inside;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    std::int64_t mine = 0;
    for (auto i = static_cast<std::int64_t>(item[0]); i < points; i += items) {
      const float x = xy[2 * i], y = xy[2 * i + 1];
      mine += x * x + y * y < 1.0f ? 1 : 0;
    }
    inside[item[0]] += mine;
  }
};

std::int64_t points_inside(sycl::queue& queue, std::int64_t points) {
  rng::philox4x32x10 engine(queue, 2026);
  const rng::uniform<float> unit(0.0f, 1.0f);
  auto* xy = sycl::malloc_device<float>(2 * block, queue);
  auto* inside = sycl::malloc_shared<std::int64_t>(items, queue);
  std::fill_n(inside, items, 0);

  // Each step waits for the one before by its event; the host waits once, at the end.
  sycl::event counted;
  for (std::int64_t done = 0; done < points; done += block) {
    const std::int64_t now = std::min(block, points - done);
    const sycl::event drawn = rng::generate(unit, engine, 2 * now, xy, {counted});
    counted = queue.parallel_for(sycl::range<1>(items), drawn, count_inside{xy, now, inside});
  }
  counted.wait_and_throw();

  const std::int64_t sum = std::accumulate(inside, inside + items, std::int64_t{0});
  sycl::free(inside, queue);
  sycl::free(xy, queue);
  return sum;
}

sycl::queue queue_on(const std::string& kind) {
  if (kind == "gpu")
    return sycl::queue{sycl::gpu_selector_v};
  if (kind == "cpu")
    return sycl::queue{sycl::cpu_selector_v};
  return sycl::queue{};
}

int estimate(const std::string& kind, std::int64_t points) {
  sycl::queue queue = queue_on(kind);
  const std::int64_t inside = points_inside(queue, points);
  const double n = static_cast<double>(points);
  const double value = 4 * static_cast<double>(inside) / n;
  // The count is binomial. Four standard deviations are left once in 16000 seeds.
  const double bound = 4 * 4 * std::sqrt(pi / 4 * (1 - pi / 4) / n);

  std::printf("%s: %lld of %lld points inside\n",
              queue.get_device().get_info<sycl::info::device::name>().c_str(),
              static_cast<long long>(inside), static_cast<long long>(points));
  std::printf("pi = %.6f, error %+.6f, four standard deviations %.6f\n", value, value - pi, bound);
  if (std::abs(value - pi) > bound) {
    std::printf("the error is too large\n");
    return EXIT_FAILURE;
  }
  return EXIT_SUCCESS;
}

}  // namespace

int main(int argc, char** argv) {
  std::vector<std::string> arguments(argv + 1, argv + argc);
  std::string kind;
  if (!arguments.empty() && (arguments[0] == "cpu" || arguments[0] == "gpu")) {
    kind = arguments[0];
    arguments.erase(arguments.begin());
  }
  const std::int64_t points = arguments.empty() ? 1 << 22 : std::atoll(arguments[0].c_str());
  if (points < 1 || arguments.size() > 1) {
    std::fprintf(stderr, "usage: tarn_pi [cpu|gpu] [POINTS]\n");
    return EXIT_FAILURE;
  }
  try {
    return estimate(kind, points);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "pi: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
