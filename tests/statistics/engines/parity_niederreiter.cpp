// SPDX-License-Identifier: Apache-2.0
// Direction words of niederreiter from polynomials of the user, against a plain model with
// polynomials as lists of coefficients; which polynomials are irreducible, against a sieve.
#include "plain_net.hpp"

namespace {

using coefficients = std::vector<unsigned>;  // [i] of t^i, 0 or 1; the last one is 1

coefficients product(const coefficients& a, const coefficients& b) {
  coefficients c(a.size() + b.size() - 1);
  for (std::size_t i = 0; i < a.size(); ++i)
    for (std::size_t j = 0; j < b.size(); ++j)
      c[i + j] ^= a[i] & b[j];
  return c;
}

coefficients coefficients_of(std::uint64_t polynomial) {
  coefficients a;
  for (; polynomial != 0; polynomial >>= 1)
    a.push_back(polynomial & 1);
  return a;
}

std::uint64_t number_of(const coefficients& a) {
  std::uint64_t n = 0;
  for (std::size_t i = 0; i < a.size(); ++i)
    n |= std::uint64_t{a[i]} << i;
  return n;
}

// Bratley, Fox and Niederreiter 1992, sections 2.3 and 3.3: digit j = q e + u + 1 of direction word
// r + 1 is v_(r+u), where v is the sequence of the recurrence with b = p^(q+1), with v_0, ... = 0
// before v_(q e) and all free terms 1. Of the last power, if its degree is above 32, the leading
// term is left out.
std::vector<std::uint32_t> directions(std::uint64_t polynomial) {
  const coefficients p = coefficients_of(polynomial);
  const std::size_t e = p.size() - 1;
  std::vector<std::uint32_t> words(32);
  coefficients b = {1};
  for (std::size_t q = 0; q * e < 32; ++q) {
    b = product(b, p);
    if (b.size() - 1 > 32) {
      b.pop_back();
      while (b.back() == 0)
        b.pop_back();
    }
    const std::size_t order = b.size() - 1;
    std::vector<unsigned> v(32 + e);
    for (std::size_t i = q * e; i < v.size(); ++i) {
      if (i < order)
        v[i] = 1;
      for (std::size_t k = 0; i >= order && k < order; ++k)
        v[i] ^= b[k] & v[i - order + k];
    }
    for (std::size_t u = 0; u < e && q * e + u < 32; ++u)
      for (std::size_t r = 0; r < 32; ++r)
        words[r] |= std::uint32_t{v[r + u]} << (31 - (q * e + u));
  }
  return words;
}

// One polynomial of each degree from 1 to 31, irreducible by Swan's and Zierler and Brillhart's
// tables of trinomials and pentanomials, and the first ones of all.
const std::vector<std::uint32_t> polynomials = {
    0x2,       0x3,       0x7,       0xB,        0xD,        0x13,       0x19,
    0x1F,      0x25,      0x43,      0x83,       0x11B,      0x211,      0x409,
    0x805,     0x1053,    0x201B,    0x4443,     0x8003,     0x1002B,    0x20009,
    0x40081,   0x80027,   0x100009,  0x200005,   0x400003,   0x800021,   0x100001B,
    0x2000009, 0x4000047, 0x8000027, 0x10000009, 0x20000005, 0x40000053, 0x80000009};

std::vector<std::uint32_t> seed_of(const std::vector<std::uint32_t>& chosen) {
  std::vector<std::uint32_t> seed = {static_cast<std::uint32_t>(chosen.size()), 1, 1};
  seed.insert(seed.end(), chosen.begin(), chosen.end());
  return seed;
}

TEST(parity_niederreiter, directions_of_polynomials_of_every_degree) {
  const support::net_stream s(RVX_BRNG_NIEDERR, seed_of(polynomials));
  for (std::size_t d = 0; d < polynomials.size(); ++d) {
    const auto expected = directions(polynomials[d]);
    for (std::size_t k = 0; k < 32; ++k)
      EXPECT_EQ(s.direction(d, k), expected[k])
          << "polynomial " << polynomials[d] << ", word " << k;
    EXPECT_EQ(s.direction(d, 32), 0u);
  }
}

TEST(parity_niederreiter, the_default_is_all_irreducible_polynomials_in_order) {
  constexpr std::size_t bound = 1 << 16, all_dims = 4720;
  std::vector<bool> reducible(bound);
  std::vector<std::uint32_t> irreducible;
  for (std::uint64_t n = 2; n < bound; ++n) {
    if (reducible[n])
      continue;
    irreducible.push_back(static_cast<std::uint32_t>(n));
    const coefficients p = coefficients_of(n);
    for (std::uint64_t m = n; p.size() - 1 + coefficients_of(m).size() - 1 < 16; ++m)
      reducible[number_of(product(p, coefficients_of(m)))] = true;
  }
  ASSERT_EQ(irreducible.size(), all_dims);
  const support::any_stream users(RVX_BRNG_NIEDERR, seed_of(irreducible));
  const support::any_stream by_default(RVX_BRNG_NIEDERR, {all_dims});
  EXPECT_EQ(users.image(), by_default.image());

  // Small numbers one by one, the reducible ones among them.
  std::size_t made = 0;
  for (std::uint32_t n = 0; n < 3000; ++n) {
    const auto seed = seed_of({7, n});
    void* handle = nullptr;
    const int status =
        __rvxNewStreamEx(&handle, RVX_BRNG_NIEDERR, static_cast<int>(seed.size()), seed.data());
    if (n < 2 || reducible[n]) {
      ASSERT_EQ(status, RVX_STATUS_BAD_CODE) << n;
      ASSERT_EQ(handle, nullptr);
    } else {
      ASSERT_EQ(status, RVX_STATUS_OK) << n;
      ASSERT_EQ(__rvxDeleteStream(&handle), RVX_STATUS_OK);
      ++made;
    }
  }
  EXPECT_GT(made, 300u);
}

TEST(parity_niederreiter, reducible_polynomials_of_high_degree_are_refused) {
  const std::uint64_t factors[][2] = {{0x8003, 0x1002B},  // of degrees 15 and 16
                                      {0x3, 0x40000053}, {0x8003, 0x8003}, {0x7, 0x20000005},
                                      {0x43, 0x2000009}, {0x2, 0x40000053}};
  for (const auto& pair : factors) {
    const std::uint64_t n = number_of(product(coefficients_of(pair[0]), coefficients_of(pair[1])));
    ASSERT_LE(n, 0xFFFFFFFF);
    const auto seed = seed_of({static_cast<std::uint32_t>(n)});
    void* handle = nullptr;
    EXPECT_EQ(
        __rvxNewStreamEx(&handle, RVX_BRNG_NIEDERR, static_cast<int>(seed.size()), seed.data()),
        RVX_STATUS_BAD_CODE)
        << n;
  }
}

}  // namespace
