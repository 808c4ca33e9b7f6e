// SPDX-License-Identifier: Apache-2.0
// Failures of the stream services below an engine, as a caller sees them. A stream whose mark is
// cleared stands for whatever makes a service fail.
#include <cstdint>
#include <string>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "frame/engine_backend.hpp"
#include "message.hpp"
#include "queues.hpp"
#include "silence.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using engine_type = rng::philox4x32x10;
using tarn_test::draw;
using tarn_test::marker;
using tarn_test::silence;

/// Takes the mark off an engine's stream for as long as it lives.
class spoiled {
 public:
  explicit spoiled(engine_type& engine)
      : mark_(static_cast<std::uint8_t*>(rng::detail::engine_access::impl(engine)->stream.get()) +
              4) {
    EXPECT_EQ(*mark_, 1);
    *mark_ = 0;
  }
  spoiled(const spoiled&) = delete;
  spoiled& operator=(const spoiled&) = delete;
  ~spoiled() { *mark_ = 1; }

 private:
  std::uint8_t* mark_;
};

class failing_service : public tarn_test::over_queues {
 protected:
  template <typename Call>
  static std::string failure(Call call) {
    return tarn_test::message_of<tarn::computation_error>(call);
  }

  const silence reports;
  engine_type engine{queue(), 7};
};
TARN_OVER_QUEUES(failing_service);

TEST_P(failing_service, copies_raise_and_leave_the_target_as_it_was) {
  const std::string message =
      "kestrel::tarn::rng::engine initialization: computation error: initialization failure";
  engine_type target(tarn_test::cpu_queue(), 8);
  {
    const spoiled mark(engine);
    EXPECT_EQ(failure([&] { engine_type copy(engine); }), message);
    EXPECT_EQ(failure([&] { target = engine; }), message);
  }
  engine_type same(tarn_test::cpu_queue(), 8);
  EXPECT_EQ(target.get_queue().get_device(), same.get_queue().get_device());
  EXPECT_EQ(draw(rng::bits<>(), target, 6), draw(rng::bits<>(), same, 6));
}

TEST_P(failing_service, skips_raise_an_empty_text) {
  const spoiled mark(engine);
  const std::string message = "kestrel::tarn::rng::skip_ahead: computation error";
  EXPECT_EQ(failure([&] { rng::skip_ahead(engine, 1); }), message);
  EXPECT_EQ(failure([&] { rng::skip_ahead(engine, {1, 2}); }), message);
}

TEST_P(failing_service, images_raise_their_texts) {
  const spoiled mark(engine);
  std::uint8_t image[256];
  EXPECT_EQ(failure([&] { rng::get_state_size(engine); }),
            "kestrel::tarn::rng::get_state_size: computation error: failed to get state size");
  EXPECT_EQ(failure([&] { rng::save_state(engine, image); }),
            "kestrel::tarn::rng::save_state: computation error: failed to save state to the "
            "memory");
  EXPECT_EQ(failure([&] { rng::save_state(engine, testing::TempDir() + "tarn_unsaved"); }),
            "kestrel::tarn::rng::save_state: computation error: failed to save state to the file");
}

// On a GPU queue the skip of a call fails and nothing is launched; on a CPU queue the routine
// reports, and the call has no way to tell.
TEST_P(failing_service, generate_writes_nothing) {
  float value = marker<float>();
  const spoiled mark(engine);
  const std::string raised =
      failure([&] { rng::generate(rng::uniform<float>(), engine, 1, &value); });
  EXPECT_EQ(raised, queue().get_device().is_gpu()
                        ? "kestrel::tarn::rng::skip_ahead: computation error"
                        : "[nothing raised]");
  EXPECT_TRUE(tarn_test::same_bits(value, marker<float>()));
}

}  // namespace
