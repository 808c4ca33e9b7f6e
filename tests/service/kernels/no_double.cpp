// SPDX-License-Identifier: Apache-2.0
// What is said of double kernels on a device without double precision. SYCL asks devices once, so
// the device of this program never had any.
#include <string>

#include "../../forge/binaries.hpp"
#include "binary_driver.hpp"
#include "sycl_suite.hpp"

namespace {

using namespace kestrel::tarn::gpu;

class NoDouble : public SyclKernels {
 protected:
  std::optional<sycl::device> find_gpu() override {
    opencl_layer::answer(CL_DEVICE_DOUBLE_FP_CONFIG, cl_device_fp_config{0});
    return SyclKernels::find_gpu();
  }
  void SetUp() override {
    SyclKernels::SetUp();
    if (!IsSkipped()) {
      ASSERT_TRUE(queue->get_device().get_info<sycl::info::device::double_fp_config>().empty());
    }
  }

  std::string text(const char* between, const std::string& kernel) const {
    return "error: double type is not supported on this device: '" + name_of_device(*queue) + "'" +
           between + "\nin kernel: " + kernel + "\ninternal error: kernel failed to build.\n";
  }
  /// Only the build has failed, by the driver's word.
  template <typename Call>
  void expect_text(const std::string& text, int after, Call call) {
    opencl_layer::fail("clBuildProgram", after, CL_BUILD_PROGRAM_FAILURE);
    expect_error(sycl::errc::runtime, text, call);
    EXPECT_EQ(programs(), 0);
  }
};

TEST_F(NoDouble, SourceOfADoubleKernelIsToldApart) {
  expect_text(text("", "kestrel::tarn::blas::dk"), 0, [&] { get("dk", 1, "", 1); });
  expect_text(text("", "kestrel::tarn::dft::k_d"), 0, [&] { get("k_d", 1, "", 2); });
  expect_text(text("", "kestrel::tarn::lapack::zk"), 0, [&] { get("zk", 1, "", 5); });
  expect_text(text("", "kestrel::tarn::blas::izk"), 0, [&] {
    get_OCL_kernel_by_progname(&status, &*queue, 1, "p", taking("izk", 1).c_str(), "izk", "");
  });
}

TEST_F(NoDouble, OtherFormsHaveASpaceBehindTheDevice) {
  opencl_layer::take_source_as_il(true);
  const std::string module = taking("dk", 1);
  const tarn_gpu_spirv_kernel_t spirv{module.size(), module.data()};
  expect_text(text(" ", "kestrel::tarn::blas::dk"), 0,
              [&] { tarn_gpu_get_spirv_kernel(&status, &*queue, 1, &spirv, "dk", ""); });
  const binary_driver driver(tarn_test::older_binary({}), taking("dk", 1));
  const tarn_gpu_binary_kernel_t binary{4, "code", nullptr, nullptr};
  expect_text(text(" ", "kestrel::tarn::blas::dk"), 0,
              [&] { get_binary_kernel(&status, &*queue, 1, &binary, "dk"); });
  // The dummy is source, what comes out of the splice is not.
  const tarn_gpu_binary_kernel_t with_dummy{4, "code", "kernel void dk() {}", ""};
  expect_text(text("", "kestrel::tarn::blas::dk"), 0,
              [&] { get_binary_kernel(&status, &*queue, 1, &with_dummy, "dk"); });
  expect_text(text(" ", "kestrel::tarn::blas::dk"), 1,
              [&] { get_binary_kernel(&status, &*queue, 1, &with_dummy, "dk"); });
}

TEST_F(NoDouble, OtherKernelsFailAsEverywhere) {
  opencl_layer::fail("clBuildProgram", 0, -11);
  expect_opencl_error(-11, "kestrel::tarn::blas::sk", [&] { get("sk", 1, "", 1); });
  opencl_layer::fail("clBuildProgram", 0, -11);
  expect_opencl_error(-11, "dk", [&] { get("dk", 1, "", 0); });
  opencl_layer::fail("clBuildProgram", 0, -11);
  expect_opencl_error(-11, "kestrel::tarn::lapack::idk", [&] { get("idk", 1, "", 5); });
}

TEST_F(NoDouble, OtherFailuresOfDoubleKernelsAreOrdinary) {
  opencl_layer::fail("clBuildProgram", 0, -10);
  expect_opencl_error(-10, "kestrel::tarn::blas::dk", [&] { get("dk", 1, "", 1); });
  opencl_layer::fail("clCreateKernel", 0, -11);
  expect_opencl_error(-11, "kestrel::tarn::blas::dk", [&] { get("dk", 1, "", 1); });
}

}  // namespace
