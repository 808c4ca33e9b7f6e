// SPDX-License-Identifier: Apache-2.0
// Safe primes by the sieve of Eratosthenes, and their primitive roots.
#include "primes.hpp"

#include <stdexcept>

namespace {

constexpr std::uint32_t bound = std::uint32_t{1} << 24;
constexpr std::uint32_t first_multiplier = 112, last_multiplier = 127;
constexpr std::size_t least_multipliers = 4;  // a set takes four different ones

std::vector<bool> sieve() {
  std::vector<bool> prime(bound, true);
  prime[0] = prime[1] = false;
  for (std::uint32_t i = 2; i * i < bound; ++i) {
    if (prime[i]) {
      for (std::uint32_t multiple = i * i; multiple < bound; multiple += i)
        prime[multiple] = false;
    }
  }
  return prime;
}

std::uint32_t power(std::uint64_t base, std::uint32_t exponent, std::uint32_t modulus) {
  std::uint64_t result = 1;
  for (; exponent != 0; exponent >>= 1, base = base * base % modulus) {
    if ((exponent & 1) != 0)
      result = result * base % modulus;
  }
  return static_cast<std::uint32_t>(result);
}

// The prime factors of p - 1 are 2 and (p - 1)/2: a root is what neither quotient takes to 1.
bool is_primitive_root(std::uint32_t a, std::uint32_t p) {
  return power(a, 2, p) != 1 && power(a, (p - 1) / 2, p) != 1;
}

}  // namespace

std::vector<candidate> largest_candidates(std::size_t count) {
  const std::vector<bool> prime = sieve();
  std::vector<candidate> found;
  for (std::uint32_t p = bound - 1; found.size() < count; p -= 2) {
    if (p < bound / 2)
      throw std::runtime_error("too few primes");
    if (!prime[p] || !prime[(p - 1) / 2])
      continue;
    candidate next{p, {}};
    for (std::uint32_t a = first_multiplier; a <= last_multiplier; ++a) {
      if (is_primitive_root(a, p))
        next.multipliers.push_back(a);
    }
    if (next.multipliers.size() >= least_multipliers)
      found.push_back(next);
  }
  return found;
}
