// SPDX-License-Identifier: Apache-2.0
// See equidistribution.hpp. The streams of the v upper output bits, as series in 1/t, and the v
// unit vectors span a lattice over GF(2)[t]. In a reduced basis the longest vector has length
// 2^-k(v) (Couture, L'Ecuyer and Tezuka, "On the distribution of k-dimensional vectors for simple
// and combined Tausworthe sequences", Mathematics of Computation 60, 1993).
//
// A lattice vector that is shorter than 1 consists of the outputs from some state of the twister,
// so the state stands for it: multiplication by t is a step, addition is addition of states (after
// Harase, "An efficient lattice reduction method for F2-linear pseudorandom number generators using
// Mulders and Storjohann algorithm", Journal of Computational and Applied Mathematics 236, 2011).
#include "equidistribution.hpp"

#include <algorithm>
#include <utility>
#include <vector>

namespace tarn::mt2203 {

namespace {

class lattice_vector {
 public:
  // The unit vector of one bit of the output, or the vector of the streams from one state if
  // `leading` is 0.
  lattice_vector(const twister_shape& shape, std::uint32_t leading)
      : words_(static_cast<std::size_t>(shape.words)),
        middle_(static_cast<std::size_t>(shape.middle)),
        buffer_(2 * words_),
        leading_(leading) {
    if (leading == 0)
      buffer_[words_ - 1] = 0x80000000;
  }

  // The coefficients of 2^-depth, the highest power that the vector has.
  std::uint32_t leading() const { return leading_; }
  int depth() const { return depth_; }

  void step(const twister_shape& shape, const parameters& member, std::uint32_t visible) {
    if (first_ == words_) {
      std::copy_n(buffer_.begin() + static_cast<std::ptrdiff_t>(words_), words_, buffer_.begin());
      first_ = 0;
    }
    std::uint32_t* const x = buffer_.data() + first_++;
    const std::uint32_t lower = shape.lower_mask();
    std::uint32_t z = x[middle_] ^ twist((x[0] & ~lower) | (x[1] & lower), member.a);
    x[words_] = z;
    z ^= z >> shape.shift_u;
    z ^= (z << shape.shift_s) & member.b;
    z ^= (z << shape.shift_t) & member.c;
    leading_ = z & visible;
    ++depth_;
  }

  // Adds t^n times the other one, with the n that brings it to this one's depth.
  void add(const lattice_vector& other) {
    std::uint32_t* const to = buffer_.data() + first_;
    const std::uint32_t* const from = other.buffer_.data() + other.first_;
    for (std::size_t i = 0; i < words_; ++i)
      to[i] ^= from[i];
    leading_ ^= other.leading_;
  }

 private:
  std::size_t words_, middle_;
  std::vector<std::uint32_t> buffer_;  // the state is words_ words from first_ on
  std::size_t first_ = 0;
  std::uint32_t leading_;
  int depth_ = 0;
};

}  // namespace

int dimension_of_equidistribution(const twister_shape& shape, const parameters& member, int v) {
  // basis[i] has its highest leading bit at place i: the leading coefficients are independent, and
  // the basis is reduced.
  std::vector<lattice_vector> basis;
  for (int i = 0; i < v; ++i)
    basis.emplace_back(shape, std::uint32_t{0x80000000} >> i);
  const std::uint32_t visible = ~std::uint32_t{0} << (32 - v);

  // One vector too many. It is made shorter until it is 0: its depth cannot pass that of the
  // shortest vector that is not, 2^-state_bits.
  lattice_vector extra(shape, 0);
  while (true) {
    while (extra.leading() == 0 && extra.depth() <= shape.state_bits())
      extra.step(shape, member, visible);
    if (extra.leading() == 0)
      break;
    lattice_vector& pivot = basis[static_cast<std::size_t>(__builtin_clz(extra.leading()))];
    if (pivot.depth() < extra.depth())
      std::swap(pivot, extra);
    extra.add(pivot);
  }
  const auto longest =
      std::min_element(basis.begin(), basis.end(),
                       [](const auto& x, const auto& y) { return x.depth() < y.depth(); });
  return longest->depth();
}

equidistribution measure_equidistribution(const twister_shape& shape, const parameters& member) {
  equidistribution result{};
  for (int v = 1; v <= 32; ++v) {
    const int k = dimension_of_equidistribution(shape, member, v);
    result.k[static_cast<std::size_t>(v)] = k;
    result.defect += shape.state_bits() / v - k;
  }
  return result;
}

}  // namespace tarn::mt2203
