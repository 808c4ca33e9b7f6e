// SPDX-License-Identifier: Apache-2.0
// Which device takes which engine and which distribution, by the rows of the lists, and what is
// said to the others.
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "frame/rows.hpp"
#include "message.hpp"
#include "queues.hpp"
#include "routine_samples.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

std::string unsupported(const std::string& function, const sycl::queue& queue) {
  return "kestrel::tarn::rng::" + function +
         ": unsupported device: " + queue.get_device().get_info<sycl::info::device::name>();
}

TEST(devices, that_are_neither_cpu_nor_gpu_have_no_engine) {
  const sycl::queue queue = accelerator_queue();
  for_every_engine([&](const auto& on) {
    EXPECT_EQ(message_of<tarn::unsupported_device>([&] { on.make(queue); }),
              unsupported(on.name, queue));
  });
}

TEST(devices, of_the_gpu_kind_have_the_engines_with_a_device_road) {
  const sycl::queue queue = gpu_queue();
  for_every_engine([&](const auto& on) {
    if (on.gpu) {
      EXPECT_EQ(message_of<tarn::exception>([&] { on.make(queue); }), "[nothing raised]");
    } else {
      EXPECT_EQ(message_of<tarn::unsupported_device>([&] { on.make(queue); }),
                unsupported(on.name, queue));
    }
  });
}

TEST(devices, are_asked_before_the_seed) {
  const sycl::queue queue = accelerator_queue();
  EXPECT_EQ(message_of<tarn::unsupported_device>([&] { rng::mt2203(queue, 1, 6024); }),
            unsupported("mt2203", queue));
  EXPECT_EQ(message_of<tarn::unsupported_device>([&] {
              rng::wichmann_hill(queue, {1, 2}, 273);
            }),
            unsupported("wichmann_hill", queue));
  std::vector<std::uint32_t> table(32, 1);
  EXPECT_EQ(message_of<tarn::unsupported_device>([&] { rng::sobol(queue, table); }),
            unsupported("sobol", queue));
  EXPECT_EQ(table, std::vector<std::uint32_t>(32, 1));
}

TEST(devices, that_are_no_gpus_have_no_modes_of_mrg32k3a) {
  const std::initializer_list<std::uint32_t> list = {1, 2};
  const rng::mrg32k3a_mode::optimal optimal;
  const rng::mrg32k3a_mode::custom custom(64);
  for (const sycl::queue& queue : {cpu_queue(), accelerator_queue()}) {
    const auto refusal = [&](auto seed, auto mode) {
      return message_of<tarn::unsupported_device>([&] { rng::mrg32k3a(queue, seed, mode); });
    };
    const std::string expected = unsupported("mrg32k3a", queue);
    EXPECT_EQ(refusal(1, optimal), expected);
    EXPECT_EQ(refusal(1, custom), expected);
    EXPECT_EQ(refusal(list, optimal), expected);
    EXPECT_EQ(refusal(list, custom), expected);
  }
}

// An engine can come to stand on a queue that its constructor would have refused.
TEST(devices, are_asked_again_by_generate) {
  for_every_engine([&](const auto& on) {
    std::uint32_t value = 9;
    const auto refusal = [&](const sycl::queue& queue, auto raised) {
      auto engine = on.make(cpu_queue());
      engine.get_queue() = queue;
      return message_of<decltype(raised)>([&] { rng::generate(rng::bits<>(), engine, 1, &value); });
    };
    const sycl::queue other = accelerator_queue();
    EXPECT_EQ(refusal(other, tarn::unsupported_device("", "", other.get_device())),
              unsupported("generate", other));
    const sycl::queue gpu = gpu_queue();
    if (!on.gpu) {
      EXPECT_EQ(refusal(gpu, tarn::unsupported_device("", "", gpu.get_device())),
                unsupported("generate", gpu));
    }
    EXPECT_EQ(value, 9u);
  });
}

}  // namespace
