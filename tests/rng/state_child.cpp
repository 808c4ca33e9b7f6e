// SPDX-License-Identifier: Apache-2.0
// A process of its own for saved states: state_child save|load <engine> cpu|gpu <file>. `save`
// draws some words and saves, `load` loads; then both draw on and print what they drew.
#include <cstdint>
#include <cstdio>
#include <exception>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

template <typename Engine>
std::vector<double> draw(Engine& engine, std::int64_t n) {
  std::vector<double> values(static_cast<std::size_t>(n), -1.0);
  {
    sycl::buffer<double, 1> buffer(values.data(), sycl::range<1>(values.size()));
    rng::generate(rng::uniform<double>(), engine, n, buffer);
  }
  return values;
}

template <typename Engine>
Engine made(const sycl::queue& queue) {
  if constexpr (std::is_same_v<Engine, rng::mt2203>) {
    return Engine(queue, 1, 0);  // without an index a GPU has several generators
  } else {
    return Engine(queue);
  }
}

template <typename Engine>
Engine made(const sycl::queue& queue, const std::string& action, const std::string& file) {
  if (action == "load") {
    return rng::load_state<Engine>(queue, file);
  }
  Engine engine = made<Engine>(queue);
  draw(engine, 1005);
  rng::save_state(engine, file);
  return engine;
}

}  // namespace

int main(int argc, char** argv) try {
  if (argc != 5) {
    return 2;
  }
  const std::string name = argv[2], device = argv[3];
  const sycl::queue queue =
      device == "gpu" ? sycl::queue(sycl::gpu_selector_v) : sycl::queue(sycl::cpu_selector_v);
#define TARN_ENGINE(engine_name, code, label, word_bits, seed_type, gpu, skip, skip_list, \
                    leapfrog, uniform_bits)                                               \
  if (name == #engine_name) {                                                             \
    auto engine = made<rng::engine_name>(queue, argv[1], argv[4]);                        \
    for (const double value : draw(engine, 20)) {                                         \
      std::printf("drawn %a\n", value);                                                   \
    }                                                                                     \
    return 0;                                                                             \
  }
#include "engines/engines.def"
  return 2;
} catch (const std::exception& raised) {
  std::fprintf(stderr, "%s\n", raised.what());
  return 1;
}
