// SPDX-License-Identifier: Apache-2.0
// The self-test's binary: its interface, and the two attempts at a container, with a generator of
// the test's own and a driver that follows a script.
#include "binary_generator.hpp"

#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "elf_writer.hpp"
#include "exceptions.hpp"
#include "fake_drivers.hpp"
#include "interface_text.hpp"
#include "parse_binary.hpp"
#include "replace_kernel.hpp"

namespace {

using namespace tarn_test;
using names = std::vector<std::string>;

const names compiling = {"clCreateProgramWithSource", "clBuildProgram",   "clGetProgramInfo",
                         "clGetProgramInfo",          "clGetProgramInfo", "clGetProgramInfo",
                         "clReleaseProgram"};
const names failed_compiling = {"clCreateProgramWithSource"};
const names trying = {"clCreateProgramWithBinary", "clBuildProgram", "clReleaseProgram"};

names joined(const names& first, const names& second) {
  names all = first;
  all.insert(all.end(), second.begin(), second.end());
  return all;
}

const byte_vector body = counting(48, 0x31);

// What the generators below were asked for, and what they settle.
std::vector<hw_code> asked;
std::int32_t registers = 128;

byte_vector offer_body(kernel_interface& kernel) {
  asked.push_back(kernel.hw);
  EXPECT_TRUE(kernel.finalized);
  kernel.grf_count = registers;
  return body;
}

byte_vector offer_nothing(kernel_interface& kernel) {
  asked.push_back(kernel.hw);
  return {};
}

byte_vector fail(kernel_interface&) {
  throw std::runtime_error("generator");
}

byte_vector override_location(kernel_interface& kernel) {
  kernel.location_overridden = true;
  return body;
}

class ForgeGenerator : public testing::Test {
 protected:
  void SetUp() override {
    script = {};
    script.binary = older_binary(older_kernel());
    asked.clear();
    registers = 128;
  }
  void TearDown() override {
    EXPECT_EQ(script.mistakes, names());
    EXPECT_EQ(script.programs, 0);
  }

  byte_vector generate(gpu_arch arch, code_source source) {
    const opencl_device target{fake_opencl, reinterpret_cast<cl_context>(&context_object),
                               reinterpret_cast<cl_device_id>(&device_object)};
    return generate_binary(arch, target, source, formats);
  }

  void expect_formats(bool prefer_elf, bool elf_confirmed) const {
    EXPECT_EQ(formats.prefer_elf, prefer_elf);
    EXPECT_EQ(formats.elf_confirmed, elf_confirmed);
  }

  binary_formats formats;
};

byte_vector expected_older() {
  return replace_kernel(script.binary, body, byte_vector());
}

byte_vector expected_newer(hw_code hw, std::uint32_t core_family) {
  return write_binary(core_family, "binary_test", metadata_of(binary_test_interface(hw)), body);
}

constexpr gpu_arch every_arch[] = {gpu_arch::unknown, gpu_arch::fir,  gpu_arch::elm,
                                   gpu_arch::ash,     gpu_arch::oak,  gpu_arch::yew,
                                   gpu_arch::pine,    gpu_arch::larch};

struct served_arch {
  gpu_arch arch;
  hw_code hw;
  std::uint32_t core_family;
};
constexpr served_arch served[] = {
    {gpu_arch::fir, hw_fir, 12},     {gpu_arch::elm, hw_elm, 16},
    {gpu_arch::ash, hw_ash, 18},     {gpu_arch::yew, hw_yew, 3079},
    {gpu_arch::pine, hw_pine, 3080}, {gpu_arch::larch, hw_larch, 3081}};

TEST_F(ForgeGenerator, HasNoCodeForAnyArchitecture) {
  for (const gpu_arch arch : every_arch) {
    EXPECT_TRUE(generate(arch, generate_code).empty());
  }
  EXPECT_EQ(script.calls, names()) << "the driver is not troubled";
}

TEST_F(ForgeGenerator, AsksForCodeWhereThereCanBeAny) {
  for (const gpu_arch arch : every_arch) {
    EXPECT_TRUE(generate(arch, offer_nothing).empty());
  }
  EXPECT_EQ(asked, (std::vector<hw_code>{hw_fir, hw_elm, hw_ash, hw_yew, hw_pine, hw_larch}));
  EXPECT_EQ(script.calls, names());
}

TEST_F(ForgeGenerator, OlderFormatComesFirst) {
  for (const served_arch& row : served) {
    script.calls.clear();
    EXPECT_EQ(generate(row.arch, offer_body), expected_older());
    EXPECT_EQ(script.calls, compiling);
    EXPECT_EQ(script.source, source_of(binary_test_interface(row.hw)));
    EXPECT_EQ(script.options, "-cl-std=CL2.0");
  }
  expect_formats(false, false);
}

TEST_F(ForgeGenerator, ManyRegistersAreAnOptionOfLaterGenerations) {
  for (const served_arch& row : served) {
    const std::string more = row.hw >= hw_yew ? " -cl-brine-256-GRF-per-thread" : "";
    registers = 129;
    generate(row.arch, offer_body);
    EXPECT_EQ(script.options, "-cl-std=CL2.0" + more);
    registers = 128;
    generate(row.arch, offer_body);
    EXPECT_EQ(script.options, "-cl-std=CL2.0");
  }
}

TEST_F(ForgeGenerator, NewerFormatFollowsWhereTheOlderFails) {
  for (const served_arch& row : served) {
    formats.elf_confirmed = false;
    script.calls.clear();
    script.failing_call = "clCreateProgramWithSource";
    script.failure = CL_INVALID_OPERATION;
    const byte_vector binary = generate(row.arch, offer_body);
    EXPECT_EQ(binary, expected_newer(row.hw, row.core_family));
    EXPECT_EQ(script.module, binary) << "what was tried is what comes back";
    EXPECT_EQ(script.calls, joined(failed_compiling, trying));
    EXPECT_EQ(script.options, "");
    EXPECT_EQ(parse_binary(binary).hw, row.hw);
    expect_formats(false, true);
  }
}

TEST_F(ForgeGenerator, AContainerOfTheNewerFormatIsNoOlderOne) {
  script.binary = newer_binary(0, 0);
  EXPECT_EQ(generate(gpu_arch::ash, offer_body), expected_newer(hw_ash, 18));
  EXPECT_EQ(script.calls, joined(compiling, trying));
}

TEST_F(ForgeGenerator, ConfirmedFormatsAreNotTriedAgain) {
  script.binary = counting(100, 0);
  formats.elf_confirmed = true;
  EXPECT_EQ(generate(gpu_arch::elm, offer_body), expected_newer(hw_elm, 16));
  EXPECT_EQ(script.calls, compiling);
  formats.prefer_elf = true;
  script.calls.clear();
  EXPECT_EQ(generate(gpu_arch::elm, offer_body), expected_newer(hw_elm, 16));
  EXPECT_EQ(script.calls, names());
  expect_formats(true, true);
}

TEST_F(ForgeGenerator, PreferenceTurnsTheOrder) {
  formats.prefer_elf = true;
  EXPECT_EQ(generate(gpu_arch::yew, offer_body), expected_newer(hw_yew, 3079));
  EXPECT_EQ(script.calls, trying);
  expect_formats(true, true);
}

TEST_F(ForgeGenerator, PreferenceEndsWithTheFirstRefusal) {
  formats.prefer_elf = true;
  script.failing_call = "clCreateProgramWithBinary";
  script.failure = CL_INVALID_BINARY;
  EXPECT_EQ(generate(gpu_arch::yew, offer_body), expected_older());
  EXPECT_EQ(script.calls, joined({"clCreateProgramWithBinary"}, compiling));
  expect_formats(false, false);
}

TEST_F(ForgeGenerator, ABinaryThatIsTakenAndNotBuiltIsRefused) {
  formats.prefer_elf = true;
  script.failing_call = "clBuildProgram";
  script.failure = CL_BUILD_PROGRAM_FAILURE;
  EXPECT_EQ(generate(gpu_arch::yew, offer_body), expected_older());
  EXPECT_EQ(script.calls, joined(trying, compiling));
  expect_formats(false, false);
}

TEST_F(ForgeGenerator, NothingComesOfTwoRefusals) {
  for (const bool prefer_elf : {false, true}) {
    formats.prefer_elf = prefer_elf;
    script.calls.clear();
    script.binary = counting(100, 0);
    script.failing_call = "clCreateProgramWithBinary";
    script.failure = CL_INVALID_BINARY;
    EXPECT_TRUE(generate(gpu_arch::pine, offer_body).empty());
    const names refused = {"clCreateProgramWithBinary"};
    EXPECT_EQ(script.calls, prefer_elf ? joined(refused, compiling) : joined(compiling, refused));
    expect_formats(false, false);
  }
}

TEST_F(ForgeGenerator, OtherFailuresPassOut) {
  EXPECT_THROW(generate(gpu_arch::fir, fail), std::runtime_error);
  // The older attempt takes what its text throws for a refusal; the newer one does not.
  EXPECT_THROW(generate(gpu_arch::fir, override_location), unsupported_argument_location_override);
  EXPECT_EQ(script.calls, names());
}

TEST(ForgeBinaryTest, FormatsStartUnknown) {
  EXPECT_FALSE(process_formats().prefer_elf);
  EXPECT_FALSE(process_formats().elf_confirmed);
  EXPECT_EQ(&process_formats(), &process_formats());
}

TEST(ForgeBinaryTest, InterfaceInRegistersOf32Bytes) {
  const kernel_interface kernel = binary_test_interface(hw_fir);
  EXPECT_EQ(kernel.cross_thread_bytes, 64U);
  EXPECT_EQ(kernel.cross_thread_registers, 2U);
  EXPECT_EQ(source_of(kernel),
            "__attribute__((brine_reqd_sub_group_size(1)))\n"
            "kernel void binary_test(uint src0, ulong src1, ushort src2, ushort src3, ulong src4, "
            "ulong src5, global uint *src_ptr, global uint *ok) {\n"
            "    global volatile int *____;\n"
            "    { volatile uchar __load = ((global uchar *) src_ptr)[get_local_id(0)];}\n"
            "    { volatile uchar __load = ((global uchar *) ok)[get_local_id(0)];}\n"
            "}\n");
}

std::string scalar_entry(int index, int offset, int size) {
  return "      - arg_type: arg_byvalue\n        arg_index: " + std::to_string(index) +
         "\n        offset: " + std::to_string(offset) + "\n        size: " + std::to_string(size) +
         "\n\n";
}

TEST(ForgeBinaryTest, MetadataInRegistersOf64Bytes) {
  const kernel_interface kernel = binary_test_interface(hw_larch);
  EXPECT_EQ(kernel.cross_thread_bytes, 64U);
  EXPECT_EQ(kernel.cross_thread_registers, 1U);
  EXPECT_EQ(metadata_of(kernel),
            "version: 1.8\n"
            "kernels: \n"
            "  - name: \"binary_test\"\n"
            "    execution_env: \n"
            "      grf_count: 128\n"
            "      simd_size: 1\n"
            "\n"
            "    payload_arguments: \n" +
                scalar_entry(0, 16, 4) + scalar_entry(1, 24, 8) + scalar_entry(2, 32, 4) +
                scalar_entry(3, 36, 4) + scalar_entry(4, 40, 8) + scalar_entry(5, 48, 8) +
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 6\n"
                "        offset: 0\n"
                "        size: 8\n"
                "        addrmode: stateless\n"
                "        addrspace: global\n"
                "        access_type: readwrite\n"
                "\n"
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 7\n"
                "        offset: 8\n"
                "        size: 8\n"
                "        addrmode: stateless\n"
                "        addrspace: global\n"
                "        access_type: readwrite\n"
                "\n"
                "      - arg_type: local_size\n"
                "        offset: 12\n"
                "        size: 12\n"
                "\n"
                "\n");
}

}  // namespace
