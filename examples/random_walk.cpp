// SPDX-License-Identifier: Apache-2.0
// A long walk that can be interrupted at any time: the walker's place and the engine's state go to
// one file after every block, and the next run goes on from there. It comes to where an
// uninterrupted walk comes.
//
//   tarn_random_walk STEPS [FILE]    up to step STEPS, from the step that FILE tells
//
// Build: g++ -std=c++17 random_walk.cpp $(pkg-config --cflags --libs tarn_rng) -o random_walk
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

constexpr std::int64_t block = 1 << 18;  // steps between two savings

struct walker {
  std::int64_t step = 0, x = 0, y = 0;
};

// The file is written beside the old one and takes its place when it is whole.
void save(const std::string& file, const walker& w, rng::mt19937& engine) {
  std::vector<std::uint8_t> state(static_cast<std::size_t>(rng::get_state_size(engine)));
  rng::save_state(engine, state.data());
  std::ofstream out(file + ".new", std::ios::binary);
  out.write(reinterpret_cast<const char*>(&w), sizeof w);
  out.write(reinterpret_cast<const char*>(state.data()),
            static_cast<std::streamsize>(state.size()));
  out.close();
  if (!out || std::rename((file + ".new").c_str(), file.c_str()) != 0) {
    throw std::runtime_error("cannot write " + file);
  }
}

// The walker and the engine as they were saved, or both new where there is no file.
rng::mt19937 load(const std::string& file, walker& w, const sycl::queue& queue) {
  rng::mt19937 engine(queue, 2026);
  std::ifstream in(file, std::ios::binary);
  if (!in) {
    return engine;
  }
  in.read(reinterpret_cast<char*>(&w), sizeof w);
  const std::vector<char> state(std::istreambuf_iterator<char>(in), {});
  if (static_cast<std::int64_t>(state.size()) != rng::get_state_size(engine)) {
    throw std::runtime_error(file + " is no saved walk");
  }
  std::printf("goes on from step %lld\n", static_cast<long long>(w.step));
  return rng::load_state<rng::mt19937>(queue, reinterpret_cast<const std::uint8_t*>(state.data()));
}

void walk(const std::string& file, std::int64_t steps) {
  sycl::queue queue;
  walker w;
  rng::mt19937 engine = load(file, w, queue);
  const rng::uniform<std::int32_t> direction(0, 4);
  auto* directions = sycl::malloc_shared<std::int32_t>(block, queue);
  while (w.step < steps) {
    const std::int64_t now = std::min(block, steps - w.step);
    rng::generate(direction, engine, now, directions).wait_and_throw();
    for (std::int64_t i = 0; i < now; ++i) {
      const int along = directions[i] < 2 ? 1 : -1;
      (directions[i] % 2 == 0 ? w.x : w.y) += along;
    }
    w.step += now;
    if (!file.empty()) {
      save(file, w, engine);
    }
  }
  sycl::free(directions, queue);
  std::printf("step %lld: (%lld, %lld)\n", static_cast<long long>(w.step),
              static_cast<long long>(w.x), static_cast<long long>(w.y));
  // Every step changes the parity of x + y. The square of the distance has the mean `step`, and is
  // nearly exponential: 25 times as much comes once in 10^10 walks.
  if ((w.x + w.y - w.step) % 2 != 0 || w.x * w.x + w.y * w.y > 25 * w.step) {
    throw std::runtime_error("this is no random walk");
  }
}

}  // namespace

int main(int argc, char** argv) {
  const std::int64_t steps = argc > 1 ? std::atoll(argv[1]) : 0;
  if (argc > 3 || steps < 1) {
    std::fprintf(stderr, "usage: tarn_random_walk STEPS [FILE]\n");
    return EXIT_FAILURE;
  }
  try {
    walk(argc > 2 ? argv[2] : "", steps);
    return EXIT_SUCCESS;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "random_walk: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
