// SPDX-License-Identifier: Apache-2.0
// The SPIR-V module of the detection: its words against what an assembler makes of its text, and
// the judgement of the validator, both of Debian's package spirv-tools.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "hw_detect_module.hpp"

namespace {

using kestrel::tarn::forge::hw_detect_module;

const std::string tools = TARN_SPIRV_TOOLS;  // their folder; empty without them

const char module_text[] = R"(
               OpCapability Addresses
               OpCapability Kernel
          %1 = OpExtInstImport "OpenCL.std"
               OpMemoryModel Physical64 OpenCL
               OpEntryPoint Kernel %4 "_"
          %6 = OpString "kernel_arg_type._."
               OpSource OpenCL_C 102000
               OpName %5 "entry"
          %2 = OpTypeVoid
          %3 = OpTypeFunction %2
          %4 = OpFunction %2 None %3
          %5 = OpLabel
               OpReturn
               OpFunctionEnd
)";

TEST(DetectModule, Header) {
  EXPECT_EQ(sizeof hw_detect_module, 196U);
  EXPECT_EQ(hw_detect_module[0], 0x07230203U);
  EXPECT_EQ(hw_detect_module[1], 0x00010000U);
  EXPECT_EQ(hw_detect_module[2], 0x0006000EU);
  EXPECT_EQ(hw_detect_module[3], 7U);
  EXPECT_EQ(hw_detect_module[4], 0U);
}

TEST(DetectModule, IsValid) {
  if (tools.empty()) {
    GTEST_SKIP() << "no spirv-val (Debian package spirv-tools)";
  }
  const std::string path = TARN_SCRATCH "/hw_detect_module.spv";
  std::ofstream(path, std::ios::binary)
      .write(reinterpret_cast<const char*>(hw_detect_module), sizeof hw_detect_module);
  EXPECT_EQ(std::system((tools + "/spirv-val --target-env opencl1.2 " + path).c_str()), 0);
}

TEST(DetectModule, IsWhatAnAssemblerMakes) {
  if (tools.empty()) {
    GTEST_SKIP() << "no spirv-as (Debian package spirv-tools)";
  }
  const std::string text = TARN_SCRATCH "/hw_detect_text.spvasm";
  const std::string path = TARN_SCRATCH "/hw_detect_text.spv";
  std::ofstream(text) << module_text;
  ASSERT_EQ(std::system((tools + "/spirv-as --preserve-numeric-ids --target-env spv1.0 -o " + path +
                         " " + text)
                            .c_str()),
            0);
  std::vector<std::uint32_t> words(50);
  std::ifstream file(path, std::ios::binary);
  file.read(reinterpret_cast<char*>(words.data()), 200);
  ASSERT_EQ(file.gcount(), 196);
  words.resize(49);
  words[2] = 0x0006000E;  // the assembler names itself
  EXPECT_EQ(words, std::vector<std::uint32_t>(hw_detect_module, hw_detect_module + 49));
}

}  // namespace
