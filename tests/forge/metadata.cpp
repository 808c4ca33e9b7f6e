// SPDX-License-Identifier: Apache-2.0
// The metadata, byte for byte.
#include <locale>
#include <ostream>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "exceptions.hpp"
#include "interface_text.hpp"

namespace {

using namespace tarn_test;

const std::string head =
    "version: 1.8\nkernels: \n  - name: \"default_kernel\"\n"
    "    execution_env: \n";
const std::string head_of_8 = head +
                              "      grf_count: 128\n"
                              "      simd_size: 8\n"
                              "      required_sub_group_size: 8\n";

/// The text of an interface on which `change` has worked.
template <typename Change>
std::string changed(hw_code hw, Change change) {
  kernel_interface kernel(hw);
  change(kernel);
  kernel.finalize();
  return metadata_of(kernel);
}

TEST(ForgeMetadata, NeedsAFinalizedInterface) {
  kernel_interface kernel(hw_fir);
  std::ostringstream stream;
  EXPECT_THROW(kernel.emit_metadata(stream), interface_not_finalized);
  kernel.location_overridden = true;
  EXPECT_THROW(kernel.emit_metadata(stream), interface_not_finalized);
  kernel.finalize();
  EXPECT_THROW(kernel.emit_metadata(stream), unsupported_argument_location_override);
  EXPECT_EQ(stream.str(), "");
}

TEST(ForgeMetadata, ArgumentsBelowThePayloadAreRefused) {
  kernel_interface kernel(hw_fir);
  kernel.new_argument("s", type_uint);
  kernel.finalize();
  kernel.need_local_id = true;  // now the payload would begin at register 4, and s is in 2
  std::ostringstream stream;
  EXPECT_THROW(kernel.emit_metadata(stream), unsupported_argument_location_override);
  EXPECT_EQ(stream.str(), "");
}

TEST(ForgeMetadata, ArgumentsWithoutAPlaceAreRefused) {
  kernel_interface kernel(hw_fir);
  kernel.finalize();
  kernel.new_argument("late", type_uint);
  std::ostringstream stream;
  EXPECT_THROW(kernel.emit_metadata(stream), unsupported_argument_location_override);
}

TEST(ForgeMetadata, LeastHasNoPayload) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface&) {}), head_of_8 + "\n");
  EXPECT_EQ(changed(hw_yew, [](kernel_interface&) {}),
            head_of_8 + "      inline_data_payload_size: 32\n\n");
  EXPECT_EQ(changed(hw_pine, [](kernel_interface&) {}), head +
                                                            "      grf_count: 128\n"
                                                            "      simd_size: 16\n"
                                                            "      required_sub_group_size: 16\n"
                                                            "\n");
}

TEST(ForgeMetadata, OneWorkItemNeedsNoSubGroup) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.kernel_name = "k";
                      kernel.grf_count = 256;
                      kernel.simd = 1;
                    }),
            "version: 1.8\nkernels: \n  - name: \"k\"\n"
            "    execution_env: \n"
            "      grf_count: 256\n"
            "      simd_size: 1\n"
            "\n");
}

TEST(ForgeMetadata, WorkGroupSizeIsRequiredOnlyAsAWhole) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {4294967296, 2, 1};
                    }),
            head_of_8 +
                "      required_work_group_size:\n"
                "        - 4294967296\n"
                "        - 2\n"
                "        - 1\n"
                "\n");
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {4, 2, 0};
                    }),
            head_of_8 + "\n");
}

TEST(ForgeMetadata, WalkOrderHasThreeDimensions) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.walk_order = {0, 1, 2};
                    }),
            head_of_8 +
                "      work_group_walk_order_dimensions:\n"
                "        - 0\n"
                "        - 1\n"
                "        - 2\n"
                "\n");
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.walk_order = {1, 0, -1};
                    }),
            head_of_8 +
                "      work_group_walk_order_dimensions:\n"
                "        - 1\n"
                "        - 0\n"
                "        - 0\n"
                "\n");
}

TEST(ForgeMetadata, BarriersComeInPowersOfTwo) {
  const std::int32_t counts[] = {1, 2, 3, 4, 5, 31, 33, 0x7FFFFFFF};
  const char* const printed[] = {"1", "2", "4", "4", "8", "32", "64", "2147483648"};
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ(changed(hw_fir, [&](kernel_interface& kernel) { kernel.barrier_count = counts[i]; }),
              head_of_8 + "      barrier_count: " + printed[i] + "\n\n");
  }
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.barrier_count = -1; }),
            head_of_8 + "\n");
}

TEST(ForgeMetadata, Features) {
  const auto expect = [](const char* line, void (*change)(kernel_interface&)) {
    EXPECT_EQ(changed(hw_fir, change), head_of_8 + line + "\n");
  };
  expect("      offset_to_skip_per_thread_data_load: 96\n",
         [](kernel_interface& kernel) { kernel.skip_per_thread_offset = 96; });
  expect("", [](kernel_interface& kernel) { kernel.skip_per_thread_offset = -1; });
  expect("      has_4gb_buffers: true\n",
         [](kernel_interface& kernel) { kernel.require_stateless_4gb = true; });
  expect("      has_dpas: true\n", [](kernel_interface& kernel) { kernel.use_dpas = true; });
  expect("      has_global_atomics: true\n",
         [](kernel_interface& kernel) { kernel.use_global_atomics = true; });
  expect("      slm_size: 5000000000\n",
         [](kernel_interface& kernel) { kernel.slm_size = 5000000000; });
  expect("      has_no_stateless_write: true\n",
         [](kernel_interface& kernel) { kernel.stateless_write = false; });
  expect("      disable_mid_thread_preemption: true\n",
         [](kernel_interface& kernel) { kernel.disable_preemption = true; });
  expect("      thread_scheduling_mode: age_based\n",
         [](kernel_interface& kernel) { kernel.thread_scheduling = 1; });
  expect("      thread_scheduling_mode: round_robin\n",
         [](kernel_interface& kernel) { kernel.thread_scheduling = 2; });
  expect("      thread_scheduling_mode: round_robin_stall\n",
         [](kernel_interface& kernel) { kernel.thread_scheduling = 3; });
  expect("", [](kernel_interface& kernel) { kernel.thread_scheduling = 4; });
  expect("", [](kernel_interface& kernel) { kernel.thread_scheduling = -1; });
  expect("      inline_data_payload_size: 96\n",
         [](kernel_interface& kernel) { kernel.inline_data_registers = 3; });
  expect("", [](kernel_interface& kernel) { kernel.inline_data_registers = -1; });
  expect("", [](kernel_interface& kernel) { kernel.need_half = kernel.need_double = true; });
}

TEST(ForgeMetadata, SmallScalarsTakeFourBytes) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.new_argument("a", 0x04);
                      kernel.new_argument("b", type_ushort);
                      kernel.new_argument("c", type_uint);
                      kernel.new_argument("d", type_ulong);
                    }),
            head_of_8 +
                "\n    payload_arguments: \n"
                "      - arg_type: arg_byvalue\n"
                "        arg_index: 0\n"
                "        offset: 0\n"
                "        size: 4\n"
                "\n"
                "      - arg_type: arg_byvalue\n"
                "        arg_index: 1\n"
                "        offset: 4\n"
                "        size: 4\n"
                "\n"
                "      - arg_type: arg_byvalue\n"
                "        arg_index: 2\n"
                "        offset: 8\n"
                "        size: 4\n"
                "\n"
                "      - arg_type: arg_byvalue\n"
                "        arg_index: 3\n"
                "        offset: 16\n"
                "        size: 8\n"
                "\n"
                "\n");
}

const std::string surface_fields =
    "        offset: 0\n"
    "        size: 0\n"
    "        addrmode: stateful\n"
    "        addrspace: global\n"
    "        access_type: readwrite\n"
    "\n";
const std::string stateless_fields =
    "        addrmode: stateless\n"
    "        addrspace: global\n"
    "        access_type: readwrite\n"
    "\n";
const std::string slm_fields =
    "        addrmode: slm\n"
    "        addrspace: local\n"
    "        access_type: readwrite\n"
    "\n";

TEST(ForgeMetadata, EachAccessOfEachPointer) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.new_argument("n", type_ulong, argument_kind::global_pointer, 0);
                      kernel.new_argument("s", type_ulong, argument_kind::global_pointer,
                                          stateless_access);
                      kernel.new_argument("t", type_ulong, argument_kind::global_pointer,
                                          surface_access);
                      kernel.new_argument("b", type_ulong, argument_kind::global_pointer, 3);
                      kernel.new_argument("l", type_ushort, argument_kind::local_pointer, 0);
                    }),
            head_of_8 +
                "\n    payload_arguments: \n"
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 1\n"
                "        offset: 16\n"
                "        size: 8\n" +
                stateless_fields +
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 2\n" +
                surface_fields +
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 3\n" +
                surface_fields +
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 3\n"
                "        offset: 32\n"
                "        size: 8\n" +
                stateless_fields +
                "      - arg_type: arg_bypointer\n"
                "        arg_index: 4\n"
                "        offset: 0\n"
                "        size: 4\n" +
                slm_fields +
                "\n    binding_table_indices: \n"
                "      - bti_value: 0\n"
                "        arg_index: 2\n"
                " \n"
                "      - bti_value: 1\n"
                "        arg_index: 3\n"
                " \n"
                "\n");
}

TEST(ForgeMetadata, HiddenArgumentsBesideTheLocalSizeHaveNoEntry) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.scratch_size = 64; }),
            head_of_8 + "\n    payload_arguments: \n\n");
}

TEST(ForgeMetadata, LocalSizes) {
  const std::string fields =
      "        size: 12\n"
      "\n"
      "\n";
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.need_local_size = true; }),
            head_of_8 +
                "\n    payload_arguments: \n"
                "      - arg_type: local_size\n"
                "        offset: 12\n" +
                fields);
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.need_local_size = true;
                      kernel.use_enqueued_local_size = true;
                    }),
            head_of_8 +
                "\n    payload_arguments: \n"
                "      - arg_type: enqueued_local_size\n"
                "        offset: 0\n" +
                fields);
}

TEST(ForgeMetadata, LocalIds) {
  struct row {
    hw_code hw;
    std::int32_t simd;
    const char* size;
  };
  const row rows[] = {{hw_fir, 8, "96"},   {hw_ash, 16, "96"},   {hw_ash, 17, "192"},
                      {hw_ash, 32, "192"}, {hw_pine, 16, "192"}, {hw_pine, 32, "192"}};
  for (const row& expected : rows) {
    const std::string simd = std::to_string(expected.simd);
    EXPECT_EQ(changed(expected.hw,
                      [&](kernel_interface& kernel) {
                        kernel.need_local_id = true;
                        kernel.simd = expected.simd;
                        kernel.new_argument("s", type_uint);
                      }),
              head + "      grf_count: 128\n      simd_size: " + simd +
                  "\n      required_sub_group_size: " + simd +
                  "\n"
                  "\n    payload_arguments: \n"
                  "      - arg_type: arg_byvalue\n"
                  "        arg_index: 0\n"
                  "        offset: 0\n"
                  "        size: 4\n"
                  "\n"
                  "\n    per_thread_payload_arguments: \n"
                  "      - arg_type: local_id\n"
                  "        offset: 0\n"
                  "        size: " +
                  expected.size + "\n  \n\n");
  }
  for (const hw_code hw : {hw_fir, hw_larch}) {
    EXPECT_EQ(changed(hw,
                      [](kernel_interface& kernel) {
                        kernel.need_local_id = true;
                        kernel.simd = 1;
                      }),
              head +
                  "      grf_count: 128\n"
                  "      simd_size: 1\n"
                  "\n    per_thread_payload_arguments: \n"
                  "      - arg_type: packed_local_ids\n"
                  "        offset: 0\n"
                  "        size: 6\n"
                  "  \n"
                  "\n");
  }
}

// Digits in groups, as some locales print them.
class grouped_digits : public std::numpunct<char> {
 protected:
  char do_thousands_sep() const override { return ','; }
  std::string do_grouping() const override { return "\3"; }
};

TEST(ForgeMetadata, TheStateOfTheStreamChangesNothing) {
  kernel_interface kernel = everything(hw_yew);
  kernel.finalize();
  std::ostringstream stream;
  stream.imbue(std::locale(std::locale::classic(), new grouped_digits));
  stream << std::hex << std::showbase;
  stream.width(3000);
  kernel.emit_metadata(stream);
  EXPECT_EQ(stream.str(), metadata_of(kernel));
}

}  // namespace
