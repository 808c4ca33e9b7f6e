// SPDX-License-Identifier: Apache-2.0
// Published words of philox4x32x10 through generate, on the host road and on the device road.
#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "kat/philox_cases.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;

class published : public tarn_test::over_queues {};
TARN_OVER_QUEUES(published);

TEST_P(published, philox4x32x10) {
  const auto cases = tarn::kat::philox_cases(TARN_KAT_FOLDER);
  ASSERT_GE(cases.size(), 9u + 10u + 3u);  // blocks, stream positions, carries and far blocks
  for (const auto& known : cases) {
    auto engine = tarn_test::philox_at(queue(), known.key, known.ctr);
    rng::skip_ahead(engine, {known.skip[0], known.skip[1]});
    EXPECT_EQ(tarn_test::draw(rng::bits<>(), engine, static_cast<std::int64_t>(known.words.size())),
              known.words)
        << "line " << known.line << " of philox4x32x10.txt";
  }
}

}  // namespace
