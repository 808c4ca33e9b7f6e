// SPDX-License-Identifier: Apache-2.0
// The words of an engine themselves, raw or as equidistributed bits.
#pragma once

#include <cstdint>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/type_list.hpp>

namespace kestrel::tarn::rng {

/// Raw words of the engine, of the engine's own width (Philox: 32 bits, mcg31m1: 31 bits). A word
/// of mcg59 has 59 bits and takes two values, low part first.
template <typename UIntType = std::uint32_t>
class TARN_EXPORT bits {
  static_assert(detail::is_one_of<UIntType, std::uint32_t>,
                "bits: the result type is std::uint32_t");

 public:
  /// The argument of the template.
  using result_type = UIntType;
};

/// 32 or 64 independent fair bits for one result. Offered by engines whose words hold 32
/// equidistributed bits; the others raise unimplemented. A 64-bit result takes two words, the first
/// one in its low half.
template <typename UIntType = std::uint32_t>
class TARN_EXPORT uniform_bits {
  static_assert(detail::is_one_of<UIntType, std::uint32_t, std::uint64_t>,
                "uniform_bits: the result type is std::uint32_t or std::uint64_t");

 public:
  /// The argument of the template.
  using result_type = UIntType;
};

}  // namespace kestrel::tarn::rng
