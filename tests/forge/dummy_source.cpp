// SPDX-License-Identifier: Apache-2.0
// The dummy source, byte for byte.
#include <ostream>
#include <sstream>
#include <string>

#include <gtest/gtest.h>

#include "exceptions.hpp"
#include "interface_text.hpp"

namespace {

using namespace tarn_test;

const std::string sub_group_of_8 = "__attribute__((brine_reqd_sub_group_size(8)))\n";

/// A kernel without parameters, of SIMD width 8, between what comes before and its body.
std::string around(const std::string& before, const std::string& body) {
  return before + sub_group_of_8 +
         "kernel void default_kernel() {\n"
         "    global volatile int *____;\n" +
         body + "}\n";
}

/// The text of an interface on which `change` has worked.
template <typename Change>
std::string changed(hw_code hw, Change change) {
  kernel_interface kernel(hw);
  change(kernel);
  kernel.finalize();
  return source_of(kernel);
}

TEST(ForgeDummySource, NeedsAFinalizedInterface) {
  kernel_interface kernel(hw_fir);
  std::ostringstream stream;
  EXPECT_THROW(kernel.emit_dummy_source(stream), interface_not_finalized);
  kernel.location_overridden = true;
  EXPECT_THROW(kernel.emit_dummy_source(stream), interface_not_finalized);
  kernel.finalize();
  EXPECT_THROW(kernel.emit_dummy_source(stream), unsupported_argument_location_override);
  EXPECT_EQ(stream.str(), "");
}

TEST(ForgeDummySource, Least) {
  for (int hw = 0; hw <= 6; ++hw) {
    EXPECT_EQ(changed(static_cast<hw_code>(hw), [](kernel_interface&) {}), around("", "")) << hw;
  }
  EXPECT_EQ(changed(hw_pine, [](kernel_interface&) {}),
            "__attribute__((brine_reqd_sub_group_size(16)))\n"
            "kernel void default_kernel() {\n"
            "    global volatile int *____;\n"
            "}\n");
}

TEST(ForgeDummySource, Extensions) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.need_half = true; }),
            around("#pragma OPENCL EXTENSION cl_khr_fp16 : enable\n", ""));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.need_double = true; }),
            around("#pragma OPENCL EXTENSION cl_khr_fp64 : enable\n", ""));
}

TEST(ForgeDummySource, WorkGroupSizeIsRequiredOnlyAsAWhole) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {4294967296, 2, 1};
                    }),
            around("__attribute__((reqd_work_group_size(4294967296,2,1)))\n", ""));
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {0, 2, 1};
                    }),
            around("", ""));
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {4, 0, 1};
                    }),
            around("", ""));
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.work_group_size = {4, 2, 0};
                    }),
            around("", ""));
}

TEST(ForgeDummySource, WalkOrderHasTwoOrThreeDimensions) {
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.walk_order = {0, 1, -1};
                    }),
            around("__attribute__((brine_reqd_workgroup_walk_order(0,1)))\n", ""));
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.walk_order = {2, 1, 0};
                    }),
            around("__attribute__((brine_reqd_workgroup_walk_order(2,1,0)))\n", ""));
  EXPECT_EQ(changed(hw_fir,
                    [](kernel_interface& kernel) {
                      kernel.walk_order = {-1, 1, 0};
                    }),
            around("", ""));
}

TEST(ForgeDummySource, LocalIdsAndSizes) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.need_local_id = true; }),
            around("", "    (void) ____[get_local_id(0)];\n"));
  EXPECT_EQ(
      changed(hw_fir, [](kernel_interface& kernel) { kernel.use_enqueued_local_size = true; }),
      around("", "    (void) ____[get_enqueued_local_size(0)];\n"));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.need_local_size = true; }),
            around("", ""))
      << "hidden arguments are no parameters";
}

TEST(ForgeDummySource, Barriers) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.barrier_count = -1; }),
            around("", ""));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.barrier_count = 1; }),
            around("", "    __asm__ volatile(\"barrier\");\n"));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.barrier_count = 3; }),
            around("",
                   "    __asm__ volatile(\"barrier\");\n"
                   "    local NamedBarrier_t *bar1 = named_barrier_init(1);\n"
                   "    work_group_named_barrier(bar1, 0);\n"
                   "    local NamedBarrier_t *bar2 = named_barrier_init(1);\n"
                   "    work_group_named_barrier(bar2, 0);\n"));
}

TEST(ForgeDummySource, Features) {
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.use_dpas = true; }),
            around("",
                   "    int __builtin_IB_sub_group_idpas_s8_s8_8_1(int, int, int8) "
                   "__attribute__((const));\n"
                   "    int z = __builtin_IB_sub_group_idpas_s8_s8_8_1(0, ____[0], (int8)(0)); "
                   "____[0] = z;\n"));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.use_global_atomics = true; }),
            around("", "    atomic_inc(____);\n"));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.scratch_size = 5000000000; }),
            around("", "    volatile char scratch[5000000000] = {0};\n"));
  EXPECT_EQ(changed(hw_fir, [](kernel_interface& kernel) { kernel.slm_size = 1024; }),
            around("", "    volatile local char slm[1024]; slm[0]++;\n"));
}

TEST(ForgeDummySource, PreemptionIsKeptOffOnOneGenerationOnly) {
  for (int hw = 0; hw <= 6; ++hw) {
    EXPECT_EQ(changed(static_cast<hw_code>(hw),
                      [](kernel_interface& kernel) { kernel.disable_preemption = true; }),
              around("", hw == 1 ? "    volatile double *__df; *__df = 1.1 / *__df;\n" : ""))
        << hw;
  }
}

TEST(ForgeDummySource, ScalarsOfEveryType) {
  const char* const names[] = {"uint",    "int",     "ushort",  "short",  "uchar", "char",
                               "double",  "float",   "ulong",   "long",   "half",  "ushort",
                               "INVALID", "INVALID", "INVALID", "INVALID"};
  for (int base = 0; base < 16; ++base) {
    const std::string text = changed(hw_fir, [base](kernel_interface& kernel) {
      kernel.new_argument("s", static_cast<argument_type>(0x50 | base));  // bit 4 has no meaning
    });
    EXPECT_EQ(text, sub_group_of_8 + "kernel void default_kernel(" + names[base] +
                        " s) {\n    global volatile int *____;\n}\n");
  }
}

TEST(ForgeDummySource, ParametersInTheOrderOfDeclaration) {
  const auto declare = [](kernel_interface& kernel) {
    kernel.kernel_name = "k";
    kernel.new_argument("a", type_uint);
    kernel.new_argument("p", type_ulong, argument_kind::global_pointer, default_access);
    kernel.new_argument("h", type_ulong, argument_kind::hidden, 0);
    kernel.new_argument("l", type_ulong, argument_kind::local_pointer, 0);
    kernel.new_argument("b", 0x47);
  };
  EXPECT_EQ(changed(hw_fir, declare),
            "__attribute__((brine_reqd_sub_group_size(8)))\n"
            "kernel void k(uint a, global uint *p, local uint *l, float b) {\n"
            "    global volatile int *____;\n"
            "    { volatile uchar __load = ((global uchar *) p)[get_local_id(0)];}\n"
            "}\n");
  EXPECT_EQ(changed(hw_larch, declare),
            "__attribute__((brine_reqd_sub_group_size(16)))\n"
            "kernel void k(uint a, global uint *p, local uint *l, float b) {\n"
            "    global volatile int *____;\n"
            "    __asm__ volatile(\"\" :: \"rw.u\"(p));\n"
            "}\n");
}

TEST(ForgeDummySource, EachAccessOfEachPointer) {
  const auto declare = [](kernel_interface& kernel) {
    kernel.new_argument("n", type_ulong, argument_kind::global_pointer, 0);
    kernel.new_argument("s", type_ulong, argument_kind::global_pointer, stateless_access);
    kernel.new_argument("t", type_ulong, argument_kind::global_pointer, surface_access);
    kernel.new_argument("b", type_ulong, argument_kind::global_pointer, 3);
  };
  const std::string head = sub_group_of_8 +
                           "kernel void default_kernel(global uint *n, global uint *s, "
                           "global uint *t, global uint *b) {\n"
                           "    global volatile int *____;\n";
  const std::string surfaces =
      "    { volatile uchar __load = ((global uchar *) t)[get_local_id(0)];}\n"
      "    { volatile uchar __load = ((global uchar *) b)[get_local_id(0)];}\n";
  EXPECT_EQ(changed(hw_ash, declare), head + surfaces + "}\n");
  EXPECT_EQ(changed(hw_oak, declare), head +
                                          "    __asm__ volatile(\"\" :: \"rw.u\"(s));\n"
                                          "    __asm__ volatile(\"\" :: \"rw.u\"(b));\n" +
                                          surfaces + "}\n");
}

TEST(ForgeDummySource, EverythingInRegistersOf32Bytes) {
  kernel_interface kernel = everything(hw_fir);
  kernel.finalize();
  EXPECT_EQ(source_of(kernel),
            "#pragma OPENCL EXTENSION cl_khr_fp16 : enable\n"
            "#pragma OPENCL EXTENSION cl_khr_fp64 : enable\n"
            "__attribute__((reqd_work_group_size(16,2,1)))\n"
            "__attribute__((brine_reqd_workgroup_walk_order(2,1,0)))\n"
            "__attribute__((brine_reqd_sub_group_size(8)))\n"
            "kernel void everything(uint n, global uint *p, global uint *q, global uint *r, "
            "local uint *w) {\n"
            "    global volatile int *____;\n"
            "    (void) ____[get_local_id(0)];\n"
            "    (void) ____[get_enqueued_local_size(0)];\n"
            "    __asm__ volatile(\"barrier\");\n"
            "    local NamedBarrier_t *bar1 = named_barrier_init(1);\n"
            "    work_group_named_barrier(bar1, 0);\n"
            "    local NamedBarrier_t *bar2 = named_barrier_init(1);\n"
            "    work_group_named_barrier(bar2, 0);\n"
            "    int __builtin_IB_sub_group_idpas_s8_s8_8_1(int, int, int8) "
            "__attribute__((const));\n"
            "    int z = __builtin_IB_sub_group_idpas_s8_s8_8_1(0, ____[0], (int8)(0)); "
            "____[0] = z;\n"
            "    atomic_inc(____);\n"
            "    volatile char scratch[128] = {0};\n"
            "    volatile local char slm[4096]; slm[0]++;\n"
            "    volatile double *__df; *__df = 1.1 / *__df;\n"
            "    { volatile uchar __load = ((global uchar *) p)[get_local_id(0)];}\n"
            "    { volatile uchar __load = ((global uchar *) r)[get_local_id(0)];}\n"
            "}\n");
}

TEST(ForgeDummySource, EverythingInRegistersOf64Bytes) {
  kernel_interface kernel = everything(hw_pine);
  kernel.finalize();
  EXPECT_EQ(source_of(kernel),
            "#pragma OPENCL EXTENSION cl_khr_fp16 : enable\n"
            "#pragma OPENCL EXTENSION cl_khr_fp64 : enable\n"
            "__attribute__((reqd_work_group_size(16,2,1)))\n"
            "__attribute__((brine_reqd_workgroup_walk_order(2,1,0)))\n"
            "__attribute__((brine_reqd_sub_group_size(16)))\n"
            "kernel void everything(uint n, global uint *p, global uint *q, global uint *r, "
            "local uint *w) {\n"
            "    global volatile int *____;\n"
            "    (void) ____[get_local_id(0)];\n"
            "    (void) ____[get_enqueued_local_size(0)];\n"
            "    __asm__ volatile(\"barrier\");\n"
            "    local NamedBarrier_t *bar1 = named_barrier_init(1);\n"
            "    work_group_named_barrier(bar1, 0);\n"
            "    local NamedBarrier_t *bar2 = named_barrier_init(1);\n"
            "    work_group_named_barrier(bar2, 0);\n"
            "    int __builtin_IB_sub_group_idpas_s8_s8_8_1(int, int, int8) "
            "__attribute__((const));\n"
            "    int z = __builtin_IB_sub_group_idpas_s8_s8_8_1(0, ____[0], (int8)(0)); "
            "____[0] = z;\n"
            "    atomic_inc(____);\n"
            "    volatile char scratch[128] = {0};\n"
            "    volatile local char slm[4096]; slm[0]++;\n"
            "    __asm__ volatile(\"\" :: \"rw.u\"(p));\n"
            "    __asm__ volatile(\"\" :: \"rw.u\"(q));\n"
            "    { volatile uchar __load = ((global uchar *) r)[get_local_id(0)];}\n"
            "}\n");
}

TEST(ForgeDummySource, TheStateOfTheStreamChangesNothing) {
  kernel_interface kernel = everything(hw_fir);
  kernel.finalize();
  std::ostringstream stream;
  stream << std::hex << std::showbase;
  stream.width(3000);
  kernel.emit_dummy_source(stream);
  EXPECT_EQ(stream.str(), source_of(kernel));
}

}  // namespace
