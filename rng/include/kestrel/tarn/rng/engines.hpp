// SPDX-License-Identifier: Apache-2.0
// The thirteen engines. A constructor takes the queue whose device draws, and a seed; it raises
// unsupported_device on a device without a road for the engine, unimplemented on a GPU whose road
// is still missing, and computation_error when the stream cannot be made. A single seed above
// 0x7FFFFFFF travels as two 32-bit words, low word first. The manual has a page for each engine:
// recurrence, period, how words become a state, what it is good for and what it fails.
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
/// A number of sub-streams to choose.
struct TARN_EXPORT custom {
  /// \param count_  0 stands for 40960
  explicit custom(std::uint32_t count_) : count(count_) {}
  /// As given to the constructor.
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
  /// The seed of an engine made without one.
  static constexpr std::uint64_t default_seed = 0;

  ///@{
  /// From a number or from a list, as told above.
  explicit philox4x32x10(sycl::queue queue_, std::uint64_t seed = default_seed);
  philox4x32x10(sycl::queue queue_, std::initializer_list<std::uint64_t> seed);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// ARS-5 (Salmon, Moraes, Dror and Shaw, SC 2011): counter-based on AES rounds, period 2^130 words
/// of 32 bits. CPU queues only.
///
/// The words of a seed fill the key (4), then the counter (4), low words first; missing ones are 0.
/// A scalar seed gives one word up to 0x7FFFFFFF and two above, a list of n 64-bit seeds the first
/// n of its 2n words.
class TARN_EXPORT ars5 : public detail::engine_base<ars5> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint64_t default_seed = 0;

  ///@{
  /// From a number or from a list, as told above.
  explicit ars5(sycl::queue queue_, std::uint64_t seed = default_seed);
  ars5(sycl::queue queue_, std::initializer_list<std::uint64_t> seed);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// MRG32k3a (L'Ecuyer, Operations Research 47, 1999): combined multiple recursive, period near
/// 2^191, words from 1 to 2^32 - 209.
///
/// Up to six words of seed: three of each component, oldest first, reduced by its modulus; missing
/// ones are 1.
class TARN_EXPORT mrg32k3a : public detail::engine_base<mrg32k3a> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number, or from a list of words. A mode is for GPU queues; other queues refuse it with
  /// unsupported_device.
  explicit mrg32k3a(sycl::queue queue_, std::uint32_t seed = default_seed);
  mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::optimal mode);
  mrg32k3a(sycl::queue queue_, std::uint32_t seed, mrg32k3a_mode::custom mode);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
           mrg32k3a_mode::optimal mode);
  mrg32k3a(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
           mrg32k3a_mode::custom mode);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void skip_ahead(std::initializer_list<std::uint64_t> num_to_skip);

  friend struct detail::engine_access;
};

/// Multiplicative congruential, x = 1132489760 x mod 2^31 - 1 (L'Ecuyer, Mathematics of Computation
/// 68, 1999): period 2^31 - 2, words from 1 to 2^31 - 2.
class TARN_EXPORT mcg31m1 : public detail::engine_base<mcg31m1> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  /// From the first word: `seed` modulo 2^31 - 1, and 1 for 0.
  explicit mcg31m1(sycl::queue queue_, std::uint32_t seed = default_seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Multiplicative congruential, x = 13^13 x mod 2^59 (NAG Fortran Library, chapter G05): period
/// 2^57, words of 59 bits.
class TARN_EXPORT mcg59 : public detail::engine_base<mcg59> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint64_t default_seed = 1;

  /// From the first word: `seed` modulo 2^59; an even one with bits 0 and 58 flipped.
  explicit mcg59(sycl::queue queue_, std::uint64_t seed = default_seed);

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Mersenne twister (Matsumoto and Nishimura, ACM TOMACS 8, 1998), period 2^19937 - 1 words of 32
/// bits. A single word goes by the authors' single-word initialisation, more by that of arrays.
///
/// On a GPU queue a skip takes as long as drawing, and after an odd number of generate calls on the
/// engine it has no effect.
class TARN_EXPORT mt19937 : public detail::engine_base<mt19937> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number or from a list of words.
  explicit mt19937(sycl::queue queue_, std::uint32_t seed = default_seed);
  mt19937(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// A set of 6024 Mersenne twisters of period 2^2203 - 1 words of 32 bits, by the method of
/// Matsumoto and Nishimura (Dynamic Creation, MCQMC 1998). Seeded like mt19937.
///
/// Without an index it is, on a GPU queue, one generator for each compute unit of the device: each
/// gives a run of every call, so that results depend on the number of units. Such an engine cannot
/// be saved.
class TARN_EXPORT mt2203 : public detail::engine_base<mt2203> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number or from a list of words. `engine_idx` in [0, 6024) picks a member; without it,
  /// on a CPU queue, it is member 0. Raises invalid_argument past the end of the set.
  explicit mt2203(sycl::queue queue_, std::uint32_t seed = default_seed);
  mt2203(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx);
  mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  mt2203(sycl::queue queue_, std::initializer_list<std::uint32_t> seed, std::uint32_t engine_idx);
  ///@}
};

/// SIMD-oriented fast Mersenne twister (Saito and Matsumoto, MCQMC 2006), period a multiple of
/// 2^19937 - 1 words of 32 bits. Seeded like mt19937, with the authors' certification. CPU queues
/// only.
class TARN_EXPORT sfmt19937 : public detail::engine_base<sfmt19937> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number or from a list of words.
  explicit sfmt19937(sycl::queue queue_, std::uint32_t seed = default_seed);
  sfmt19937(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// Generalised feedback shift register x(n) = x(n-103) xor x(n-250) (Kirkpatrick and Stoll, Journal
/// of Computational Physics 40, 1981), period 2^250 - 1 words of 32 bits. CPU queues only.
///
/// 250 words of seed are the register as it is, and all zero is refused; fewer go by the
/// initialisations of mt19937.
class TARN_EXPORT r250 : public detail::engine_base<r250> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number or from words.
  explicit r250(sycl::queue queue_, std::uint32_t seed = default_seed);
  r250(sycl::queue queue_, std::vector<std::uint32_t> seed);
  ///@}
};

/// A set of 273 Wichmann-Hill generators (Applied Statistics 31, 1982) after Maclaren (Applied
/// Statistics 38, 1989), period near 2^93 words of 32 bits. CPU queues only.
///
/// Four words of seed, one for each component, reduced modulo its prime; missing ones are 1.
class TARN_EXPORT wichmann_hill : public detail::engine_base<wichmann_hill> {
 public:
  /// The seed of an engine made without one.
  static constexpr std::uint32_t default_seed = 1;

  ///@{
  /// From a number or from a list of words. `engine_idx` in [0, 273) picks a member, 0 without it.
  /// Raises invalid_argument past the end of the set.
  explicit wichmann_hill(sycl::queue queue_, std::uint32_t seed = default_seed);
  wichmann_hill(sycl::queue queue_, std::uint32_t seed, std::uint32_t engine_idx);
  wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed);
  wichmann_hill(sycl::queue queue_, std::initializer_list<std::uint32_t> seed,
                std::uint32_t engine_idx);
  ///@}

 private:
  void skip_ahead(std::uint64_t num_to_skip);
  void leapfrog(std::uint64_t idx, std::uint64_t stride);

  friend struct detail::engine_access;
};

/// Sobol sequence in Gray-code order (Antonov and Saleev, 1979; directions of Joe and Kuo, SIAM J.
/// Scientific Computing 30, 2008): points 1 to 2^32 - 1; results run through the dimensions of a
/// point.
class TARN_EXPORT sobol : public detail::engine_base<sobol> {
 public:
  /// The dimensions of an engine made without a count.
  static constexpr std::uint32_t default_dimensions_number = 1;

  /// From a count of dimensions, 1 to 3667.
  explicit sobol(sycl::queue queue_, std::uint32_t dimensions = default_dimensions_number);
  /// From 32 direction words for each dimension, each shifted to the top of its 32 bits. Puts a
  /// header of three words in front of them.
  sobol(sycl::queue queue_, std::vector<std::uint32_t>& direction_numbers);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// Niederreiter sequence in base 2 (Journal of Number Theory 30, 1988): points 1 to 2^32 - 1;
/// results run through the dimensions of a point. CPU queues only.
class TARN_EXPORT niederreiter : public detail::engine_base<niederreiter> {
 public:
  /// The dimensions of an engine made without a count.
  static constexpr std::uint32_t default_dimensions_number = 1;

  /// From a count of dimensions, 1 to 4720.
  explicit niederreiter(sycl::queue queue_, std::uint32_t dimensions = default_dimensions_number);
  /// From irreducible polynomials, one for each dimension: bit i is the coefficient of t^i. Puts a
  /// header of three words in front of them.
  niederreiter(sycl::queue queue_, std::vector<std::uint32_t>& irreducible_polynomials);

 private:
  void skip_ahead(std::uint64_t num_to_skip);

  friend struct detail::engine_access;
};

/// The operating system's source of random bits, or the processor's: no two engines are alike.
/// Raises computation_error where there is no source. CPU queues only.
class TARN_EXPORT nondeterministic : public detail::engine_base<nondeterministic> {
 public:
  /// There is no seed.
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
