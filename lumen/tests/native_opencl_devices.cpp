// SPDX-License-Identifier: Apache-2.0
// OpenCL devices: which there are, what they answer, sub-devices, and how often a loader or driver
// may fail when it is asked for them.
#include <algorithm>
#include <iterator>
#include <sstream>

#include "native_opencl.hpp"

namespace {

namespace query = sycl::info::device;

class opencl_devices_of_the_loader : public native_opencl {
 protected:
  static std::vector<cl_device_id> native_devices() {
    std::vector<cl_device_id> all;
    cl_platform_id platforms[8] = {};
    cl_uint platform_count = 0;
    EXPECT_EQ(cl().clGetPlatformIDs(8, platforms, &platform_count), CL_SUCCESS);
    for (cl_uint p = 0; p < platform_count; ++p) {
      cl_device_id devices[64] = {};
      cl_uint count = 0;
      EXPECT_EQ(cl().clGetDeviceIDs(platforms[p], CL_DEVICE_TYPE_ALL, 64, devices, &count),
                CL_SUCCESS);
      all.insert(all.end(), devices, devices + count);
    }
    return all;
  }
  template <typename T>
  static T answer(cl_device_id id, cl_device_info info) {
    T value{};
    EXPECT_EQ(cl().clGetDeviceInfo(id, info, sizeof value, &value, nullptr), CL_SUCCESS) << info;
    return value;
  }
  static std::string text(cl_device_id id, cl_device_info info) {
    char characters[4096] = {};
    EXPECT_EQ(cl().clGetDeviceInfo(id, info, sizeof characters, characters, nullptr), CL_SUCCESS);
    return characters;
  }
  // Sub-devices of the device, with one compute unit each.
  static std::vector<cl_device_id> new_sub_devices(cl_uint wanted) {
    const cl_device_partition_property one_each[] = {CL_DEVICE_PARTITION_EQUALLY, 1, 0};
    cl_device_id all[64] = {};
    cl_uint count = 0;
    EXPECT_EQ(cl().clCreateSubDevices(id_of(device()), one_each, 64, all, &count), CL_SUCCESS);
    EXPECT_GE(count, wanted);
    for (cl_uint i = wanted; i < count; ++i) {
      EXPECT_EQ(cl().clReleaseDevice(all[i]), CL_SUCCESS);
    }
    return {all, all + wanted};
  }
};

TEST_F(opencl_devices_of_the_loader, are_those_of_lumen) {
  std::vector<cl_device_id> found;
  for (const sycl::device& each : opencl_devices()) {
    EXPECT_TRUE(each.is_gpu());
    found.push_back(id_of(each));
    EXPECT_EQ(sycl::make_device<opencl>(found.back()), each);
  }
  EXPECT_EQ(found, native_devices());
}

TEST_F(opencl_devices_of_the_loader, are_found_by_type_and_are_no_default) {
  const std::vector<sycl::device> gpus = sycl::device::get_devices(sycl::info::device_type::gpu);
  EXPECT_NE(std::find(gpus.begin(), gpus.end(), device()), gpus.end());
  EXPECT_NE(sycl::device().get_backend(), opencl);
  EXPECT_EQ(sycl::device([](const sycl::device& each) {
              return each.get_backend() == opencl ? 1 : 0;
            }).get_backend(),
            opencl);
}

TEST_F(opencl_devices_of_the_loader, their_platform_has_its_texts_and_handle) {
  const sycl::platform platform = device().get_platform();
  EXPECT_EQ(platform.get_backend(), opencl);
  const cl_platform_id id = sycl::get_native<opencl>(platform);
  EXPECT_EQ(id, answer<cl_platform_id>(id_of(device()), CL_DEVICE_PLATFORM));
  const auto expect_text = [&](cl_platform_info info, const std::string& told) {
    char characters[4096] = {};
    EXPECT_EQ(cl().clGetPlatformInfo(id, info, sizeof characters, characters, nullptr), CL_SUCCESS);
    EXPECT_EQ(told, characters);
  };
  expect_text(CL_PLATFORM_NAME, platform.get_info<sycl::info::platform::name>());
  expect_text(CL_PLATFORM_VENDOR, platform.get_info<sycl::info::platform::vendor>());
  expect_text(CL_PLATFORM_VERSION, platform.get_info<sycl::info::platform::version>());
  expect_text(CL_PLATFORM_PROFILE, platform.get_info<sycl::info::platform::profile>());
  EXPECT_TRUE(platform.has_extension("cl_khr_icd"));
  EXPECT_EQ(platform.get_devices().size(), opencl_devices().size());
}

TEST_F(opencl_devices_of_the_loader, answer_as_the_driver_does) {
  for (const sycl::device& each : opencl_devices()) {
    const cl_device_id id = id_of(each);
    EXPECT_EQ(each.get_info<query::name>(), text(id, CL_DEVICE_NAME));
    EXPECT_EQ(each.get_info<query::vendor>(), text(id, CL_DEVICE_VENDOR));
    EXPECT_EQ(each.get_info<query::driver_version>(), text(id, CL_DRIVER_VERSION));
    EXPECT_EQ(each.get_info<query::profile>(), text(id, CL_DEVICE_PROFILE));
    EXPECT_EQ(each.get_info<query::version>(), text(id, CL_DEVICE_VERSION));
    EXPECT_EQ("OpenCL " + each.get_info<query::backend_version>() + " ",
              text(id, CL_DEVICE_VERSION).substr(0, 11));
    std::istringstream extensions(text(id, CL_DEVICE_EXTENSIONS));
    EXPECT_EQ(each.get_info<query::extensions>(),
              std::vector<std::string>(std::istream_iterator<std::string>(extensions), {}));
    EXPECT_TRUE(each.has_extension("cl_khr_fp64"));
#define EXPECT_SAME(mine, theirs) \
  EXPECT_EQ(each.get_info<query::mine>(), answer<query::mine::return_type>(id, theirs))
    EXPECT_SAME(vendor_id, CL_DEVICE_VENDOR_ID);
    EXPECT_SAME(max_compute_units, CL_DEVICE_MAX_COMPUTE_UNITS);
    EXPECT_SAME(max_work_item_dimensions, CL_DEVICE_MAX_WORK_ITEM_DIMENSIONS);
    EXPECT_SAME(max_work_group_size, CL_DEVICE_MAX_WORK_GROUP_SIZE);
    EXPECT_SAME(max_num_sub_groups, CL_DEVICE_MAX_NUM_SUB_GROUPS);
    EXPECT_SAME(max_clock_frequency, CL_DEVICE_MAX_CLOCK_FREQUENCY);
    EXPECT_SAME(address_bits, CL_DEVICE_ADDRESS_BITS);
    EXPECT_SAME(max_parameter_size, CL_DEVICE_MAX_PARAMETER_SIZE);
    EXPECT_SAME(profiling_timer_resolution, CL_DEVICE_PROFILING_TIMER_RESOLUTION);
    EXPECT_SAME(printf_buffer_size, CL_DEVICE_PRINTF_BUFFER_SIZE);
    EXPECT_SAME(max_mem_alloc_size, CL_DEVICE_MAX_MEM_ALLOC_SIZE);
    EXPECT_SAME(global_mem_size, CL_DEVICE_GLOBAL_MEM_SIZE);
    EXPECT_SAME(local_mem_size, CL_DEVICE_LOCAL_MEM_SIZE);
    EXPECT_SAME(mem_base_addr_align, CL_DEVICE_MEM_BASE_ADDR_ALIGN);
    EXPECT_SAME(global_mem_cache_line_size, CL_DEVICE_GLOBAL_MEM_CACHELINE_SIZE);
    EXPECT_SAME(global_mem_cache_size, CL_DEVICE_GLOBAL_MEM_CACHE_SIZE);
    EXPECT_SAME(preferred_vector_width_char, CL_DEVICE_PREFERRED_VECTOR_WIDTH_CHAR);
    EXPECT_SAME(preferred_vector_width_short, CL_DEVICE_PREFERRED_VECTOR_WIDTH_SHORT);
    EXPECT_SAME(preferred_vector_width_int, CL_DEVICE_PREFERRED_VECTOR_WIDTH_INT);
    EXPECT_SAME(preferred_vector_width_long, CL_DEVICE_PREFERRED_VECTOR_WIDTH_LONG);
    EXPECT_SAME(preferred_vector_width_float, CL_DEVICE_PREFERRED_VECTOR_WIDTH_FLOAT);
    EXPECT_SAME(preferred_vector_width_double, CL_DEVICE_PREFERRED_VECTOR_WIDTH_DOUBLE);
    EXPECT_SAME(preferred_vector_width_half, CL_DEVICE_PREFERRED_VECTOR_WIDTH_HALF);
    EXPECT_SAME(native_vector_width_float, CL_DEVICE_NATIVE_VECTOR_WIDTH_FLOAT);
    EXPECT_SAME(native_vector_width_double, CL_DEVICE_NATIVE_VECTOR_WIDTH_DOUBLE);
    EXPECT_SAME(max_read_image_args, CL_DEVICE_MAX_READ_IMAGE_ARGS);
    EXPECT_SAME(image2d_max_width, CL_DEVICE_IMAGE2D_MAX_WIDTH);
    EXPECT_SAME(image3d_max_depth, CL_DEVICE_IMAGE3D_MAX_DEPTH);
    EXPECT_SAME(image_max_buffer_size, CL_DEVICE_IMAGE_MAX_BUFFER_SIZE);
    EXPECT_SAME(max_samplers, CL_DEVICE_MAX_SAMPLERS);
    EXPECT_SAME(partition_max_sub_devices, CL_DEVICE_PARTITION_MAX_SUB_DEVICES);
#undef EXPECT_SAME
#define EXPECT_SAME(mine, theirs) \
  EXPECT_EQ(each.get_info<query::mine>(), answer<cl_bool>(id, theirs) != CL_FALSE)
    EXPECT_SAME(image_support, CL_DEVICE_IMAGE_SUPPORT);
    EXPECT_SAME(error_correction_support, CL_DEVICE_ERROR_CORRECTION_SUPPORT);
    EXPECT_SAME(host_unified_memory, CL_DEVICE_HOST_UNIFIED_MEMORY);
    EXPECT_SAME(is_endian_little, CL_DEVICE_ENDIAN_LITTLE);
    EXPECT_SAME(is_available, CL_DEVICE_AVAILABLE);
    EXPECT_SAME(is_compiler_available, CL_DEVICE_COMPILER_AVAILABLE);
    EXPECT_SAME(is_linker_available, CL_DEVICE_LINKER_AVAILABLE);
    EXPECT_SAME(preferred_interop_user_sync, CL_DEVICE_PREFERRED_INTEROP_USER_SYNC);
#undef EXPECT_SAME
    EXPECT_TRUE(each.get_info<query::sub_group_sizes>().empty());
    EXPECT_THROW(each.get_info<query::parent_device>(), sycl::exception);
  }
}

TEST_F(opencl_devices_of_the_loader, a_sub_device_knows_its_parent) {
  const std::vector<cl_device_id> ids = new_sub_devices(1);
  const sycl::device part = sycl::make_device<opencl>(ids[0]);
  // The record has a reference of its own.
  EXPECT_EQ(cl().clReleaseDevice(ids[0]), CL_SUCCESS);
  EXPECT_EQ(part.get_info<query::parent_device>(), device());
  EXPECT_EQ(part.get_info<query::max_compute_units>(), 1U);
  EXPECT_EQ(part.get_info<query::partition_type_property>(),
            sycl::info::partition_property::partition_equally);
  EXPECT_EQ(device().get_info<query::partition_type_property>(),
            sycl::info::partition_property::no_partition);
  EXPECT_EQ(part.get_platform(), device().get_platform());
  const std::vector<sycl::device> all = opencl_devices();
  EXPECT_EQ(std::find(all.begin(), all.end(), part), all.end());
  EXPECT_EQ(sycl::make_device<opencl>(ids[0]), part);

  const int references = opencl_layer::objects(opencl_layer::object::sub_device);
  EXPECT_EQ(sycl::get_native<opencl>(part), ids[0]);
  EXPECT_EQ(opencl_layer::objects(opencl_layer::object::sub_device), references + 1);
  EXPECT_EQ(cl().clReleaseDevice(ids[0]), CL_SUCCESS);

  const sycl::context context(part);
  sycl::queue queue(context, part);
  int* const place = sycl::malloc_shared<int>(10, queue);
  queue.fill(place, 5, 10).wait_and_throw();
  EXPECT_EQ(place[9], 5);
  sycl::free(place, queue);
}

TEST_F(opencl_devices_of_the_loader, a_part_of_a_part_brings_its_parents_along) {
  const cl_device_partition_property all_units[] = {
      CL_DEVICE_PARTITION_BY_COUNTS,
      static_cast<cl_device_partition_property>(device().get_info<query::max_compute_units>()),
      CL_DEVICE_PARTITION_BY_COUNTS_LIST_END, 0};
  cl_device_id part = nullptr;
  ASSERT_EQ(cl().clCreateSubDevices(id_of(device()), all_units, 1, &part, nullptr), CL_SUCCESS);
  cl_device_id inner = nullptr;
  if (cl().clCreateSubDevices(part, all_units, 1, &inner, nullptr) == CL_SUCCESS) {
    const sycl::device made = sycl::make_device<opencl>(inner);
    EXPECT_EQ(made.get_info<query::parent_device>().get_info<query::parent_device>(), device());
    EXPECT_EQ(cl().clReleaseDevice(inner), CL_SUCCESS);
  }
  EXPECT_EQ(cl().clReleaseDevice(part), CL_SUCCESS);
}

// A device is described when it is first seen, so that sub-devices show what other answers become.
TEST_F(opencl_devices_of_the_loader, other_answers_are_turned_into_the_words_of_sycl) {
  const std::vector<cl_device_id> ids = new_sub_devices(1);
  opencl_layer::answer(CL_DEVICE_TYPE, cl_device_type{CL_DEVICE_TYPE_ACCELERATOR});
  opencl_layer::answer(CL_DEVICE_DOUBLE_FP_CONFIG, cl_device_fp_config{0});
  opencl_layer::answer(CL_DEVICE_SINGLE_FP_CONFIG,
                       cl_device_fp_config{CL_FP_ROUND_TO_NEAREST | CL_FP_SOFT_FLOAT});
  opencl_layer::answer(CL_DEVICE_SVM_CAPABILITIES,
                       cl_device_svm_capabilities{CL_DEVICE_SVM_COARSE_GRAIN_BUFFER});
  opencl_layer::answer(CL_DEVICE_ATOMIC_MEMORY_CAPABILITIES,
                       cl_device_atomic_capabilities{CL_DEVICE_ATOMIC_ORDER_ACQ_REL |
                                                     CL_DEVICE_ATOMIC_SCOPE_DEVICE});
  opencl_layer::answer(CL_DEVICE_GLOBAL_MEM_CACHE_TYPE,
                       cl_device_mem_cache_type{CL_READ_ONLY_CACHE});
  opencl_layer::answer(CL_DEVICE_LOCAL_MEM_TYPE, cl_device_local_mem_type{CL_LOCAL});
  opencl_layer::answer(CL_DEVICE_EXECUTION_CAPABILITIES,
                       cl_device_exec_capabilities{CL_EXEC_KERNEL});
  opencl_layer::answer(CL_DEVICE_QUEUE_PROPERTIES, cl_command_queue_properties{0});
  opencl_layer::answer(CL_DEVICE_PARTITION_AFFINITY_DOMAIN,
                       cl_device_affinity_domain{CL_DEVICE_AFFINITY_DOMAIN_NUMA |
                                                 CL_DEVICE_AFFINITY_DOMAIN_L2_CACHE});
  opencl_layer::answer(CL_DEVICE_BUILT_IN_KERNELS, "one;two");
  opencl_layer::answer_fails(CL_DEVICE_MAX_NUM_SUB_GROUPS, CL_INVALID_VALUE);
  const sycl::device part = sycl::make_device<opencl>(ids[0]);
  EXPECT_EQ(cl().clReleaseDevice(ids[0]), CL_SUCCESS);
  opencl_layer::reset();

  using sycl::aspect;
  EXPECT_TRUE(part.is_accelerator());
  EXPECT_TRUE(part.has(aspect::accelerator));
  EXPECT_TRUE(part.has(aspect::usm_device_allocations));
  for (const aspect missing :
       {aspect::gpu, aspect::fp64, aspect::queue_profiling, aspect::usm_host_allocations,
        aspect::usm_shared_allocations, aspect::usm_atomic_shared_allocations,
        aspect::usm_system_allocations}) {
    EXPECT_FALSE(part.has(missing)) << static_cast<int>(missing);
  }
  EXPECT_TRUE(part.get_info<query::double_fp_config>().empty());
  using sycl::info::fp_config;
  EXPECT_EQ(part.get_info<query::single_fp_config>(),
            (std::vector<fp_config>{fp_config::round_to_nearest, fp_config::soft_float}));
  using sycl::memory_order;
  EXPECT_EQ(part.get_info<query::atomic_memory_order_capabilities>(),
            (std::vector<memory_order>{memory_order::acquire, memory_order::release,
                                       memory_order::acq_rel}));
  EXPECT_EQ(part.get_info<query::atomic_memory_scope_capabilities>(),
            std::vector<sycl::memory_scope>{sycl::memory_scope::device});
  EXPECT_EQ(part.get_info<query::global_mem_cache_type>(),
            sycl::info::global_mem_cache_type::read_only);
  EXPECT_EQ(part.get_info<query::local_mem_type>(), sycl::info::local_mem_type::local);
  EXPECT_EQ(
      part.get_info<query::execution_capabilities>(),
      std::vector<sycl::info::execution_capability>{sycl::info::execution_capability::exec_kernel});
  EXPECT_FALSE(part.get_info<query::queue_profiling>());
  using sycl::info::partition_affinity_domain;
  EXPECT_EQ(part.get_info<query::partition_affinity_domains>(),
            (std::vector<partition_affinity_domain>{partition_affinity_domain::numa,
                                                    partition_affinity_domain::L2_cache}));
  EXPECT_EQ(part.get_info<query::built_in_kernels>(), (std::vector<std::string>{"one", "two"}));
  EXPECT_EQ(part.get_info<query::max_num_sub_groups>(), 0U);

  // There is device memory, and no other.
  const sycl::context context(part);
  EXPECT_EQ(code_of([&] { sycl::malloc_shared<int>(1, part, context); }),
            sycl::errc::feature_not_supported);
  EXPECT_EQ(code_of([&] { sycl::malloc_host<int>(1, context); }),
            sycl::errc::feature_not_supported);
  int* const place = sycl::malloc_device<int>(1, part, context);
  EXPECT_NE(place, nullptr);
  sycl::free(place, context);
}

TEST_F(opencl_devices_of_the_loader, a_device_without_shared_virtual_memory_has_no_memory_here) {
  const std::vector<cl_device_id> ids = new_sub_devices(1);
  opencl_layer::answer(CL_DEVICE_SVM_CAPABILITIES, cl_device_svm_capabilities{0});
  const char version[] = "OpenCL 1.2 of a test";
  opencl_layer::answer(CL_DEVICE_VERSION, version);
  const sycl::device part = sycl::make_device<opencl>(ids[0]);
  EXPECT_EQ(cl().clReleaseDevice(ids[0]), CL_SUCCESS);
  opencl_layer::reset();
  const sycl::context context(part);
  EXPECT_EQ(code_of([&] { sycl::malloc_device<int>(1, part, context); }),
            sycl::errc::feature_not_supported);

  // Its queues are those of version 1.2, and it says what is wrong with a buffer.
  const int calls = opencl_layer::calls("clCreateCommandQueueWithProperties");
  sycl::queue queue(context, part);
  EXPECT_EQ(opencl_layer::calls("clCreateCommandQueueWithProperties"), calls);
  sycl::buffer<int> buffer{sycl::range<1>(10)};
  EXPECT_EQ(code_of([&] {
              queue.submit([&](sycl::handler& h) {
                h.fill(sycl::accessor<int, 1, sycl::access_mode::write>(buffer, h), 1);
              });
            }),
            sycl::errc::memory_allocation);
}

TEST_F(opencl_devices_of_the_loader, a_handle_of_no_device_is_refused) {
  EXPECT_EQ(code_of([] { sycl::make_device<opencl>(nullptr); }), sycl::errc::invalid);
}

TEST_F(opencl_devices_of_the_loader, a_sub_device_that_does_not_answer_is_refused) {
  const std::vector<cl_device_id> ids = new_sub_devices(1);
  for (const cl_device_info info : {CL_DEVICE_NAME, CL_DEVICE_MAX_WORK_GROUP_SIZE,
                                    CL_DEVICE_GLOBAL_MEM_SIZE, CL_DEVICE_AVAILABLE}) {
    opencl_layer::answer_fails(info, CL_OUT_OF_RESOURCES);
    EXPECT_EQ(code_of([&] { sycl::make_device<opencl>(ids[0]); }), sycl::errc::platform) << info;
    opencl_layer::reset();
  }
  opencl_layer::answer_fails(CL_DEVICE_PARENT_DEVICE, CL_OUT_OF_RESOURCES);
  EXPECT_EQ(code_of([&] { sycl::make_device<opencl>(ids[0]); }), sycl::errc::runtime);
  opencl_layer::reset();
  EXPECT_EQ(cl().clReleaseDevice(ids[0]), CL_SUCCESS);
}

// Devices are looked for once in a process: each case has one of its own.
class opencl_enumeration : public native_opencl {
 protected:
  void SetUp() override {
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    if (opencl_loader::first_gpu() == nullptr) {
      GTEST_SKIP() << "no OpenCL loader, or no PoCL";
    }
  }
  void TearDown() override {}

  static void expect_devices(bool any) {
    const bool usable = sycl::queue().get_device().is_cpu();
    std::_Exit(usable && opencl_devices().empty() != any ? 0 : 1);
  }
};

TEST_F(opencl_enumeration, finds_devices_where_nothing_fails) {
  EXPECT_EXIT(expect_devices(true), testing::ExitedWithCode(0), "");
}
TEST_F(opencl_enumeration, survives_a_loader_without_platforms) {
  for (const int after : {0, 1}) {
    EXPECT_EXIT((opencl_layer::fail("clGetPlatformIDs", after, -1001), expect_devices(false)),
                testing::ExitedWithCode(0), "");
  }
}
TEST_F(opencl_enumeration, leaves_out_platforms_that_do_not_answer) {
  for (const char* const call : {"clGetPlatformInfo", "clGetDeviceIDs", "clGetDeviceInfo"}) {
    EXPECT_EXIT((opencl_layer::fail_always(call, CL_OUT_OF_RESOURCES), expect_devices(false)),
                testing::ExitedWithCode(0), "");
  }
}
TEST_F(opencl_enumeration, leaves_out_the_one_device_that_does_not_answer) {
  EXPECT_EXIT((opencl_layer::fail("clGetDeviceInfo", 0, CL_OUT_OF_RESOURCES),
               std::_Exit(opencl_devices().size() == 1 ? 0 : 1)),
              testing::ExitedWithCode(0), "");
}

}  // namespace
