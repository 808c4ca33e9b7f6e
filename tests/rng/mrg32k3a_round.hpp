// SPDX-License-Identifier: Apache-2.0
// The sub-sequences of mrg32k3a as a serial model: plain generators 2^76 steps apart that are read
// in turn, in plain division.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include "distributions/gaussian.hpp"
#include "distributions/uniform.hpp"
#include "models/mrg32k3a_model.hpp"

namespace tarn_test {

namespace rng = kestrel::tarn::rng;

/// The model's state behind the seed words of the engine, of which missing ones are 1.
inline plain_mrg::model mrg32k3a_seeded(const std::vector<std::uint32_t>& seed) {
  std::uint32_t words[6] = {1, 1, 1, 1, 1, 1};
  for (std::size_t i = 0; i < seed.size(); ++i) {
    words[i] = seed[i];
  }
  return {{words[0], words[1], words[2]}, {words[3], words[4], words[5]}};
}

inline float mrg32k3a_real(std::uint32_t word, float lo, float hi) {
  return std::fma(static_cast<float>(word), (hi - lo) / 4294967040.0f, lo);
}
inline double mrg32k3a_real(std::uint32_t word, double lo, double hi) {
  return std::fma(static_cast<double>(word), (hi - lo) / 4294967087.0, lo);
}

class mrg32k3a_round {
 public:
  mrg32k3a_round(const std::vector<std::uint32_t>& seed, std::size_t count) {
    using plain_mrg::cpp_int;
    const plain_mrg::square x =
        plain_mrg::power(plain_mrg::x_step, cpp_int(1) << 76, plain_mrg::m1);
    const plain_mrg::square y =
        plain_mrg::power(plain_mrg::y_step, cpp_int(1) << 76, plain_mrg::m2);
    generators_.push_back(mrg32k3a_seeded(seed));
    while (generators_.size() < count) {
      const plain_mrg::model& last = generators_.back();
      generators_.push_back(
          {plain_mrg::image(x, last.x, plain_mrg::m1), plain_mrg::image(y, last.y, plain_mrg::m2)});
    }
  }

  /// The next `n` results of `distr`. Each generator's own results follow each other in its own
  /// sequence; those that are made by twos or fours begin anew with each call.
  template <typename Distr>
  std::vector<typename Distr::result_type> draw(const Distr& distr, std::uint64_t n) {
    using T = typename Distr::result_type;
    using impl = rng::detail::distribution_impl<T, Distr, rng::detail::device_type::gpu>;
    using functor = typename impl::functor;
    using R = typename functor::source;
    constexpr std::size_t results = functor::results;
    const functor kernel = impl(distr).kernel;
    const auto range = kernel.range();

    std::vector<std::vector<std::size_t>> own(generators_.size());  // numbers of results
    for (std::size_t k = 0; k < n; ++k) {
      own[(position_ + k) % own.size()].push_back(k);
    }
    std::vector<T> values(n);
    for (std::size_t i = 0; i < own.size(); ++i) {
      plain_mrg::model ahead = generators_[i];
      sycl::vec<T, static_cast<int>(results)> block;
      for (std::size_t j = 0; j < own[i].size(); ++j) {
        if (j % results == 0) {
          sycl::vec<R, 4> reals;
          for (int k = 0; k < 4; ++k) {
            reals[k] = mrg32k3a_real(ahead.next(), range.lo, range.hi);
          }
          block = kernel(reals);
        }
        values[own[i][j]] = block[static_cast<int>(j % results)];
      }
      for (std::size_t words = own[i].size() * (4 / results); words > 0; --words) {
        generators_[i].next();
      }
    }
    position_ = (position_ + n) % own.size();
    return values;
  }

  /// Each generator passes its own of the next `n` words; the place in the round stays.
  void skip(std::uint64_t n) {
    const std::size_t count = generators_.size();
    for (std::size_t i = 0; i < count; ++i) {
      const std::size_t turn = (i + count - position_) % count;  // when it is next, from 0 on
      const std::uint64_t rounds = n / count;
      generators_[i].skip(rounds + (turn < n % count ? 1 : 0));
    }
  }

 private:
  std::vector<plain_mrg::model> generators_;
  std::size_t position_ = 0;
};

}  // namespace tarn_test
