// SPDX-License-Identifier: Apache-2.0
// The test of a device with precompiled kernels, on the services of both layers. The driver double
// makes of the generated binary a kernel in OpenCL C that compares what the self-test hands it.
#include <string>
#include <vector>

#include "binary_driver.hpp"
#include "c_suite.hpp"
#include "have_binary_kernels.hpp"
#include "sycl_suite.hpp"

namespace {

using namespace kestrel::tarn;

constexpr cl_device_info ip_version_query = 0x4250;

// Eight work-items in one group; the first one tells. `result` is stored when all is as it should.
std::string checking_kernel(const char* result) {
  return std::string(R"(
    kernel void binary_test(uint src0, ulong src1, ushort src2, ushort src3, ulong src4,
                            ulong src5, global uint* src_ptr, global uint* ok) {
      const bool sizes = get_global_size(0) == 4 && get_global_size(1) == 2 &&
                         get_global_size(2) == 1 && get_local_size(0) == 4 &&
                         get_local_size(1) == 2 && get_local_size(2) == 1;
      const bool scalars = src0 == 0xBEEFCAFE && src1 == 0x3141592653589793 && src2 == 0xBEAD &&
                           src3 == 0xFACE && src4 == 0x0123456789ABCDEF &&
                           src5 == 0xFEDCBA9876543210;
      if (get_global_id(0) == 0 && get_global_id(1) == 0 && *ok == 0) {
        *ok = sizes && scalars && *src_ptr == 0xABADFEED ? )") +
         result + " : 0;\n      }\n    }\n";
}

forge::byte_vector some_code(forge::kernel_interface&) {
  return forge::byte_vector(64, 0x5A);
}
forge::byte_vector no_code(forge::kernel_interface&) {
  return {};
}

const char* const warning =
    "TARN Warning: Incompatible OpenCL driver version. GPU performance may be reduced.\n";

/// What `call` prints on standard output.
template <typename Call>
std::string printed(Call call) {
  testing::internal::CaptureStdout();
  call();
  return testing::internal::GetCapturedStdout();
}

template <typename Suite>
class SelfTest : public Suite {
 protected:
  void SetUp() override {
    Suite::SetUp();
    if (!this->IsSkipped()) {
      opencl_layer::answer(ip_version_query, cl_uint{9} << 22);  // Fir
      forge::process_formats().prefer_elf = true;
      forge::process_formats().elf_confirmed = true;
    }
  }
  void TearDown() override {
    forge::process_formats().prefer_elf = false;
    forge::process_formats().elf_confirmed = false;
    Suite::TearDown();
  }
};

class CSelfTest : public SelfTest<CKernels> {
 protected:
  bool test(forge::code_source generate) {
    return gpu::test_binary_kernels(&status, queue(), generate);
  }
  bool is_checked() const {
    tarn_gpu_device_info_t info;
    EXPECT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 0);
    return info.binary_checked;
  }
};

class SyclSelfTest : public SelfTest<SyclKernels> {
 protected:
  bool test(forge::code_source generate) {
    return gpu::test_binary_kernels(&status, &*queue, generate);
  }
  bool is_checked() {
    tarn_gpu_device_info_t info;
    EXPECT_EQ(gpu::get_device_info(&*queue, &info), 0);
    return info.binary_checked;
  }
};

TEST_F(CSelfTest, PassesWhenTheKernelFindsWhatItExpects) {
  const binary_driver driver({}, checking_kernel("256"));  // any bit of the word will do
  bool usable = false;
  EXPECT_EQ(printed([&] { usable = test(some_code); }), "");
  EXPECT_TRUE(usable);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(driver.taken().size(), 1U);
  EXPECT_EQ(held(opencl_layer::object::buffer), 0);
  EXPECT_EQ(held(opencl_layer::object::event), 0);
  // The verdict stays.
  EXPECT_TRUE(test(no_code));
  EXPECT_EQ(tarn_serv_gpu_have_binary_kernels(&status, queue()), 1);
  EXPECT_EQ(driver.taken().size(), 1U);
}

TEST_F(SyclSelfTest, PassesWhenTheKernelFindsWhatItExpects) {
  const binary_driver driver({}, checking_kernel("1"));
  bool usable = false;
  EXPECT_EQ(printed([&] { usable = test(some_code); }), "");
  EXPECT_TRUE(usable);
  EXPECT_EQ(driver.taken().size(), 1U);
  EXPECT_TRUE(test(no_code));
  EXPECT_EQ(gpu::have_binary_kernels(&status, &*queue), 1);
  EXPECT_EQ(driver.taken().size(), 1U);
}

TEST_F(SyclSelfTest, LooksAtTheFirstByteOnly) {
  const binary_driver driver({}, checking_kernel("256"));
  bool usable = true;
  EXPECT_EQ(printed([&] { usable = test(some_code); }), warning);
  EXPECT_FALSE(usable);
}

TEST_F(CSelfTest, WarnsWhenTheKernelFindsSomethingElse) {
  const binary_driver driver({}, checking_kernel("0"));
  bool usable = true;
  EXPECT_EQ(printed([&] { usable = test(some_code); }), warning);
  EXPECT_FALSE(usable);
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(is_checked());
  EXPECT_EQ(printed([&] { usable = test(some_code); }), "");
  EXPECT_FALSE(usable);
}

TEST_F(CSelfTest, SaysNothingWithoutCodeForTheDevice) {
  bool usable = true;
  EXPECT_EQ(printed([&] { usable = test(no_code); }), "");
  EXPECT_FALSE(usable);
  EXPECT_TRUE(is_checked());
}

TEST_F(CSelfTest, TheLibraryHasNoCode) {
  EXPECT_EQ(printed([&] { EXPECT_EQ(tarn_serv_gpu_have_binary_kernels(&status, queue()), 0); }),
            "");
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(is_checked());
}

TEST_F(SyclSelfTest, TheLibraryHasNoCode) {
  EXPECT_EQ(printed([&] { EXPECT_EQ(gpu::have_binary_kernels(&status, &*queue), 0); }), "");
  EXPECT_TRUE(is_checked());
}

TEST_F(CSelfTest, AnyNativeFailureIsAWarning) {
  const binary_driver driver({}, checking_kernel("1"));
  for (const char* const function :
       {"clCreateProgramWithSource", "clBuildProgram", "clCreateKernel", "clCreateBuffer",
        "clEnqueueFillBuffer", "clEnqueueWriteBuffer", "clSetKernelArg", "clEnqueueNDRangeKernel",
        "clWaitForEvents", "clEnqueueReadBuffer"}) {
    SCOPED_TRACE(function);
    clean_up();
    opencl_layer::fail(function, 0, -9999);
    bool usable = true;
    EXPECT_EQ(printed([&] { usable = test(some_code); }), warning);
    EXPECT_FALSE(usable);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(held(opencl_layer::object::buffer), 0);
    EXPECT_EQ(held(opencl_layer::object::event), 0);
  }
}

TEST_F(SyclSelfTest, WhatIsThrownIsAWarning) {
  const binary_driver driver({}, checking_kernel("1"));
  for (const char* const function :
       {"clCreateProgramWithSource", "clBuildProgram", "clCreateKernel", "clEnqueueSVMMemcpy",
        "clSetKernelArgSVMPointer", "clEnqueueNDRangeKernel"}) {
    SCOPED_TRACE(function);
    tarn_sycl_destructor();
    gpu::sycl_tables().clear();
    opencl_layer::fail(function, 0, -9999);
    bool usable = true;
    EXPECT_EQ(printed([&] { usable = test(some_code); }), warning);
    EXPECT_FALSE(usable);
    queue->wait_and_throw();  // without a handler: an error left behind would end the process
  }
}

TEST_F(CSelfTest, AQueueWithoutADeviceHasAStatus) {
  EXPECT_EQ(tarn_serv_gpu_have_binary_kernels(&status, nullptr), 0);
  EXPECT_EQ(status, CL_INVALID_COMMAND_QUEUE);
}

TEST_F(SyclSelfTest, OtherBackendsAreNotTested) {
  sycl::queue virtual_queue(gpu_of(service::backend_code::host).value());
  EXPECT_EQ(printed([&] { EXPECT_EQ(gpu::have_binary_kernels(&status, &virtual_queue), 0); }), "");
}

}  // namespace
