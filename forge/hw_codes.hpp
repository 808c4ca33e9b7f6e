// SPDX-License-Identifier: Apache-2.0
// The numberings of device generations, and the tables between them.
#pragma once

#include <cstdint>

namespace kestrel::tarn::forge {

/// The generator's numbering of hardware generations.
enum hw_code : std::int32_t {
  hw_unknown = 0,
  hw_fir = 1,
  hw_unserved = 2,  // has no name: known when met, and not served
  hw_elm = 3,
  hw_ash = 4,
  hw_oak = 5,
  hw_yew = 6,
  hw_pine = 7,
  hw_larch = 8,
};

/// A finer numbering, 0 (unknown) to 14.
using family_code = std::int32_t;

/// What is known about a device. `stepping` is the revision of the hardware.
struct detected_hw {
  hw_code hw = hw_unknown;
  family_code family = 0;
  std::uint32_t stepping = 0;
};

/// The family that stands for a generation when nothing finer is known.
family_code default_family(hw_code hw) noexcept;

/// The generation to which a family belongs; hw_unknown for numbers below 1.
hw_code hw_of_family(family_code family) noexcept;

/// The generation with a core family number, as device binaries state it; hw_unknown for others.
hw_code hw_of_core_family(std::uint32_t number) noexcept;

/// The core family number with which new binaries of a generation are marked; 0 for generations for
/// which none are written.
std::uint32_t core_family_of_hw(hw_code hw) noexcept;

/// The family of a product number, as device binaries state it; 0 for others.
family_code family_of_product(std::uint32_t number) noexcept;

/// What the word says that a driver gives as the version of a device's instruction set: major
/// number from bit 22 on, release in bits 14 to 21, stepping in bits 0 to 5. All 0 for combinations
/// that are not known.
detected_hw hw_of_ip_version(std::uint32_t ip_version) noexcept;

/// Fills in the one of generation and family that is 0 from the other one.
detected_hw with_missing_code(detected_hw found) noexcept;

}  // namespace kestrel::tarn::forge
