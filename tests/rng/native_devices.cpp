// SPDX-License-Identifier: Apache-2.0
// Devices of OpenCL and Level Zero, for which this library has no kernels: a call tells what would
// serve, and writes nothing. Processors among them are served by the host.
#include <cstdint>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "device_engines.hpp"
#include "drawing.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
using sycl::info::device_type;

std::vector<sycl::device> native_devices(device_type type) {
  std::vector<sycl::device> found;
  for (const sycl::device& device : sycl::device::get_devices(type)) {
    if (device.get_backend() == sycl::backend::opencl ||
        device.get_backend() == sycl::backend::ext_kestrel_level_zero) {
      found.push_back(device);
    }
  }
  return found;
}

template <typename Engine>
class native_gpu : public testing::Test {};
using engines_of_gpus = testing::Types<rng::philox4x32x10, rng::mrg32k3a, rng::mcg31m1, rng::mcg59,
                                       rng::mt19937, rng::mt2203, rng::sobol>;
TYPED_TEST_SUITE(native_gpu, engines_of_gpus, tarn_test::engine_name);

/// The code and the text of what a call raises.
struct refusal {
  std::error_code code;
  std::string text;
};
template <typename Call>
refusal refusal_of(Call call) {
  try {
    call();
  } catch (const sycl::exception& raised) {
    return {raised.code(), raised.what()};
  }
  return {{}, "[nothing raised]"};
}

TYPED_TEST(native_gpu, is_refused_with_the_build_that_would_serve_it) {
  const std::vector<sycl::device> gpus = native_devices(device_type::gpu);
  if (gpus.empty()) {
    GTEST_SKIP() << "no driver with a GPU: its loader or PoCL is missing";
  }
  for (const sycl::device& gpu : gpus) {
    sycl::queue queue(gpu);
    constexpr std::uint32_t mark = 0xabcdef01u;
    sycl::buffer<std::uint32_t, 1> buffer{sycl::range<1>(200)};  // mcg59 gives two for each result
    {
      sycl::host_accessor values(buffer, sycl::write_only);
      for (std::uint32_t& value : values) {
        value = mark;
      }
    }
    const refusal told = refusal_of([&] {
      TypeParam engine(queue);  // engines that live on the device are refused here
      rng::generate(rng::bits<>(), engine, 100, buffer);
    });
    EXPECT_EQ(told.code, sycl::make_error_code(sycl::errc::kernel_not_supported)) << told.text;
    EXPECT_NE(told.text.find(gpu.get_info<sycl::info::device::name>()), std::string::npos)
        << told.text;
    EXPECT_NE(told.text.find("TARN_SYCL=AdaptiveCpp"), std::string::npos) << told.text;
    EXPECT_NE(told.text.find("CMake preset cuda"), std::string::npos) << told.text;
    sycl::host_accessor values(buffer, sycl::read_only);
    for (const std::uint32_t value : values) {
      ASSERT_EQ(value, mark);
    }
  }
}

TEST(native_cpu, is_served_by_the_host) {
  const std::vector<sycl::device> cpus = native_devices(device_type::cpu);
  if (cpus.empty()) {
    GTEST_SKIP() << "no driver with a CPU: the OpenCL loader or PoCL is missing";
  }
  for (const sycl::device& cpu : cpus) {
    rng::philox4x32x10 engine(sycl::queue(cpu), 5);
    rng::philox4x32x10 host(tarn_test::cpu_queue(), 5);
    EXPECT_EQ(tarn_test::draw(rng::gaussian<double>(), engine, 1001),
              tarn_test::draw(rng::gaussian<double>(), host, 1001));
  }
}

TEST(native_devices, are_never_the_default) {
  const sycl::backend usual = sycl::queue().get_backend();
  EXPECT_TRUE(usual == sycl::backend::host || usual == sycl::backend::cuda);
  EXPECT_EQ(tarn_test::cpu_queue().get_backend(), sycl::backend::host);
}

}  // namespace
