// SPDX-License-Identifier: Apache-2.0
// The engines' points.
#include "scatters.hpp"

#include <cstdint>
#include <stdexcept>
#include <tarn_rvx.h>

namespace {

using points = std::vector<std::pair<double, double>>;

constexpr std::size_t shown = 1024;  // a power of two: digital nets are even there

struct engine {
  std::string name;
  std::int64_t code;
  std::string seed_type;
};
const engine engines[] = {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {#name, code, #seed_type},
#include "rng/engines/engines.def"
};

void need(int status) {
  if (status != RVX_STATUS_OK)
    throw std::runtime_error("a call gave the status " + std::to_string(status));
}

class owned_stream {
 public:
  owned_stream(std::int64_t code, std::uint64_t seed) { need(rvxNewStream(&stream_, code, seed)); }
  owned_stream(const owned_stream&) = delete;
  owned_stream& operator=(const owned_stream&) = delete;
  ~owned_stream() { rvxDeleteStream(&stream_); }
  rvx_stream get() const { return stream_; }

 private:
  rvx_stream stream_ = nullptr;
};

// The last two coordinates of the first points.
points first_points(std::int64_t code, std::uint64_t seed, std::size_t dimensions) {
  const owned_stream stream(code, seed);
  std::vector<double> values(dimensions * shown);
  need(rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream.get(),
                      static_cast<std::int64_t>(values.size()), values.data(), 0, 1));
  points all(shown);
  for (std::size_t i = 0; i < shown; ++i) {
    const double* end = values.data() + (i + 1) * dimensions;
    all[i] = {end[-2], end[-1]};
  }
  return all;
}

void add_engine(const engine& of, std::vector<scatter>& all) {
  if (of.seed_type != "dim") {
    all.push_back({of.name, of.name + ": 1024 pairs of values", false, of.seed_type != "none",
                   first_points(of.code, 1, 2)});
    return;
  }
  all.push_back({of.name, of.name + ": 1024 points in two dimensions", true, true,
                 first_points(of.code, 2, 2)});
  all.push_back({of.name + "_40", of.name + ": coordinates 39 and 40 of 1024 points", true, true,
                 first_points(of.code, 40, 40)});
}

// The pairs of successive words of the whole period of mcg31m1 that fall into a corner of the
// square, blown up: there are no others.
scatter lattice_of_mcg31m1() {
  constexpr std::uint32_t modulus = 0x7FFFFFFF, side = modulus / 1500;
  constexpr std::size_t block = 1 << 20;
  const owned_stream stream(RVX_BRNG_MCG31, 1);
  std::vector<std::uint32_t> words(block);
  points all;
  std::uint32_t before = modulus;
  for (std::size_t done = 0; done < modulus - 1; done += block) {
    need(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream.get(), block, words.data()));
    for (const std::uint32_t word : words) {
      if (word < side && before < side)
        all.emplace_back(static_cast<double>(before) / side, static_cast<double>(word) / side);
      before = word;
    }
  }
  return {"mcg31m1_lattice", "mcg31m1: all pairs of the period below 1/1500", false, true, all};
}

}  // namespace

std::vector<scatter> every_scatter() {
  std::vector<scatter> all;
  for (const engine& of : engines)
    add_engine(of, all);
  all.push_back(lattice_of_mcg31m1());
  return all;
}
