// SPDX-License-Identifier: Apache-2.0
// Every allocation of every operation on every engine fails once, alone and with all behind it:
// the operation raises what is documented and leaves all as it was, or it succeeds; nothing leaks.
#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <iterator>
#include <new>
#include <optional>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "core/child_process.hpp"
#include "every_engine.hpp"
#include "failing_memory.hpp"
#include "silence.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

/// Waits until no more than `count` blocks live: on a GPU queue a worker gives the blocks of a
/// command back some time after the command is complete. A leak is a count that never comes.
std::int64_t settled_blocks(std::int64_t count) {
  for (int naps = 0; live_blocks() > count && naps < 2000; ++naps) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return live_blocks();
}

/// Runs `attempt` with the `number`-th allocation failing; whether it came to its end.
template <typename Attempt>
bool passes(const Attempt& attempt, failing_memory& memory) {
  try {
    attempt();
    memory.end();
    return true;
  } catch (const std::bad_alloc&) {
    memory.end();
  } catch (const tarn::computation_error&) {
    memory.end();
  }
  EXPECT_TRUE(memory.happened());
  return false;
}

/// Runs `once` and expects that it gives all blocks back. A thread of the runtime keeps what it has
/// needed for its first work-group with a barrier, whenever that is, so there are more runs, at
/// least as many as threads; a leak shows in each of them.
template <typename Run>
void expect_all_given_back(const Run& once) {
  constexpr int runs = 8;
  std::int64_t kept = 1;
  for (int run = 0; run < runs && kept != 0 && !testing::Test::HasFailure(); ++run) {
    const std::int64_t before = live_blocks();
    once();
    kept = settled_blocks(before) - before;
  }
  EXPECT_EQ(kept, 0) << "blocks are lost";
}

/// For each allocation that an operation makes: prepare() makes what it works on, attempt(it) is
/// the operation, and check(it, passed) looks at what is there afterwards, with memory again.
template <typename Prepare, typename Attempt, typename Check>
void expect_survival(const Prepare& prepare, const Attempt& attempt, const Check& check) {
  for (const failing which : {failing::one, failing::all_from_there}) {
    bool happened = true;
    int number = 0;
    while (happened && !testing::Test::HasFailure()) {
      SCOPED_TRACE("allocation " + std::to_string(++number));
      expect_all_given_back([&] {
        auto subject = prepare();
        bool passed = false;
        {
          failing_memory memory(number, which);
          passed = passes([&] { attempt(subject); }, memory);
          happened = memory.happened();
        }
        check(subject, passed);
      });
    }
    EXPECT_GT(number, 1) << "nothing was allocated";
  }
}

template <typename Case>
class failing_allocations : public over_cases<Case> {
 protected:
  using engine_type = typename Case::Engine;

  // What is made once and kept, such as tables and threads, is made here.
  void SetUp() override {
    engine_type engine = Case::make(queue_);
    draw(rng::uniform<float>(), engine, words);
    draw_into_buffer(rng::uniform<float>(), engine, words);
    before_ = image_of(engine);
    draw(rng::uniform<float>(), engine, words);
    after_ = image_of(engine);
  }

  engine_type prepared() { return rng::load_state<engine_type>(queue_, before_.data()); }
  static void expect_state(engine_type& engine, const image& expected) {
    EXPECT_EQ(image_of(engine), expected);
  }

  const silence reports_;
  static constexpr std::int64_t words = 5;
  sycl::queue queue_ = Case::queue();
  image before_, after_;  // a state, and `words` words later
};
TYPED_TEST_SUITE(failing_allocations, every_case, case_name);

TYPED_TEST(failing_allocations, of_construction) {
  using Engine = typename TypeParam::Engine;
  auto seeded = TypeParam::make(this->queue_);
  const image expected = image_of(seeded);
  expect_survival([] { return std::optional<Engine>(); },
                  [&](auto& engine) { engine.emplace(TypeParam::make(this->queue_)); },
                  [&](auto& engine, bool passed) {
                    ASSERT_EQ(engine.has_value(), passed);
                    if (passed) {
                      this->expect_state(*engine, expected);
                    }
                  });
}

TYPED_TEST(failing_allocations, of_copies) {
  using Engine = typename TypeParam::Engine;
  auto source = this->prepared();
  expect_survival([] { return std::optional<Engine>(); },
                  [&](auto& engine) { engine.emplace(source); },
                  [&](auto& engine, bool passed) {
                    ASSERT_EQ(engine.has_value(), passed);
                    if (passed) {
                      this->expect_state(*engine, this->before_);
                    }
                    this->expect_state(source, this->before_);
                  });
}

TYPED_TEST(failing_allocations, of_assignments) {
  auto source = this->prepared();
  auto other = TypeParam::make(cpu_queue(), 9);
  const image kept = image_of(other);
  expect_survival([&] { return TypeParam::make(cpu_queue(), 9); },
                  [&](auto& engine) { engine = source; },
                  [&](auto& engine, bool passed) {
                    this->expect_state(engine, passed ? this->before_ : kept);
                    EXPECT_TRUE(engine.get_queue() == source.get_queue() ? passed : !passed);
                    this->expect_state(source, this->before_);
                  });
}

TYPED_TEST(failing_allocations, of_loading) {
  using Engine = typename TypeParam::Engine;
  const core_test::scratch_folder folder;
  const std::string file = folder / "state";
  auto source = this->prepared();
  rng::save_state(source, file);
  for (const bool from_file : {false, true}) {
    expect_survival(
        [] { return std::optional<Engine>(); },
        [&](auto& engine) {
          engine.emplace(from_file ? rng::load_state<Engine>(this->queue_, file)
                                   : rng::load_state<Engine>(this->queue_, this->before_.data()));
        },
        [&](auto& engine, bool passed) {
          ASSERT_EQ(engine.has_value(), passed);
          if (passed) {
            this->expect_state(*engine, this->before_);
          }
        });
  }
}

TYPED_TEST(failing_allocations, of_saving_to_a_file) {
  const core_test::scratch_folder folder;
  const std::string file = folder / "state";
  const std::string whole(this->before_.begin(), this->before_.end());
  expect_survival(
      [&] {
        std::remove(file.c_str());
        return this->prepared();
      },
      [&](auto& engine) { rng::save_state(engine, file); },
      [&](auto& engine, bool passed) {
        this->expect_state(engine, this->before_);
        EXPECT_EQ(core_test::contents(file), passed ? whole : "");
        const auto files = std::filesystem::directory_iterator(folder.path());
        EXPECT_EQ(std::distance(files, {}), passed ? 1 : 0);
      });
}

/// An engine and where it draws to: sycl::buffer<float, 1>, or memory of the device.
template <typename Engine, typename Output>
struct drawing {
  Engine engine;
  Output output;
};

// A call that raises may have moved the engine past it, and never to another place.
TYPED_TEST(failing_allocations, of_drawing) {
  using Engine = typename TypeParam::Engine;
  const float unwritten = marker<float>();
  const auto expect_survival_of = [&](const auto& prepare, const auto& last_value) {
    expect_survival(
        prepare,
        [&](auto& on) { rng::generate(rng::uniform<float>(), on.engine, this->words, on.output); },
        [&](auto& on, bool passed) {
          this->queue_.wait();
          const image state = image_of(on.engine);
          if (TypeParam::repeats()) {  // else there is one state, before and after
            EXPECT_TRUE(state == this->after_ || (!passed && state == this->before_));
          }
          EXPECT_TRUE(!passed || !same_bits(last_value(on.output), unwritten));
        });
  };
  constexpr std::int64_t last = TestFixture::words - 1;
  float* const memory = sycl::malloc_shared<float>(TestFixture::words, this->queue_);
  expect_survival_of(
      [&] {
        std::fill_n(memory, TestFixture::words, unwritten);
        return drawing<Engine, float*>{this->prepared(), memory};
      },
      [](const float* output) { return output[last]; });
  sycl::free(memory, this->queue_);

  using buffer_type = sycl::buffer<float, 1>;
  const std::vector<float> filled(TestFixture::words, unwritten);
  expect_survival_of(
      [&] {
        return drawing<Engine, buffer_type>{this->prepared(),
                                            buffer_type(filled.begin(), filled.end())};
      },
      [](buffer_type& output) { return output.get_host_access()[last]; });
}

template <typename Case>
class failing_skips : public failing_allocations<Case> {};
TYPED_TEST_SUITE(failing_skips, skipping_cases, case_name);

// A far skip; those of the large twisters need room, and on a GPU as long as drawing.
TYPED_TEST(failing_skips, leave_the_engine_where_it_was) {
  using Engine = typename TypeParam::Engine;
  constexpr bool by_steps = TypeParam::on_gpu && std::is_same_v<Engine, rng::mt19937>;
  constexpr std::uint64_t far = by_steps ? 10000 : std::uint64_t{1} << 30;
  auto skipped = this->prepared();
  rng::skip_ahead(skipped, far);
  const image moved = image_of(skipped);
  bool happened = true;
  for (int number = 1; happened && !testing::Test::HasFailure(); ++number) {
    expect_all_given_back([&] {
      auto engine = this->prepared();
      bool passed = false;
      {
        failing_memory memory(number, failing::one);
        passed = passes([&] { rng::skip_ahead(engine, far); }, memory);
        happened = memory.happened();
      }
      this->expect_state(engine, passed ? moved : this->before_);
    });
  }
}

// The vectors of the quasi-random engines belong to the caller.
template <typename Engine>
void expect_table_is_kept(const std::vector<std::uint32_t>& table) {
  std::vector<std::uint32_t> headed = table;
  const Engine made(cpu_queue(), headed);
  ASSERT_EQ(headed.size(), table.size() + 3);
  const sycl::queue queue = cpu_queue();
  expect_survival([&] { return table; }, [&](auto& given) { Engine engine(queue, given); },
                  [&](auto& given, bool passed) { EXPECT_EQ(given, passed ? headed : table); });
}

TEST(failing_tables, stay_as_they_were) {
  const silence reports;
  std::vector<std::uint32_t> directions;
  for (unsigned bit = 0; bit < 32; ++bit) {
    directions.push_back(0x80000000u >> bit);
  }
  expect_table_is_kept<rng::sobol>(directions);
  expect_table_is_kept<rng::niederreiter>({2, 3, 7});
}

}  // namespace
