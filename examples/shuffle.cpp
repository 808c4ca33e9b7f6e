// SPDX-License-Identifier: Apache-2.0
// An engine where the C++ standard library wants a generator: rng::bit_generator shuffles a deck of
// cards, samples from it and drives a standard distribution. Words handed out this way and those of
// generate are one sequence.
//
//   tarn_shuffle [SEED]
//
// Build: g++ -std=c++17 shuffle.cpp $(pkg-config --cflags --libs tarn_rng) -o shuffle
#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <iterator>
#include <numeric>
#include <random>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace {

namespace rng = kestrel::tarn::rng;

using deck = std::array<int, 52>;

deck new_deck() {
  deck cards;
  std::iota(cards.begin(), cards.end(), 0);
  return cards;
}

template <class Cards>
void print(const char* what, const Cards& cards) {
  std::printf("%-9s", what);
  for (auto card = cards.begin(); card != cards.begin() + 5; ++card) {
    std::printf(" %c%c", "23456789TJQKA"[*card % 13], "CDHS"[*card / 13]);
  }
  std::printf("\n");
}

deck shuffled(sycl::queue& queue, std::uint64_t seed) {
  rng::philox4x32x10 engine(queue, seed);
  deck cards = new_deck();
  std::shuffle(cards.begin(), cards.end(), rng::bit_generator(engine));
  return cards;
}

int play(std::uint64_t seed) {
  sycl::queue queue{sycl::cpu_selector_v};
  const deck cards = shuffled(queue, seed);
  print("shuffled", cards);

  // A named view for several uses. When it ends the engine stands behind the last word it gave.
  rng::philox4x32x10 engine(queue, seed);
  {
    rng::bit_generator words(engine);
    std::array<int, 5> hand{};
    std::sample(cards.begin(), cards.end(), hand.begin(), hand.size(), words);
    print("a sample", hand);
    std::uniform_int_distribution<int> die(1, 6);
    const int first = die(words), second = die(words);
    std::printf("two dice  %d %d\n", first, second);
  }
  std::uint32_t word = 0;
  rng::generate(rng::bits<>{}, engine, 1, &word).wait_and_throw();
  std::printf("next word %08x\n", static_cast<unsigned>(word));

  const bool complete = std::is_permutation(cards.begin(), cards.end(), new_deck().begin());
  const bool again = shuffled(queue, seed) == cards;
  const bool other = shuffled(queue, seed + 1) != cards;
  std::printf(
      "all cards are there: %s; the same seed, the same order: %s; another seed, another: %s\n",
      complete ? "yes" : "NO", again ? "yes" : "NO", other ? "yes" : "NO");
  return complete && again && other ? EXIT_SUCCESS : EXIT_FAILURE;
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return play(argc > 1 ? std::strtoull(argv[1], nullptr, 10) : 52);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "shuffle: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
