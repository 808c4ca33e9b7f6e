// SPDX-License-Identifier: Apache-2.0
// What the entries refuse after the parameters have passed: backends, devices and engines that they
// cannot serve, and exceptions, which become a line on standard error. A refused call draws nothing
// and leaves the stream alone.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <tarn_rvx_offload.h>
#include <vector>

#include "refusal.hpp"

namespace {

using namespace tarn_test;

constexpr std::int64_t philox = RVX_BRNG_PHILOX4X32X10;
constexpr char not_exposed[] =
    "Tarn RNG: sycl::exception what: Native device isn't exposed to SYCL. \n";

struct outcome {
  int status;
  std::string told;  // on standard error
};
bool operator==(const outcome& x, const outcome& y) {
  return x.status == y.status && x.told == y.told;
}
void PrintTo(const outcome& value, std::ostream* out) {
  *out << value.status << " \"" << value.told << '"';
}

template <typename Call>
outcome outcome_of(const Call& call) {
  testing::internal::CaptureStderr();
  const int status = call();
  return {status, testing::internal::GetCapturedStderr()};
}

/// A call for raw words from a copy of the stream.
outcome outcome_with(const omptarget::interop& interop, const caller_stream& stream) {
  return outcome_of([&] {
    return status_of<std::uint32_t>(&tarn_rvx_viRngUniformBits_omp_offload_lp64, 0, stream,
                                    interop.handle());
  });
}
outcome outcome_with(const omptarget::interop& interop) {
  return outcome_with(interop, caller_stream(philox, {5}));
}

class offload_refusals : public testing::Test {
 protected:
  gpu_interop interop_{common_queue()};
};

TEST_F(offload_refusals, other_backends_are_minus_1) {
  for (const std::intptr_t id : {1, 2, 5, 7, 8, 100, 1 << 20, -4}) {
    EXPECT_EQ(outcome_with(gpu_interop(common_queue(), id)), (outcome{-1, ""})) << id;
  }
  for (const std::intptr_t id : {sycl_id, level_zero_id}) {
    EXPECT_EQ(outcome_with(gpu_interop(common_queue(), id)), (outcome{0, ""})) << id;
  }
}

TEST_F(offload_refusals, an_object_that_names_no_backend_is_minus_2) {
  EXPECT_EQ(outcome_with(gpu_interop(common_queue(), 0)).status, -2);
  omptarget::interop nothing;
  EXPECT_EQ(outcome_with(nothing).status, -2);
  gpu_interop text(common_queue());
  text.set_str(id_property, "level_zero");  // a property of another type
  EXPECT_EQ(outcome_with(text).status, -2);
}

TEST_F(offload_refusals, an_object_without_a_queue_is_minus_2) {
  for (const int property :
       {context_property, queue_property, kind_property, device_of_kind_2_property}) {
    gpu_interop lacking(common_queue());
    lacking.fail_native(property, 1);
    EXPECT_EQ(outcome_with(lacking).status, -2) << property;
  }
}

TEST_F(offload_refusals, an_unknown_device_is_minus_2_and_told) {
  // Of a queue that no other object has named: what is known needs no device.
  const sycl::context context(common_queue().get_device());
  const sycl::queue fresh(context, common_queue().get_device());
  gpu_interop unknown(fresh);
  int nobody = 0;
  unknown.set_native(device_of_kind_2_property, &nobody);
  EXPECT_EQ(outcome_with(unknown), (outcome{-2, not_exposed}));
}

TEST_F(offload_refusals, no_object_at_all_is_minus_2) {
  const caller_stream stream(philox, {5});
  const int mistakes = omptarget::mistakes();
  EXPECT_EQ(outcome_of([&] {
              return status_of<std::uint32_t>(&tarn_rvx_viRngUniformBits_omp_offload_lp64, 0,
                                              stream, nullptr);
            }).status,
            -2);
  EXPECT_EQ(omptarget::mistakes(), mistakes) << "the runtime is not asked about nothing";
}

// OpenCL is served, here by a queue that only says so, unless shared virtual memory is asked for.
TEST_F(offload_refusals, opencl_is_minus_1_where_memory_is_shared_virtual_memory) {
  const gpu_interop opencl(common_queue(), opencl_id);
  constexpr const char* name = "LIBOMPTARGET_OPENCL_USE_SVM";
  for (const char* const yes : {"1", "10", "1x", "1 "}) {
    ::setenv(name, yes, 1);
    EXPECT_EQ(outcome_with(opencl), (outcome{-1, ""})) << yes;
    EXPECT_EQ(outcome_with(interop_), (outcome{0, ""})) << "of the others nobody asks that";
  }
  for (const char* const no : {"0", "", "01", " 1", "true", "yes"}) {
    ::setenv(name, no, 1);
    EXPECT_EQ(outcome_with(opencl), (outcome{0, ""})) << '"' << no << '"';
  }
  ::unsetenv(name);
  EXPECT_EQ(outcome_with(opencl), (outcome{0, ""}));
}

TEST_F(offload_refusals, engines_of_the_host_alone_are_minus_1014) {
  const struct {
    std::int64_t code;
    std::vector<std::uint32_t> seed;
  } engines[] = {
      {RVX_BRNG_R250, {5}},        {RVX_BRNG_NIEDERR, {5}},      {RVX_BRNG_SFMT19937, {5}},
      {RVX_BRNG_NONDETERM, {}},    {RVX_BRNG_ARS5, {5}},         {RVX_BRNG_WH, {5}},
      {RVX_BRNG_WH + 1, {5}},      {RVX_BRNG_WH + 272, {5}},     {RVX_BRNG_MT2203 + 1, {5}},
      {RVX_BRNG_MT2203 + 16, {5}}, {RVX_BRNG_MT2203 + 6023, {5}}};
  for (const auto& engine : engines) {
    const caller_stream stream(engine.code, engine.seed);
    EXPECT_EQ(outcome_with(interop_, stream), (outcome{-1014, ""})) << std::hex << engine.code;
    const gpu_interop other(common_queue(), 1);
    EXPECT_EQ(outcome_with(other, stream), (outcome{-1, ""})) << "the backend is asked first";
  }
}

// Codes that no engine has: the number is what the entry goes by.
TEST_F(offload_refusals, streams_of_unknown_codes_are_minus_1014) {
  for (const std::uint32_t code : {0u, 0xA00000u, 0xB00000u, 0xC00000u, 0x1100000u, 0x300001u,
                                   0x1000001u, 0xFFFFFFFFu, 0x80100000u}) {
    std::vector<unsigned char> record(4096);
    std::memcpy(record.data(), &code, sizeof code);
    record[4] = 1;
    const std::vector<unsigned char> before = record;
    const results<std::uint32_t> out(common_queue(), room);
    EXPECT_EQ(tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, record.data(), few, out.get(),
                                                          interop_.handle()),
              -1014)
        << std::hex << code;
    EXPECT_TRUE(out.untouched());
    EXPECT_EQ(record, before);
  }
}

TEST_F(offload_refusals, streams_that_are_none_are_minus_2) {
  std::vector<unsigned char> no_mark(4096);
  const std::uint32_t code = RVX_BRNG_PHILOX4X32X10;
  std::memcpy(no_mark.data(), &code, sizeof code);
  for (void* const stream : {static_cast<void*>(nullptr), static_cast<void*>(no_mark.data())}) {
    const results<float> out(common_queue(), room);
    const outcome refused = outcome_of([&] {
      return tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, few, out.get(), 0, 1,
                                                    interop_.handle());
    });
    EXPECT_EQ(refused.status, -2);
    EXPECT_NE(refused.told.find("Tarn RNG: kestrel::tarn::exception: what: "), std::string::npos)
        << refused.told;
    EXPECT_TRUE(out.untouched());
  }
}

TEST_F(offload_refusals, no_place_for_the_results_is_minus_2) {
  const caller_stream stream(philox, {5});
  const auto before = stream.image();
  const outcome refused = outcome_of([&] {
    return tarn_rvx_vsRngUniform_omp_offload_lp64(0, stream, few, nullptr, 0, 1, interop_.handle());
  });
  EXPECT_EQ(refused.status, -2);
  EXPECT_EQ(refused.told.find("Tarn RNG: "), 0u) << refused.told;
  EXPECT_EQ(stream.image(), before);
}

// What passes the entry's own look at the parameters and not that of the distribution.
TEST_F(offload_refusals, what_a_distribution_refuses_is_minus_2_and_told_in_its_words) {
  const caller_stream stream(philox, {5});
  const auto told = [](const std::string& what) {
    return outcome{-2,
                   "Tarn RNG: kestrel::tarn::exception: what: kestrel::tarn::rng::" + what + "\n"};
  };
  const auto integers = [&](auto entry, std::int64_t method, auto... argument) {
    return outcome_of([&] {
      return status_of<std::int32_t>(entry, method, stream, interop_.handle(), argument...);
    });
  };
  const std::string geometric = "geometric: invalid argument: p > 1 or p < 0";
  EXPECT_EQ(integers(&tarn_rvx_viRngGeometric_omp_offload_lp64, 0, 0.0), told(geometric));
  EXPECT_EQ(integers(&tarn_rvx_virnggeometric_omp_offload, 0, 1.0), told(geometric));
  EXPECT_EQ(integers(&tarn_rvx_viRngPoisson_omp_offload_ilp64, 1, 0.0),
            told("poisson: invalid argument: lamdba < 0"));
}

TEST_F(offload_refusals, fair_bits_are_not_had_of_every_engine) {
  for (const std::int64_t code : {RVX_BRNG_MCG31, RVX_BRNG_MRG32K3A, RVX_BRNG_SOBOL}) {
    const caller_stream stream(code, {5});
    const outcome narrow = outcome_of([&] {
      return status_of<std::uint32_t>(&tarn_rvx_viRngUniformBits32_omp_offload_lp64, 0, stream,
                                      interop_.handle());
    });
    const outcome wide = outcome_of([&] {
      return status_of<std::uint64_t>(&tarn_rvx_viRngUniformBits64_omp_offload_lp64, 0, stream,
                                      interop_.handle());
    });
    EXPECT_EQ(narrow, wide);
    EXPECT_EQ(narrow.status, -2);
    EXPECT_EQ(narrow.told.find("Tarn RNG: kestrel::tarn::exception: what: "), 0u) << narrow.told;
    EXPECT_NE(narrow.told.find("uniform_bits"), std::string::npos) << narrow.told;
  }
}

// No device has so many work-items; nothing of the caller's has been touched when that is found.
TEST_F(offload_refusals, counts_past_the_range_of_a_kernel_are_minus_2) {
  const caller_stream stream(philox, {5});
  const auto before = stream.image();
  const results<std::uint32_t> out(common_queue(), room);
  const outcome refused = outcome_of([&] {
    return tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, std::int64_t{1} << 40, out.get(),
                                                       interop_.handle());
  });
  EXPECT_EQ(refused.status, -2);
  EXPECT_EQ(refused.told.find("Tarn RNG: sycl::exception what: Provided range is out of integer"),
            0u)
      << refused.told;
  EXPECT_EQ(stream.image(), before);
  EXPECT_TRUE(out.untouched());
}

TEST_F(offload_refusals, the_end_of_a_sequence_is_minus_2) {
  const caller_stream stream(RVX_BRNG_SOBOL, {1});
  ASSERT_EQ(rvxSkipAheadStream(stream, (std::int64_t{1} << 32) - 4), 0);
  const outcome refused = outcome_with(interop_, stream);
  EXPECT_EQ(refused.status, -2);
  EXPECT_EQ(refused.told.find("Tarn RNG: kestrel::tarn::exception: what: "), 0u) << refused.told;
}

}  // namespace
