// SPDX-License-Identifier: Apache-2.0
// Level Zero devices, their parts, and objects made over native handles: what they are, whose they
// are, and that nothing of a handle that is refused is touched.
#include "native_level_zero.hpp"

namespace {

namespace query = sycl::info::device;
using level_zero_device_list = native_level_zero;

std::vector<sycl::aspect> aspects(const sycl::device& device) {
  return device.get_info<query::aspects>();
}

TEST_F(level_zero_device_list, is_that_of_the_driver_in_its_order) {
  const sycl::platform platform = device().get_platform();
  EXPECT_EQ(platform.get_backend(), level_zero);
  EXPECT_EQ(platform.get_devices(), level_zero_devices());
  EXPECT_EQ(platform.get_info<sycl::info::platform::version>(), "1.4");
  EXPECT_TRUE(platform.has_extension(ZE_GLOBAL_OFFSET_EXP_NAME));
  std::uint32_t count = 1;
  ze_driver_handle_t driver = nullptr;
  ASSERT_EQ(ze().zeDriverGet(&count, &driver), ZE_RESULT_SUCCESS);
  EXPECT_EQ(sycl::get_native<level_zero>(platform), driver);
  count = 3;
  ze_device_handle_t handles[3] = {};
  ASSERT_EQ(ze().zeDeviceGet(driver, &count, handles), ZE_RESULT_SUCCESS);
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_EQ(id_of(device(i)), handles[i]);
    EXPECT_EQ(sycl::make_device<level_zero>(handles[i]), device(i));
  }
  EXPECT_TRUE(sycl::device(sycl::default_selector_v).is_cpu());
}

TEST_F(level_zero_device_list, answers_what_the_driver_says) {
  const level_zero_driver::device_description described;
  const sycl::device d = device();
  EXPECT_TRUE(d.is_gpu());
  EXPECT_EQ(d.get_info<query::name>(), described.name);
  EXPECT_EQ(d.get_info<query::vendor_id>(), described.vendor_id);
  EXPECT_EQ(d.get_info<query::vendor>(), "PCI vendor 0xb21e");
  EXPECT_EQ(d.get_info<query::driver_version>(), "0x1030007");
  EXPECT_EQ(d.get_info<query::version>(), "1.4");
  EXPECT_EQ(d.get_info<query::max_clock_frequency>(), described.core_clock_rate);
  EXPECT_EQ(d.get_info<query::max_compute_units>(), 2U * 4 * 8);
  EXPECT_EQ(d.get_info<query::max_work_group_size>(), 512U);
  EXPECT_EQ(d.get_info<query::sub_group_sizes>(), (std::vector<std::size_t>{16, 32}));
  EXPECT_EQ(d.get_info<query::max_num_sub_groups>(), 32U);
  EXPECT_EQ(d.get_info<query::global_mem_size>(), described.memory_bytes);
  EXPECT_EQ(d.get_info<query::max_mem_alloc_size>(), described.memory_bytes);
  EXPECT_EQ(d.get_info<query::global_mem_cache_size>(), 4U << 20);
  EXPECT_EQ(d.get_info<query::local_mem_size>(), 65536U);
  EXPECT_EQ(d.get_info<query::max_parameter_size>(), 2048U);
  EXPECT_EQ(d.get_info<query::printf_buffer_size>(), 4096U);
  EXPECT_EQ(d.get_info<query::profiling_timer_resolution>(), 53U);  // 52 ns and a part
  EXPECT_EQ(d.get_info<query::partition_max_sub_devices>(), 2U);
  EXPECT_EQ(d.get_info<query::half_fp_config>(), std::vector<sycl::info::fp_config>());
  using fp = sycl::info::fp_config;
  EXPECT_EQ(d.get_info<query::double_fp_config>(),
            (std::vector<fp>{fp::denorm, fp::inf_nan, fp::round_to_nearest, fp::fma}));
  EXPECT_EQ(aspects(d),
            (std::vector<sycl::aspect>{
                sycl::aspect::gpu, sycl::aspect::queue_profiling, sycl::aspect::fp64,
                sycl::aspect::atomic64, sycl::aspect::usm_device_allocations,
                sycl::aspect::usm_host_allocations, sycl::aspect::usm_shared_allocations}));

  EXPECT_TRUE(device(2).is_accelerator());
  EXPECT_TRUE(device(2).has(sycl::aspect::fp16));
  EXPECT_FALSE(device(2).has(sycl::aspect::fp64));
  EXPECT_EQ(device(2).get_info<query::max_work_group_size>(), 64U);
}

TEST_F(level_zero_device_list, has_parts_that_are_devices) {
  std::uint32_t count = 2;
  ze_device_handle_t parts[2] = {};
  ASSERT_EQ(ze().zeDeviceGetSubDevices(id_of(device()), &count, parts), ZE_RESULT_SUCCESS);
  const sycl::device part = sycl::make_device<level_zero>(parts[1]);
  EXPECT_NE(part, device());
  EXPECT_EQ(part, sycl::make_device<level_zero>(parts[1]));
  EXPECT_NE(part, sycl::make_device<level_zero>(parts[0]));
  EXPECT_EQ(id_of(part), parts[1]);
  EXPECT_EQ(part.get_info<query::parent_device>(), device());
  EXPECT_EQ(part.get_platform(), device().get_platform());
  EXPECT_EQ(part.get_info<query::partition_type_property>(),
            sycl::info::partition_property::partition_by_affinity_domain);
  EXPECT_EQ(level_zero_devices().size(), 3U);

  const sycl::context context(part);
  sycl::queue queue(context, part);
  number* const x = sycl::malloc_shared<number>(8, queue);
  std::fill_n(x, 8, 5U);
  queue
      .submit([&](sycl::handler& h) {
        h.set_args(x, number{3});
        h.parallel_for(sycl::range<1>(8), make_kernel(context, "step", part));
      })
      .wait_and_throw();
  EXPECT_EQ(std::vector<number>(x, x + 8), std::vector<number>(8, stepped(5, 3)));
  sycl::free(x, queue);
}

TEST_F(level_zero_device_list, knows_no_other_handles) {
  int nothing = 0;
  EXPECT_EQ(code_of([&] { sycl::detail::make_device(&nothing, level_zero); }), sycl::errc::invalid);
  EXPECT_EQ(code_of([&] { sycl::detail::make_device(nullptr, level_zero); }), sycl::errc::invalid);
}

using level_zero_objects = native_level_zero;

TEST_F(level_zero_objects, of_sycl_have_handles_that_stay_theirs) {
  const sycl::context context(device());
  sycl::queue queue(context, device());
  EXPECT_EQ(ze().zeContextGetStatus(sycl::get_native<level_zero>(context)), ZE_RESULT_SUCCESS);
  EXPECT_EQ(ze().zeCommandQueueSynchronize(sycl::get_native<level_zero>(queue), 0),
            ZE_RESULT_SUCCESS);
  EXPECT_EQ(sycl::get_native<level_zero>(queue), sycl::get_native<level_zero>(queue));
  number* const x = sycl::malloc_shared<number>(8, queue);
  sycl::event event = queue.fill(x, 1U, 8);
  const std::vector<ze_event_handle_t> events = sycl::get_native<level_zero>(event);
  ASSERT_EQ(events.size(), 1U);
  EXPECT_EQ(ze().zeEventHostSynchronize(events[0], UINT64_MAX), ZE_RESULT_SUCCESS);
  queue.wait();
  sycl::free(x, queue);
}

TEST_F(level_zero_objects, that_are_kept_outlive_those_of_sycl) {
  const native<ze_context_handle_t> context = new_context();
  for (int round = 0; round < 2; ++round) {
    const sycl::context made =
        sycl::make_context<level_zero>({context.get(), {device()}, ownership::keep});
    EXPECT_EQ(sycl::get_native<level_zero>(made), context.get());
    EXPECT_EQ(made.get_devices(), std::vector<sycl::device>{device()});
    const native<ze_command_queue_handle_t> queue = new_queue(made);
    const native<ze_module_handle_t> module = new_module(made);
    const native<ze_kernel_handle_t> kernel = new_kernel(module.get(), "step");
    {
      sycl::queue its = sycl::make_queue<level_zero>({queue.get(), ownership::keep}, made);
      EXPECT_EQ(sycl::get_native<level_zero>(its), queue.get());
      EXPECT_FALSE(its.is_in_order());
      const auto bundle = sycl::make_kernel_bundle<level_zero, sycl::bundle_state::executable>(
          {module.get(), ownership::keep}, made);
      const sycl::kernel step =
          sycl::make_kernel<level_zero>({bundle, kernel.get(), ownership::keep}, made);
      EXPECT_EQ(sycl::get_native<level_zero>(step), kernel.get());
      EXPECT_EQ(sycl::get_native<level_zero>(bundle),
                std::vector<ze_module_handle_t>{module.get()});
      number* const x = sycl::malloc_shared<number>(4, its);
      its.fill(x, 9U, 4).wait();
      its.submit([&](sycl::handler& h) {
           h.set_args(x, number{1});
           h.parallel_for(sycl::range<1>(4), step);
         })
          .wait_and_throw();
      EXPECT_EQ(x[3], stepped(9));
      sycl::free(x, its);
    }
    EXPECT_EQ(ze().zeCommandQueueSynchronize(queue.get(), 0), ZE_RESULT_SUCCESS);
    std::size_t size = 0;
    EXPECT_EQ(ze().zeKernelGetName(kernel.get(), &size, nullptr), ZE_RESULT_SUCCESS);
  }
  EXPECT_EQ(ze().zeContextGetStatus(context.get()), ZE_RESULT_SUCCESS);
}

TEST_F(level_zero_objects, that_are_taken_over_go_with_those_of_sycl) {
  native<ze_context_handle_t> context = new_context();
  const ze_context_handle_t handle = context.get();
  ze_command_queue_handle_t queue_handle = nullptr;
  {
    const sycl::context made =
        sycl::make_context<level_zero>({context.give(), {device()}, ownership::transfer});
    native<ze_command_queue_handle_t> queue = new_queue(made);
    queue_handle = queue.get();
    sycl::queue its = sycl::make_queue<level_zero>({queue.give()}, made);
    make_kernel(made, "step");
    EXPECT_EQ(ze().zeCommandQueueSynchronize(queue_handle, 0), ZE_RESULT_SUCCESS);
  }
  EXPECT_NE(ze().zeCommandQueueSynchronize(queue_handle, 0), ZE_RESULT_SUCCESS);
  EXPECT_NE(ze().zeContextGetStatus(handle), ZE_RESULT_SUCCESS);
}

TEST_F(level_zero_objects, that_are_handed_over_go_even_where_nothing_can_be_made_of_them) {
  const sycl::context context(device());
  const native<ze_module_handle_t> module = new_module(context);
  native<ze_kernel_handle_t> kernel = new_kernel(module.get(), "step");
  const auto bundle = sycl::make_kernel_bundle<level_zero, sycl::bundle_state::executable>(
      {module.get(), ownership::keep}, context);
  level_zero_driver::fail("zeKernelSetIndirectAccess", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  EXPECT_EQ(code_of([&] {
              sycl::make_kernel<level_zero>({bundle, kernel.give(), ownership::transfer}, context);
            }),
            sycl::errc::runtime);
  native<ze_command_queue_handle_t> queue = new_queue(context);
  level_zero_driver::fail("zeDeviceGetCommandQueueGroupProperties", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  EXPECT_EQ(code_of([&] {
              sycl::make_queue<level_zero>({queue.give(), ownership::transfer}, context);
            }),
            sycl::errc::runtime);
  EXPECT_EQ(level_zero_driver::failures_left(), 0);
  EXPECT_EQ(level_zero_driver::objects(level_zero_driver::object::kernel), 0);
  EXPECT_EQ(level_zero_driver::objects(level_zero_driver::object::queue), 0);
}

TEST_F(level_zero_objects, need_the_devices_of_their_context) {
  const native<ze_context_handle_t> context = new_context();
  EXPECT_EQ(code_of([&] {
              sycl::make_context<level_zero>({context.get(), {}, ownership::keep});
            }),
            sycl::errc::invalid);
  EXPECT_EQ(code_of([&] {
              sycl::make_context<level_zero>({context.get(), {sycl::device()}, ownership::keep});
            }),
            sycl::errc::backend_mismatch);
}

}  // namespace
