// SPDX-License-Identifier: Apache-2.0
// The devices of a process with three virtual ones, selectors, queries, contexts, and the parser
// of LUMEN_VIRTUAL_DEVICES.
#include <cstddef>
#include <unordered_set>

#include "every_device.hpp"
#include "settings.hpp"

using sycl::detail::parse_virtual_devices;

namespace {
// Real GPUs come after the devices that this suite sets up.
std::ptrdiff_t gpus_of(sycl::backend kind) {
  const std::vector<sycl::device> gpus = sycl::device::get_devices(sycl::info::device_type::gpu);
  return std::count_if(gpus.begin(), gpus.end(), [kind](const sycl::device& gpu) {
    return gpu.get_backend() == kind && gpu.get_platform().get_backend() == kind;
  });
}
}  // namespace

TEST(devices, host_comes_first_and_virtual_ones_in_their_order) {
  const std::vector<sycl::device> devices = sycl::device::get_devices();
  ASSERT_EQ(host_run_devices(), (std::vector<std::size_t>{0, 1, 2, 3}));
  EXPECT_TRUE(devices[0].is_cpu());
  EXPECT_TRUE(devices[1].is_gpu());
  EXPECT_TRUE(devices[2].is_accelerator());
  EXPECT_TRUE(devices[3].is_gpu());
  for (std::size_t i = 0; i < 4; ++i) {
    EXPECT_EQ(has_own_memory(devices[i]), i == 3);
  }
  EXPECT_EQ(devices[1].get_info<sycl::info::device::max_compute_units>(), 8U);
  EXPECT_EQ(devices[1].get_info<sycl::info::device::max_work_group_size>(), 256U);
  EXPECT_EQ(devices[2].get_info<sycl::info::device::max_work_group_size>(), 1024U);
  EXPECT_EQ(gpus_of(sycl::backend::host), 2);
  EXPECT_EQ(gpus_of(sycl::backend::cuda), static_cast<std::ptrdiff_t>(devices.size()) - 4);
  EXPECT_EQ(sycl::platform::get_platforms().size(), devices.size() == 4 ? 2U : 3U);
}

TEST(devices, default_is_a_cuda_device_or_the_host_and_selectors_find_the_others) {
  const auto usual =
      sycl::device::get_devices().size() == 4 ? sycl::backend::host : sycl::backend::cuda;
  EXPECT_EQ(sycl::device().get_backend(), usual);
  EXPECT_EQ(sycl::device().is_cpu(), usual == sycl::backend::host);
  EXPECT_EQ(sycl::queue().get_device(), sycl::device());
  EXPECT_TRUE(sycl::device(sycl::cpu_selector_v).is_cpu());
  EXPECT_TRUE(sycl::device(sycl::gpu_selector_v).is_gpu());
  EXPECT_TRUE(sycl::queue(sycl::accelerator_selector_v).get_device().is_accelerator());
  EXPECT_TRUE(
      sycl::device(sycl::aspect_selector(sycl::aspect::emulated, sycl::aspect::gpu)).is_gpu());
  EXPECT_TRUE(sycl::device([](const sycl::device& d) {
                return d.is_accelerator() ? 7 : -1;
              }).is_accelerator());
}

TEST(devices, no_acceptable_device_is_a_runtime_error) {
  const auto pick = [] { sycl::device none([](const sycl::device&) { return -1; }); };
  EXPECT_EQ(code_of(pick), sycl::errc::runtime);
  EXPECT_EQ(code_of([] { sycl::queue q(sycl::aspect_selector(sycl::aspect::fp16)); }),
            sycl::errc::runtime);
}

TEST(devices, equality_and_hash_follow_identity) {
  const sycl::device a, b;
  const sycl::device gpu(sycl::gpu_selector_v);
  EXPECT_EQ(a, b);
  EXPECT_NE(a, gpu);
  EXPECT_EQ(std::hash<sycl::device>()(a), std::hash<sycl::device>()(b));
  const sycl::queue q1, q2, q3 = q1;
  EXPECT_NE(q1, q2);
  EXPECT_EQ(q1, q3);
  const std::unordered_set<sycl::queue> queues = {q1, q2, q3};
  EXPECT_EQ(queues.size(), 2U);
  EXPECT_EQ(q1.get_context(), q2.get_context());
  EXPECT_EQ(std::hash<sycl::context>()(q1.get_context()),
            std::hash<sycl::context>()(q2.get_context()));
}

TEST(devices, contexts_hold_devices_of_one_platform) {
  const std::vector<sycl::device> all = sycl::device::get_devices();
  EXPECT_EQ(code_of([&] { sycl::context c(all); }), sycl::errc::invalid);
  EXPECT_EQ(code_of([] { sycl::context c(std::vector<sycl::device>{}); }), sycl::errc::invalid);
  const sycl::context both(std::vector<sycl::device>{all[1], all[2]});
  EXPECT_EQ(both.get_devices().size(), 2U);
  EXPECT_EQ(sycl::queue(both, all[2]).get_device(), all[2]);
  EXPECT_TRUE(sycl::queue(both, sycl::gpu_selector_v).get_device().is_gpu());
  EXPECT_EQ(code_of([&] { sycl::queue q(both, all[0]); }), sycl::errc::invalid);
}

class device_queries : public on_every_device {};
TEST_P(device_queries, answers_are_consistent) {
  namespace info = sycl::info::device;
  const sycl::device d = device();
  EXPECT_FALSE(d.get_info<info::name>().empty());
  EXPECT_FALSE(d.get_info<info::vendor>().empty());
  EXPECT_FALSE(d.get_info<info::driver_version>().empty());
  EXPECT_GE(d.get_info<info::max_compute_units>(), 1U);
  EXPECT_EQ(d.get_info<info::max_work_item_dimensions>(), 3U);
  EXPECT_EQ(d.get_info<info::max_work_item_sizes<3>>()[2], d.get_info<info::max_work_group_size>());
  EXPECT_GT(d.get_info<info::global_mem_size>(), d.get_info<info::local_mem_size>());
  EXPECT_GE(d.get_info<info::local_mem_size>(), 32768U);
  EXPECT_EQ(d.get_info<info::address_bits>(), 64U);
  EXPECT_EQ(d.get_info<info::sub_group_sizes>(), std::vector<std::size_t>{1});
  EXPECT_EQ(d.get_info<info::aspects>().empty(), false);
  EXPECT_EQ(d.has(sycl::aspect::cpu) + d.has(sycl::aspect::gpu) + d.has(sycl::aspect::accelerator),
            1);
  const bool host_run = d.get_backend() == sycl::backend::host;
  EXPECT_EQ(d.has(sycl::aspect::emulated), host_run && !d.is_cpu());
  EXPECT_TRUE(d.has(sycl::aspect::fp64));
  EXPECT_FALSE(d.has(sycl::aspect::fp16));
  EXPECT_EQ(d.get_info<info::device_type>() == sycl::info::device_type::cpu, d.is_cpu());
  EXPECT_EQ(d.get_info<info::platform>(), d.get_platform());
  EXPECT_EQ(code_of([&] { d.get_info<info::parent_device>(); }), sycl::errc::invalid);
  constexpr auto equally = sycl::info::partition_property::partition_equally;
  EXPECT_EQ(code_of([&] { d.create_sub_devices<equally>(2); }), sycl::errc::feature_not_supported);
}
LUMEN_ON_EVERY_DEVICE(device_queries);

TEST(virtual_devices, well_formed_lists_are_read) {
  const auto two = parse_virtual_devices("gpu,compute_units=8,max_work_group_size=128;accelerator");
  EXPECT_EQ(two.error, "");
  ASSERT_EQ(two.devices.size(), 2U);
  EXPECT_TRUE(two.devices[0].is_gpu);
  EXPECT_EQ(two.devices[0].compute_units, 8U);
  EXPECT_EQ(two.devices[0].max_work_group_size, 128U);
  EXPECT_FALSE(two.devices[1].is_gpu);
  EXPECT_EQ(two.devices[1].compute_units, 0U);
  EXPECT_FALSE(two.devices[0].own_memory);
  EXPECT_FALSE(two.devices[1].own_memory);
  const auto own = parse_virtual_devices("accelerator;gpu,memory=own,compute_units=3");
  EXPECT_EQ(own.error, "");
  ASSERT_EQ(own.devices.size(), 2U);
  EXPECT_FALSE(own.devices[0].own_memory);
  EXPECT_TRUE(own.devices[1].own_memory);
  EXPECT_EQ(own.devices[1].compute_units, 3U);
}

TEST(virtual_devices, malformed_lists_name_their_column_and_give_nothing) {
  struct row {
    const char* text;
    std::size_t column;
  };
  const row rows[] = {
      {"cpu", 1},
      {"GPU", 1},
      {" gpu", 1},
      {"gpu;", 5},
      {";gpu", 1},
      {"gpu;;gpu", 5},
      {"gpu,", 5},
      {"gpu,speed=3", 5},
      {"gpu;accelerator,foo", 17},
      {"gpu,compute_units", 18},
      {"gpu,compute_units=", 19},
      {"gpu,compute_units=0", 19},
      {"gpu,compute_units=-1", 19},
      {"gpu,compute_units=8x", 19},
      {"gpu,compute_units=65537", 19},
      {"gpu,compute_units=99999999999999999999", 19},
      {"gpu,max_work_group_size=4097", 25},
      {"gpu,compute_units=2,compute_units=3", 21},
      {"gpu,memory", 11},
      {"gpu,memory=", 12},
      {"gpu,memory=shared", 12},
      {"gpu,memory=own ", 12},
      {"gpu,memory=own,memory=own", 16},
  };
  for (const row& r : rows) {
    const auto parsed = parse_virtual_devices(r.text);
    EXPECT_TRUE(parsed.devices.empty()) << r.text;
    EXPECT_FALSE(parsed.error.empty()) << r.text;
    EXPECT_EQ(parsed.column, r.column) << r.text << ": " << parsed.error;
  }
}
