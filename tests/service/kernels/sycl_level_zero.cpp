// SPDX-License-Identifier: Apache-2.0
// Kernels for SYCL queues over Level Zero: modules from SPIR-V and device code, source that an
// OpenCL device compiles, what is thrown, and the clean-up.
#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "../../forge/binaries.hpp"
#include "binary_driver.hpp"
#include "have_binary_kernels.hpp"
#include "level_zero_kernels.hpp"
#include "level_zero_suite.hpp"

namespace {

using namespace kestrel::tarn::gpu;
namespace forge = kestrel::tarn::forge;
using kestrel::tarn::service::backend_code;
using byte_vector = std::vector<unsigned char>;

TEST_F(LevelZeroKernels, SpirVIsAModuleOfThatFormat) {
  const module_log log;
  const handle kernel = get_spirv("-flags");
  EXPECT_EQ(arguments_of(kernel), 2);
  ASSERT_EQ(log.entries().size(), 1U);
  const module_log::entry& module = log.entries()[0];
  EXPECT_EQ(module.type, 27);
  EXPECT_EQ(module.next, nullptr);
  EXPECT_EQ(module.format, 0);
  EXPECT_EQ(std::memcmp(module.bytes.data(), spirv_words, sizeof spirv_words), 0);
  EXPECT_EQ(module.bytes.size(), sizeof spirv_words);
  EXPECT_EQ(module.flags, "-flags");
  EXPECT_FALSE(module.has_constants);
  EXPECT_FALSE(module.has_log);
  EXPECT_EQ(modules(), 1);
  release(kernel);
  EXPECT_EQ(get_spirv("-flags"), kernel);
  const handle second = get_spirv("-flags");
  EXPECT_NE(second, kernel);
  EXPECT_EQ(log.entries().size(), 1U);
  EXPECT_EQ(native_kernels(), 2);
}

TEST_F(LevelZeroKernels, TheKernelIsOneOfTheQueuesContext) {
  const auto* const kernel = static_cast<const sycl::kernel*>(get_spirv()->kernel);
  EXPECT_EQ(kernel->get_context(), queue->get_context());
  EXPECT_EQ(kernel->get_info<sycl::info::kernel::function_name>(), "k");
}

TEST_F(LevelZeroKernels, DeviceCodeIsANativeModule) {
  const module_log log;
  const byte_vector code = tarn_test::counting(500, 3);
  const tarn_gpu_binary_kernel_t binary{code.size(), code.data(), nullptr, "-DX"};
  const handle kernel =
      tarn_gpu_get_binary_kernel_ext(&status, &*queue, 3, &binary, "k", "key", 3, "payload", 7);
  EXPECT_EQ(arguments_of(kernel), 2);
  ASSERT_EQ(log.entries().size(), 1U);
  EXPECT_EQ(log.entries()[0].format, 1);
  EXPECT_EQ(log.entries()[0].bytes, code);
  EXPECT_EQ(log.entries()[0].flags, "");
  const void* payload = nullptr;
  std::size_t size = 0;
  EXPECT_NE(tarn_gpu_get_cached_kernel(&status, &*queue, 3, "k", "key", 3, &payload, &size),
            nullptr);
  EXPECT_EQ(std::string(static_cast<const char*>(payload), size), "payload");
}

TEST_F(LevelZeroKernels, TheSyclContextIsTheKey) {
  const handle first = get_spirv();
  release(first);
  sycl::queue second(queue->get_context(), queue->get_device());
  EXPECT_EQ(tarn_gpu_get_spirv_kernel(&status, &second, 2, &spirv, "k", ""), first);
  sycl::queue third = queue_on(queue->get_device());
  EXPECT_NE(tarn_gpu_get_spirv_kernel(&status, &third, 2, &spirv, "k", ""), first);
  EXPECT_EQ(modules(), 2);
  const auto* const entry = cache()
                                .fetch({get_device_id(&status, &*queue),
                                        {nullptr, queue->get_context()},
                                        TARN_GPU_BACKEND_LEVEL_ZERO},
                                       {2, "k", {}}, false)
                                .where;
  ASSERT_NE(entry, nullptr);
  EXPECT_EQ(entry->backend, 1);
  EXPECT_EQ(entry->context.native, nullptr);
  tarn_sycl_destructor();
}

TEST_F(LevelZeroKernels, SourceIsCompiledByTheOpenCLDeviceAndKeptThereToo) {
  const module_log log;
  const byte_vector binary = tarn_test::counting(300, 9);
  const binary_driver driver(binary, "");
  const int built = builds();
  const handle kernel = get("k", 2, "-DX");
  EXPECT_EQ(arguments_of(kernel), 2);
  EXPECT_EQ(builds(), built + 1);
  EXPECT_EQ(driver.options(), std::vector<std::string>{"-DX"});
  ASSERT_EQ(log.entries().size(), 1U);
  EXPECT_EQ(log.entries()[0].format, 1);
  EXPECT_EQ(log.entries()[0].bytes, binary);
  EXPECT_EQ(programs(), 1);
  EXPECT_EQ(cache().count, 2U);
  // Another context finds the program of OpenCL.
  sycl::queue other = queue_on(queue->get_device());
  EXPECT_NE(get_OCL_kernel(&status, &other, 0, taking("k", 2).c_str(), "k", "-DX"), kernel);
  EXPECT_EQ(builds(), built + 1);
  EXPECT_EQ(log.entries().size(), 2U);
  EXPECT_EQ(cache().count, 3U);
  tarn_sycl_destructor();
}

TEST_F(LevelZeroKernels, TheProgramOfOpenCLStandsUnderItsOwnDeviceAndContext) {
  const binary_driver driver(tarn_test::counting(300, 9), "");
  get("k", 2, "-DX");
  cl_device_id opencl_device = nullptr;
  cl_context context = nullptr;
  tarn_gpu_get_cl_device_context(&status, &*queue, &opencl_device, &context);
  EXPECT_EQ(opencl_device, device);
  const auto* const entry = cache()
                                .fetch({device, {context, std::nullopt}, TARN_GPU_BACKEND_OPENCL},
                                       {0, "k", {"-DX", 3}}, false)
                                .where;
  ASSERT_NE(entry, nullptr);
  EXPECT_EQ(entry->backend, 0);
  EXPECT_FALSE(entry->context.owner.has_value());
  EXPECT_TRUE(std::holds_alternative<opencl_program>(entry->program));
  EXPECT_EQ(entry->kernels, nullptr);
}

TEST_F(LevelZeroKernels, TheSelfTestsProgramIsNotKeptThere) {
  const binary_driver driver(tarn_test::counting(300, 9), "");
  const int built = builds();
  EXPECT_EQ(arguments_of(get("binary_test", 8)), 8);
  EXPECT_EQ(builds(), built + 1);
  EXPECT_EQ(programs(), 0);
  EXPECT_EQ(cache().count, 1U);
}

TEST_F(LevelZeroKernels, ADummyIsCompiledByTheOpenCLDevice) {
  const module_log log;
  const binary_driver driver(tarn_test::older_binary({}), "");
  const byte_vector code = tarn_test::counting(500, 3);
  const std::string dummy = taking("k", 2);
  const tarn_gpu_binary_kernel_t with_dummy{code.size(), code.data(), dummy.c_str(), "-DDUMMY"};
  const handle kernel = get_binary_kernel(&status, &*queue, 3, &with_dummy, "k");
  EXPECT_EQ(arguments_of(kernel), 2);
  EXPECT_EQ(driver.options(), std::vector<std::string>{"-DDUMMY"});
  ASSERT_EQ(log.entries().size(), 1U);
  const byte_vector& module = log.entries()[0].bytes;
  EXPECT_EQ(log.entries()[0].format, 1);
  EXPECT_NE(std::search(module.begin(), module.end(), code.begin(), code.end()), module.end());
  release(kernel);
  EXPECT_EQ(get_binary_kernel(&status, &*queue, 3, &with_dummy, "k"), kernel);
  EXPECT_EQ(opencl_layer::objects(opencl_layer::object::program), 0);  // the dummy is not kept
}

TEST_F(LevelZeroKernels, AProgramWithANameGivesPlainKernels) {
  level_zero_driver::kernel("other", 3, nothing);
  const binary_driver driver(tarn_test::counting(300, 9), "");
  const auto plain = [&](const char* name) {
    return static_cast<sycl::kernel*>(
        get_OCL_kernel_by_progname(&status, &*queue, 1, "both", taking("k", 2).c_str(), name, ""));
  };
  sycl::kernel* const one = plain("k");
  sycl::kernel* const two = plain("other");
  EXPECT_EQ(one->get_info<sycl::info::kernel::num_args>(), 2U);
  EXPECT_EQ(two->get_info<sycl::info::kernel::num_args>(), 3U);
  EXPECT_EQ(modules(), 1);
  release_kernel_obj(&status, one);
  release_kernel_obj(&status, two);
  EXPECT_EQ(native_kernels(), 0);
}

TEST_F(LevelZeroKernels, FailuresHaveTheCodeInHexadecimal) {
  level_zero_driver::fail("zeModuleCreate", 0, ZE_RESULT_ERROR_MODULE_BUILD_FAILURE);
  expect_level_zero_error("70000004", "kestrel::tarn::dft::k", [&] { get_spirv(); });
  EXPECT_EQ(level_zero_driver::objects(), living_with_queue);
  level_zero_driver::fail("zeKernelCreate", 0, ZE_RESULT_ERROR_INVALID_KERNEL_NAME);
  expect_level_zero_error("78000011", "kestrel::tarn::dft::k", [&] { get_spirv(); });
  EXPECT_EQ(modules(), 1);  // it stays in the cache
  tarn_sycl_destructor();
  EXPECT_EQ(level_zero_driver::objects(), living_with_queue);
}

TEST_F(LevelZeroKernels, AKernelThatSyclRefusesIsGone) {
  level_zero_driver::fail("zeKernelSetIndirectAccess", 0, ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY);
  EXPECT_THROW(get_spirv(), sycl::exception);
  EXPECT_EQ(native_kernels(), 0);
  tarn_sycl_destructor();
  EXPECT_EQ(level_zero_driver::objects(), living_with_queue);
}

TEST_F(LevelZeroKernels, FailuresOfTheOpenCLDeviceAreThrownAsOpenCLs) {
  const binary_driver driver(tarn_test::counting(300, 9), "");
  const std::string name = "kestrel::tarn::lapack::k";
  for (const auto& [function, after] :
       std::vector<std::pair<const char*, int>>{{"clCreateProgramWithSource", 0},
                                                {"clBuildProgram", 0},
                                                {"clRetainProgram", 0},
                                                {"clRetainProgram", 1},
                                                {"clGetProgramInfo", 0},
                                                {"clGetProgramInfo", 1},
                                                {"clGetProgramInfo", 2},
                                                {"clGetProgramInfo", 3}}) {
    SCOPED_TRACE(std::string(function) + std::to_string(after));
    opencl_layer::fail(function, after, -9999);
    expect_opencl_error(-9999, name, [&] { get("k", 2, "", 5); });
    opencl_layer::reset();
    pair_devices();
    tarn_sycl_destructor();
    EXPECT_EQ(living(), before);
    EXPECT_EQ(level_zero_driver::objects(), living_with_queue);
  }
  get("k", 2, "", 5);
}

TEST_F(LevelZeroKernels, WithoutAnOpenCLDeviceOnlySourceFails) {
  opencl_layer::answer(CL_DEVICE_VENDOR_ID, cl_uint{1});
  expect_error(sycl::errc::runtime, "OpenCL error -1", [&] { get("k", 2); });
  EXPECT_EQ(arguments_of(get_spirv()), 2);
  // With a match the table of matches is there to be cleaned up.
  pair_devices();
  cl_device_id found = nullptr;
  tarn_gpu_get_cl_device_context(&status, &*queue, &found, nullptr);
  EXPECT_EQ(found, device);
}

TEST_F(LevelZeroKernels, ABundleOfAnotherBackendIsRefused) {
  const sycl::device gpu = gpu_of(backend_code::opencl).value();
  const sycl::context context(gpu);
  const cl_context native = sycl::get_native<sycl::backend::opencl>(context);
  const program_code code{program_format::source, "kernel void k() {}", 0, ""};
  {
    const opencl_program program = build_program(device, native, code);
    const auto bundle = kestrel::tarn::service::make_kernel_bundle(program.get(), context);
    expect_error(sycl::errc::backend_mismatch, "Backends mismatch",
                 [&] { create_kernel(bundle, queue->get_context(), "k"); });
  }
  opencl_loader::get().clReleaseContext(native);
}

TEST_F(LevelZeroKernels, ExhaustedMemoryIsAnErrorOfOpenCL) {
  get_eu_count(&*queue);
  int failures = 0;
  for (bool failed = true; failed; ++failures) {
    SCOPED_TRACE(failures);
    {
      const serv_memory::failure next(failures);
      try {
        get_spirv("-DX");
      } catch (const sycl::exception& error) {
        EXPECT_EQ(error.what(), "OpenCL error -6\nOn device: " + place("kestrel::tarn::dft::k"));
        EXPECT_TRUE(next.happened());
      }
      failed = next.happened();
    }
    int ignored = 0;
    cache().clear(&ignored);
    EXPECT_EQ(level_zero_driver::objects(), living_with_queue);
  }
  EXPECT_GT(failures, 4);
}

forge::byte_vector some_code(forge::kernel_interface&) {
  return forge::byte_vector(64, 0x5A);
}

void check_arguments(const level_zero_driver::kernel_launch& launch) {
  bool sizes = true;
  for (std::size_t d = 0; d < 3; ++d) {
    sizes = sizes &&
            launch.group_size[d] == (d == 0   ? 4U
                                     : d == 1 ? 2U
                                              : 1U) &&
            launch.group_count[d] == 1;
  }
  const bool scalars = launch.argument<std::uint32_t>(0) == 0xBEEFCAFE &&
                       launch.argument<std::uint64_t>(1) == 0x3141592653589793 &&
                       launch.argument<std::uint16_t>(2) == 0xBEAD &&
                       launch.argument<std::uint16_t>(3) == 0xFACE &&
                       launch.argument<std::uint64_t>(4) == 0x0123456789ABCDEF &&
                       launch.argument<std::uint64_t>(5) == 0xFEDCBA9876543210;
  const bool source = *launch.argument<const std::uint32_t*>(6) == 0xABADFEED;
  *launch.argument<std::uint32_t*>(7) = sizes && scalars && source ? 1 : 0;
}

TEST_F(LevelZeroKernels, TheSelfTestRunsOnThisBackend) {
  const module_log log;
  level_zero_driver::kernel("binary_test", 8, check_arguments);
  forge::process_formats().prefer_elf = true;
  forge::process_formats().elf_confirmed = true;
  EXPECT_TRUE(test_binary_kernels(&status, &*queue, some_code));
  forge::process_formats().prefer_elf = false;
  forge::process_formats().elf_confirmed = false;
  ASSERT_EQ(log.entries().size(), 1U);
  EXPECT_EQ(log.entries()[0].format, 1);
  EXPECT_EQ(have_binary_kernels(&status, &*queue), 1);  // the verdict stays
}

TEST_F(LevelZeroKernels, TheCleanUpEmptiesAllTablesAndANewQueueWorks) {
  const binary_driver driver(tarn_test::counting(300, 9), "");
  for (int round = 0; round < 3; ++round) {
    sycl::queue fresh = queue_on(queue->get_device());
    const handle kernel = tarn_gpu_get_spirv_kernel(&status, &fresh, 2, &spirv, "k", "");
    EXPECT_EQ(arguments_of(kernel), 2);
    get_OCL_kernel(&status, &fresh, 0, taking("k", 2).c_str(), "k", "");
    EXPECT_EQ(modules(), 2);
    EXPECT_EQ(programs(), 1);
    tarn_sycl_destructor();
    EXPECT_EQ(modules(), 0);
    EXPECT_EQ(native_kernels(), 0);
    EXPECT_EQ(living(), before);
    EXPECT_EQ(cache().bucket_count, 0U);
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
  }
}

}  // namespace
