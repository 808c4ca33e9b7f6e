// SPDX-License-Identifier: Apache-2.0
// Loading puts a stream in place of the one that a new engine has; where that one cannot be deleted
// the load says so, and nothing is loaded.
#include <cstdint>
#include <tarn_rvx.h>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "frame/state.hpp"
#include "message.hpp"

namespace {

namespace detail = kestrel::tarn::rng::detail;

TEST(placeholder, that_cannot_be_deleted_is_told) {
  constexpr std::int64_t code = RVX_BRNG_PHILOX4X32X10;
  const tarn_test::plain_stream saved(code, 7);
  const tarn_test::image image = saved.bytes();
  detail::owned_stream stream = detail::new_stream(code, 1);
  rvx_stream damaged = stream.get();
  auto* const mark = static_cast<unsigned char*>(damaged) + 4;
  ASSERT_EQ(*mark, 1);
  *mark = 0;
  EXPECT_EQ(tarn_test::message_of<kestrel::tarn::computation_error>(
                [&] { detail::load_stream(stream, code, image.data()); }),
            "kestrel::tarn::rng::load_state: computation error: failed while creating new engine");
  EXPECT_EQ(stream, nullptr);
  *mark = 1;
  EXPECT_EQ(rvxDeleteStream(&damaged), 0);
}

}  // namespace
