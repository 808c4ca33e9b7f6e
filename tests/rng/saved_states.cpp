// SPDX-License-Identifier: Apache-2.0
// Saved states of every engine: in memory, in files, on another kind of device, in another process;
// and what is refused.
#include <cstdint>
#include <fstream>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "core/child_process.hpp"
#include "every_engine.hpp"
#include "message.hpp"
#include "silence.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;
using core_test::scratch_folder;

template <typename Case>
class saved_states : public over_cases<Case> {
  const silence reports_;
};
TYPED_TEST_SUITE(saved_states, every_case, case_name);

/// A queue on each kind of device that the engine has a road for.
template <typename Case>
std::vector<sycl::queue> roads() {
  std::vector<sycl::queue> queues = {cpu_queue()};
  if (Case::gpu) {
    queues.push_back(gpu_queue());
  }
  return queues;
}

const std::string not_from_memory =
    "kestrel::tarn::rng::load_state: computation error: failed to load state from the memory";
const std::string not_from_file =
    "kestrel::tarn::rng::load_state: computation error: failed to load state from the file";
const std::string not_to_file =
    "kestrel::tarn::rng::save_state: computation error: failed to save state to the file";

template <typename Call>
std::string failure(const Call& call) {
  return message_of<tarn::computation_error>(call);
}

void write_file(const std::string& name, const image& bytes, std::size_t size) {
  std::ofstream(name, std::ios::binary)
      .write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(size));
}

/// Whether a state of this case is saved again on `queue` byte for byte: a twister on a GPU has no
/// place inside a block, and saves whole ones.
template <typename Case>
bool is_kept_by(const sycl::queue& queue) {
  using Engine = typename Case::Engine;
  constexpr bool twister =
      std::is_same_v<Engine, rng::mt19937> || std::is_same_v<Engine, rng::mt2203>;
  return !twister || Case::on_gpu || !queue.get_device().is_gpu();
}

TYPED_TEST(saved_states, go_on_where_they_were_saved_on_every_road) {
  using Engine = typename TypeParam::Engine;
  const scratch_folder folder;
  const std::string file = folder / "state";
  for (const std::int64_t before : {0, 11, 1000}) {
    auto engine = TypeParam::make();
    next(engine, before);
    const image saved = image_of(engine);
    ASSERT_GE(saved.size(), 16u);  // a source without a state is a header alone
    rng::save_state(engine, file);
    EXPECT_EQ(core_test::contents(file), std::string(saved.begin(), saved.end()));
    for (const sycl::queue& queue : roads<TypeParam>()) {
      auto from_memory = rng::load_state<Engine>(queue, saved.data());
      auto from_file = rng::load_state<Engine>(queue, file);
      EXPECT_EQ(from_memory.get_queue(), queue);
      if (is_kept_by<TypeParam>(queue)) {
        EXPECT_EQ(image_of(from_memory), saved);
      }
      EXPECT_EQ(image_of(from_file), image_of(from_memory));
      expect_next<TypeParam>(from_memory, before, 9);
      expect_next<TypeParam>(from_file, before, 9);
    }
    expect_next<TypeParam>(engine, before, 9);  // saving moves nothing
  }
}

TYPED_TEST(saved_states, fill_as_many_bytes_as_is_said) {
  auto engine = TypeParam::make();
  next(engine, 5);
  const auto size = static_cast<std::size_t>(rng::get_state_size(engine));
  image bytes(size + guard_size, marker<std::uint8_t>());
  rng::save_state(engine, bytes.data());
  for (std::size_t i = size; i < bytes.size(); ++i) {
    EXPECT_EQ(bytes[i], marker<std::uint8_t>()) << i;
  }
  EXPECT_EQ(bytes[4], 1);  // the mark of a stream
}

// The header's sixteen bytes are all under its sum; the states are not searched byte by byte.
TYPED_TEST(saved_states, that_are_damaged_are_refused) {
  using Engine = typename TypeParam::Engine;
  const sycl::queue queue = TypeParam::queue();
  const scratch_folder folder;
  const std::string file = folder / "state";
  auto engine = TypeParam::make();
  const image saved = image_of(engine);
  for (std::size_t i = 0; i < saved.size(); i += i < 16 ? 1 : saved.size() / 5) {
    image damaged = saved;
    damaged[i] = static_cast<std::uint8_t>(damaged[i] ^ 0x10);
    EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, damaged.data()); }), not_from_memory)
        << "byte " << i;
    write_file(file, damaged, damaged.size());
    EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, file); }), not_from_file)
        << "byte " << i;
  }
  for (const std::size_t size : {std::size_t{0}, std::size_t{15}, saved.size() - 1}) {
    write_file(file, saved, size);
    EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, file); }), not_from_file) << size;
  }
  const std::uint8_t* const none = nullptr;
  EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, none); }), not_from_memory);
}

struct saved_engine {
  std::int64_t code;
  image bytes;
};

/// The state of an engine of every kind.
std::vector<saved_engine> all_saved() {
  std::vector<saved_engine> all;
  for_every_engine([&](const auto& on) {
    auto engine = on.make();
    all.push_back({on.code, image_of(engine)});
  });
  return all;
}

TYPED_TEST(saved_states, of_another_engine_are_refused) {
  using Engine = typename TypeParam::Engine;
  const scratch_folder folder;
  const std::string file = folder / "state";
  int others = 0;
  for (const saved_engine& saved : all_saved()) {
    write_file(file, saved.bytes, saved.bytes.size());
    const bool same = saved.code == TypeParam::code;
    others += same ? 0 : 1;
    EXPECT_EQ(failure([&] { rng::load_state<Engine>(TypeParam::queue(), saved.bytes.data()); }),
              same ? "[nothing raised]" : not_from_memory);
    EXPECT_EQ(failure([&] { rng::load_state<Engine>(TypeParam::queue(), file); }),
              same ? "[nothing raised]" : not_from_file);
  }
  EXPECT_EQ(others, 12);
}

TYPED_TEST(saved_states, without_a_file_are_refused) {
  using Engine = typename TypeParam::Engine;
  const sycl::queue queue = TypeParam::queue();
  const scratch_folder folder;
  auto engine = TypeParam::make();
  next(engine, 3);
  const std::string missing = folder / "missing";
  const std::string nowhere = folder / "no/such/folder";
  const std::string unwritable = "/proc/tarn_state";  // for the superuser, too
  EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, missing); }), not_from_file);
  EXPECT_EQ(failure([&] { rng::load_state<Engine>(queue, folder.path()); }), not_from_file);
  for (const std::string& target : {folder.path(), nowhere, unwritable, std::string()}) {
    EXPECT_EQ(failure([&] { rng::save_state(engine, target); }), not_to_file) << target;
  }
  expect_next<TypeParam>(engine, 3, 9);
}

// The placeholder that a state is loaded into needs a device with a road, like any engine.
TYPED_TEST(saved_states, are_refused_on_a_device_without_a_road_like_construction) {
  using Engine = typename TypeParam::Engine;
  auto engine = TypeParam::make();
  const image saved = image_of(engine);
  const sycl::queue queue = accelerator_queue();
  EXPECT_EQ(
      message_of<tarn::unsupported_device>([&] { rng::load_state<Engine>(queue, saved.data()); }),
      std::string("kestrel::tarn::rng::") + TypeParam::name +
          ": unsupported device: " + queue.get_device().get_info<sycl::info::device::name>());
}

// Members of a set are one engine: the image says which member it is of.
TEST(saved_members, of_a_set_stay_that_member) {
  rng::mt2203 engine(cpu_queue(), 7, 6023);
  next(engine, 5);
  const image saved = image_of(engine);
  auto loaded = rng::load_state<rng::mt2203>(cpu_queue(), saved.data());
  EXPECT_EQ(image_of(loaded), saved);
  EXPECT_EQ(next(loaded, 9), next(engine, 9));
}

/// What the child program drew after saving to, or loading from, a file.
std::string drawn_by_child(const char* action, const char* engine, bool on_gpu,
                           const std::string& file) {
  const auto child =
      core_test::run(TARN_STATE_CHILD, {action, engine, on_gpu ? "gpu" : "cpu", file});
  EXPECT_EQ(child.exit_code, 0) << action << " " << engine << ": " << child.err;
  EXPECT_EQ(core_test::lines_with(child.out, "drawn"), 20) << child.out;
  return child.out;
}

TYPED_TEST(saved_states, go_on_in_another_process) {
  const scratch_folder folder;
  const std::string file = folder / "state";
  const std::string saved = drawn_by_child("save", TypeParam::name, TypeParam::on_gpu, file);
  for (const sycl::queue& queue : roads<TypeParam>()) {
    const std::string loaded =
        drawn_by_child("load", TypeParam::name, queue.get_device().is_gpu(), file);
    if (TypeParam::repeats()) {
      EXPECT_EQ(loaded, saved);
    } else {
      EXPECT_NE(loaded, saved);  // 20 doubles from a source of entropy
    }
  }
}

}  // namespace
