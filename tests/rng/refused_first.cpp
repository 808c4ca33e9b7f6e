// SPDX-License-Identifier: Apache-2.0
// A combination that no device offers is refused before the count, the output and the device are
// looked at.
#include <cstdint>

#include <gtest/gtest.h>

#include "frame/generate.hpp"
#include "message.hpp"

namespace {

namespace rng = kestrel::tarn::rng;

TEST(refused_combination, comes_before_every_other_check) {
  // The engine is not looked at either, so memory of its size will do.
  alignas(rng::mcg31m1) unsigned char memory[sizeof(rng::mcg31m1)] = {};
  auto& engine = *reinterpret_cast<rng::mcg31m1*>(memory);
  const rng::uniform_bits<std::uint64_t> distr;
  EXPECT_EQ(tarn_test::message_of<kestrel::tarn::unimplemented>([&] {
              rng::detail::generate_on_device<rng::uniform_bits<std::uint64_t>, rng::mcg31m1,
                                              std::uint64_t*>(distr, engine, -1, nullptr, {});
            }),
            "kestrel::tarn::rng::generate: unimplemented functionality: uniform_bits distribution "
            "and mcg31m1 engine combination");
}

}  // namespace
