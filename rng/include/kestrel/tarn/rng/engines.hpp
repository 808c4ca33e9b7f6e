// SPDX-License-Identifier: Apache-2.0
// The thirteen engines. A constructor takes a queue and a seed; it raises unsupported_device on a
// device without a road for the engine, unimplemented on a GPU whose road is still missing, and
// computation_error when the stream cannot be made.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <utility>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/engine_base.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng {

/// How mrg32k3a shares its sequence among the work-items of a GPU. Without a tag the serial
/// sequence is kept.
namespace mrg32k3a_mode {
/// 40960 sub-streams.
struct TARN_EXPORT optimal {};
/// `count` sub-streams; 0 stands for 40960.
struct TARN_EXPORT custom {
  explicit custom(std::uint32_t count_) : count(count_) {}
  std::uint32_t count;
};
}  // namespace mrg32k3a_mode

/// Philox 4x32 with ten rounds (Salmon, Moraes, Dror and Shaw, SC 2011): counter-based, period
/// 2^130 words of 32 bits.
///
/// The words of a seed fill key[0], key[1], ctr[0] to ctr[3]; missing ones are 0. A scalar seed
/// gives one word up to 0x7FFFFFFF and two above. Of a list of n 64-bit seeds a GPU queue takes all
/// 2n words and a CPU queue the first n of them.
class TARN_EXPORT philox4x32x10 : public detail::engine_base<philox4x32x10> {
 public:
  static constexpr std::uint64_t default_seed = 0;

  explicit philox4x32x10(sycl::queue queue_, std::uint64_t seed = default_seed);
  philox4x32x10(sycl::queue queue_, std::initializer_list<std::uint64_t> seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// ARS-5 (Salmon, Moraes, Dror and Shaw, SC 2011): counter-based on AES rounds. CPU queues only.
class TARN_EXPORT ars5 : public detail::engine_base<ars5> {
 public:
  static constexpr std::uint64_t default_seed = 0;

  explicit ars5(sycl::queue queue_, std::uint64_t seed = default_seed);
  ars5(sycl::queue queue_, std::initializer_list<std::uint64_t> seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// MRG32k3a (L'Ecuyer, Operations Research 47, 1999): combined multiple recursive, period near
/// 2^191.
class TARN_EXPORT mrg32k3a : public detail::engine_base<mrg32k3a> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit mrg32k3a(sycl::queue queue_, std::uint32_t seed = default_seed);
  mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::optimal mode);
  mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::custom mode);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
           mrg32k3a_mode::optimal mode);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
           mrg32k3a_mode::custom mode);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// Multiplicative congruential, x = 1132489760 x mod 2^31 - 1 (L'Ecuyer 1999).
class TARN_EXPORT mcg31m1 : public detail::engine_base<mcg31m1> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit mcg31m1(sycl::queue queue_, std::uint32_t seed = default_seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Multiplicative congruential, x = 13^13 x mod 2^59.
class TARN_EXPORT mcg59 : public detail::engine_base<mcg59> {
 public:
  static constexpr std::uint64_t default_seed = 1;

  explicit mcg59(sycl::queue queue_, std::uint64_t seed = default_seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Mersenne twister (Matsumoto and Nishimura 1998), period 2^19937 - 1.
class TARN_EXPORT mt19937 : public detail::engine_base<mt19937> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit mt19937(sycl::queue queue_, std::uint32_t seed = default_seed);
  mt19937(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// A set of 6024 Mersenne twisters of period 2^2203 - 1; `engine_idx` in [0, 6024) picks one.
class TARN_EXPORT mt2203 : public detail::engine_base<mt2203> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit mt2203(sycl::queue queue_, std::uint32_t seed = default_seed);
  mt2203(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx);
  mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed, std::uint32_t engine_idx);
};

/// SIMD-oriented fast Mersenne twister (Saito and Matsumoto 2008). CPU queues only.
class TARN_EXPORT sfmt19937 : public detail::engine_base<sfmt19937> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit sfmt19937(sycl::queue queue_, std::uint32_t seed = default_seed);
  sfmt19937(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// Generalised feedback shift register x(n) = x(n-103) xor x(n-250) (Kirkpatrick and Stoll 1981).
/// CPU queues only.
class TARN_EXPORT r250 : public detail::engine_base<r250> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit r250(sycl::queue queue_, std::uint32_t seed = default_seed);
  r250(sycl::queue queue_, std::vector<std::uint32_t> seed);
};

/// A set of 273 Wichmann-Hill generators after Maclaren; `engine_idx` in [0, 273) picks one. CPU
/// queues only.
class TARN_EXPORT wichmann_hill : public detail::engine_base<wichmann_hill> {
 public:
  static constexpr std::uint32_t default_seed = 1;

  explicit wichmann_hill(sycl::queue queue_, std::uint32_t seed = default_seed);
  wichmann_hill(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx);
  wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
                std::uint32_t engine_idx);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Sobol sequence in Gray-code order; results run through the dimensions of a point.
class TARN_EXPORT sobol : public detail::engine_base<sobol> {
 public:
  static constexpr std::uint32_t default_dimensions_number = 1;

  explicit sobol(sycl::queue queue_, std::uint32_t dimensions = default_dimensions_number);
  /// 32 direction words for each dimension. Puts a header of three words in front of them.
  sobol(sycl::queue queue_, std::vector<std::uint32_t>& direction_numbers);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// Niederreiter sequence in base 2; results run through the dimensions of a point. CPU queues only.
class TARN_EXPORT niederreiter : public detail::engine_base<niederreiter> {
 public:
  static constexpr std::uint32_t default_dimensions_number = 1;

  explicit niederreiter(sycl::queue queue_, std::uint32_t dimensions = default_dimensions_number);
  /// Bit i of a polynomial is the coefficient of t^i. Puts a header of three words in front of
  /// them.
  niederreiter(sycl::queue queue_, std::vector<std::uint32_t>& irreducible_polynomials);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// The processor's hardware source of random bits. CPU queues only.
class TARN_EXPORT nondeterministic : public detail::engine_base<nondeterministic> {
 public:
  explicit nondeterministic(sycl::queue queue_);
};

namespace detail {

/// The library's own way into an engine. A service that the engine lacks drops out of overload
/// resolution.
struct engine_access {
  template <typename Engine>
  static engine_base_impl<Engine>* impl(engine_base<Engine>& engine) {
    return engine.impl.get();
  }
  template <typename Engine, typename Count>
  static auto skip_ahead(Engine& engine, Count num_to_skip)
      -> decltype(engine.skip_ahead(num_to_skip)) {
    engine.skip_ahead(num_to_skip);
  }
  template <typename Engine>
  static auto leapfrog(Engine& engine, std::uint64_t idx, std::uint64_t stride)
      -> decltype(engine.leapfrog(idx, stride)) {
    engine.leapfrog(idx, stride);
  }
};

}  // namespace detail

}  // namespace kestrel::tarn::rng
