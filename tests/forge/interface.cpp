// SPDX-License-Identifier: Apache-2.0
// Declaring arguments and placing them in registers. Places were worked out by hand.
#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "exceptions.hpp"
#include "kernel_interface.hpp"

namespace {

using namespace kestrel::tarn::forge;

constexpr argument_type type_uchar = 0x04;

void expect_place(const kernel_interface& kernel, const std::string& name, std::int32_t number,
                  std::int32_t sub_register) {
  const register_location place = kernel.get_argument(name);
  ASSERT_TRUE(place.is_assigned()) << name;
  EXPECT_EQ(place.number(), number) << name;
  EXPECT_EQ(place.sub_register(), sub_register) << name;
}

void declare_scalars(kernel_interface& kernel, int count, argument_type type) {
  for (int i = 0; i < count; ++i) {
    kernel.new_argument("s" + std::to_string(i), type);
  }
}

TEST(ForgeInterface, DefaultsDependOnTheHardware) {
  const std::int32_t simd[] = {8, 8, 8, 8, 8, 8, 8, 16, 16};
  const std::int32_t inline_registers[] = {0, 0, 0, 0, 0, 1, 1, 0, 0};
  for (int hw = 0; hw <= 8; ++hw) {
    const kernel_interface kernel(static_cast<hw_code>(hw));
    EXPECT_EQ(kernel.hw, hw);
    EXPECT_EQ(kernel.simd, simd[hw]) << hw;
    EXPECT_EQ(kernel.inline_data_registers, inline_registers[hw]) << hw;
    EXPECT_EQ(kernel.register_size(), hw < 7 ? 32 : 64);
  }
}

TEST(ForgeInterface, OtherDefaults) {
  const kernel_interface kernel(hw_fir);
  EXPECT_TRUE(kernel.arguments.empty());
  EXPECT_EQ(kernel.kernel_name, "default_kernel");
  EXPECT_EQ(kernel.next_index, 0U);
  EXPECT_FALSE(kernel.finalized || kernel.location_overridden || kernel.require_stateless_4gb);
  EXPECT_FALSE(kernel.use_dpas || kernel.use_global_atomics || kernel.disable_preemption);
  EXPECT_FALSE(kernel.need_local_id || kernel.need_local_size || kernel.use_enqueued_local_size);
  EXPECT_FALSE(kernel.need_half || kernel.need_double);
  EXPECT_TRUE(kernel.stateless_write);
  EXPECT_EQ(kernel.thread_scheduling, 0);
  EXPECT_EQ(kernel.barrier_count, 0);
  EXPECT_EQ(kernel.grf_count, 128);
  EXPECT_EQ(kernel.skip_per_thread_offset, 0);
  EXPECT_EQ(kernel.scratch_size, 0U);
  EXPECT_EQ(kernel.slm_size, 0U);
  EXPECT_EQ(kernel.walk_order, (std::array<std::int32_t, 3>{-1, -1, -1}));
  EXPECT_EQ(kernel.work_group_size, (std::array<std::uint64_t, 3>{0, 0, 0}));
  EXPECT_EQ(kernel.cross_thread_bytes, 0U);
  EXPECT_EQ(kernel.cross_thread_registers, 0U);
}

TEST(ForgeInterface, TypesTellTheirSize) {
  EXPECT_EQ(size_of(type_uchar), 1);
  EXPECT_EQ(size_of(type_ushort), 2);
  EXPECT_EQ(size_of(type_uint), 4);
  EXPECT_EQ(size_of(type_ulong), 8);
  EXPECT_EQ(size_of(0xFF), 128);
}

TEST(ForgeInterface, LocationsKeepTheirParts) {
  EXPECT_FALSE(register_location().is_assigned());
  for (const std::int32_t number : {0, 1, 511, 0x7FFFFFFF}) {
    for (const std::int32_t sub_register : {0, 63, 0xFFFFFF}) {
      const register_location place(number, sub_register, 0xFF);
      EXPECT_TRUE(place.is_assigned());
      EXPECT_EQ(place.number(), number);
      EXPECT_EQ(place.sub_register(), sub_register);
      EXPECT_EQ(place.type(), 0xFF);
    }
  }
}

TEST(ForgeInterface, AccessIsOfGlobalPointers) {
  for (int hw = 0; hw <= 8; ++hw) {
    kernel_interface kernel(static_cast<hw_code>(hw));
    kernel.new_argument("usual", type_ulong, argument_kind::global_pointer, default_access);
    kernel.new_argument("none", type_ulong, argument_kind::global_pointer, 0);
    kernel.new_argument("surface", type_ulong, argument_kind::global_pointer, surface_access);
    kernel.new_argument("local", type_ulong, argument_kind::local_pointer, surface_access);
    kernel.new_argument("scalar", type_ulong);
    EXPECT_EQ(kernel.arguments[0].access, hw < 7 ? 3 : 1) << hw;
    EXPECT_EQ(kernel.arguments[1].access, 0);
    EXPECT_EQ(kernel.arguments[2].access, 2);
    EXPECT_EQ(kernel.arguments[3].access, 0);
    EXPECT_EQ(kernel.arguments[4].access, 0);
  }
}

TEST(ForgeInterface, SurfacesAndIndicesCountUp) {
  kernel_interface kernel(hw_ash);
  kernel.new_argument("scalar", type_uint);
  kernel.new_argument("a", type_ulong, argument_kind::global_pointer, default_access);
  kernel.new_argument("stateless", type_ulong, argument_kind::global_pointer, stateless_access);
  kernel.new_argument("b", type_ulong, argument_kind::global_pointer, surface_access);
  EXPECT_EQ(kernel.get_surface("scalar"), 128);
  EXPECT_EQ(kernel.get_surface("a"), 0);
  EXPECT_EQ(kernel.get_surface("stateless"), 128);
  EXPECT_EQ(kernel.get_surface("b"), 1);
  EXPECT_THROW(kernel.get_surface("c"), unknown_argument_exception);
  for (std::int32_t i = 0; i < 4; ++i) {
    EXPECT_EQ(kernel.arguments[static_cast<std::size_t>(i)].index, i);
  }
  EXPECT_EQ(kernel.next_index, 4U);
}

// One of each size, declared in another order than they are placed in.
void declare_mixture(kernel_interface& kernel) {
  kernel.new_argument("a", type_ushort);
  kernel.new_argument("p", type_ulong, argument_kind::global_pointer, default_access);
  kernel.new_argument("l", type_uint, argument_kind::local_pointer, 0);
  kernel.new_argument("b", type_ulong);
  kernel.new_argument("c", type_uchar);
  kernel.new_argument("d", type_uint);
}

TEST(ForgeInterface, PlacesInRegistersOf32Bytes) {
  kernel_interface kernel(hw_fir);
  declare_mixture(kernel);
  EXPECT_FALSE(kernel.get_argument("a").is_assigned());
  kernel.finalize();
  EXPECT_TRUE(kernel.finalized);
  expect_place(kernel, "l", 2, 0);
  expect_place(kernel, "p", 2, 1);
  expect_place(kernel, "a", 2, 8);
  expect_place(kernel, "b", 2, 3);
  expect_place(kernel, "c", 3, 0);
  expect_place(kernel, "d", 3, 1);
  EXPECT_EQ(kernel.get_argument("a").type(), type_ushort);
  EXPECT_EQ(kernel.cross_thread_bytes, 64U);
  EXPECT_EQ(kernel.cross_thread_registers, 2U);
}

TEST(ForgeInterface, PlacesInRegistersOf64Bytes) {
  kernel_interface kernel(hw_pine);
  declare_mixture(kernel);
  kernel.finalize();
  expect_place(kernel, "l", 1, 0);
  expect_place(kernel, "p", 1, 1);
  expect_place(kernel, "a", 1, 8);
  expect_place(kernel, "b", 1, 3);
  expect_place(kernel, "c", 1, 32);
  expect_place(kernel, "d", 1, 9);
  EXPECT_EQ(kernel.cross_thread_bytes, 64U);
  EXPECT_EQ(kernel.cross_thread_registers, 1U);
}

TEST(ForgeInterface, FirstRegisterIsBehindTheHeaderAndTheLocalIds) {
  struct row {
    hw_code hw;
    bool need_local_id;
    std::int32_t simd;
    std::int32_t first;
  };
  const row rows[] = {
      {hw_unknown, false, 8, 2}, {hw_fir, false, 1, 2},   {hw_ash, false, 32, 2},
      {hw_oak, false, 8, 1},     {hw_larch, false, 1, 1}, {hw_fir, true, 1, 2},
      {hw_larch, true, 1, 2},    {hw_fir, true, 8, 4},    {hw_yew, true, 16, 4},
      {hw_ash, true, 17, 7},     {hw_ash, true, 32, 7},   {hw_yew, true, 32, 7},
      {hw_pine, true, 16, 4},    {hw_pine, true, 32, 4},
  };
  for (const row& expected : rows) {
    kernel_interface kernel(expected.hw);
    kernel.need_local_id = expected.need_local_id;
    kernel.simd = expected.simd;
    kernel.new_argument("s", type_uint);
    kernel.finalize();
    expect_place(kernel, "s", expected.first, 0);
    EXPECT_EQ(kernel.cross_thread_bytes, 32U) << expected.hw << " " << expected.simd;
    EXPECT_EQ(kernel.cross_thread_registers, 1U) << expected.hw << " " << expected.simd;
  }
}

TEST(ForgeInterface, TotalsOfFullAndEmptyRegisters) {
  struct row {
    hw_code hw;
    int scalars;  // of 8 bytes
    std::uint32_t bytes;
    std::uint32_t registers;
  };
  const row rows[] = {
      {hw_fir, 0, 0, 0},   {hw_fir, 4, 32, 1},     {hw_fir, 5, 64, 2},  {hw_yew, 9, 96, 3},
      {hw_pine, 0, 0, 0},  {hw_pine, 4, 32, 1},    {hw_pine, 5, 64, 1}, {hw_pine, 8, 64, 1},
      {hw_pine, 9, 96, 2}, {hw_larch, 13, 128, 2},
  };
  for (const row& expected : rows) {
    kernel_interface kernel(expected.hw);
    declare_scalars(kernel, expected.scalars, type_ulong);
    kernel.finalize();
    EXPECT_EQ(kernel.cross_thread_bytes, expected.bytes) << expected.hw << " " << expected.scalars;
    EXPECT_EQ(kernel.cross_thread_registers, expected.registers)
        << expected.hw << " " << expected.scalars;
  }
}

TEST(ForgeInterface, EnqueuedLocalSizesNeed12BytesInOneRegister) {
  struct row {
    hw_code hw;
    int scalars;  // of 4 bytes
    std::int32_t number;
    std::int32_t sub_register;
  };
  const row rows[] = {{hw_fir, 0, 2, 0}, {hw_fir, 5, 2, 5},    {hw_fir, 6, 3, 0},
                      {hw_fir, 8, 3, 0}, {hw_pine, 13, 1, 13}, {hw_pine, 14, 2, 0}};
  for (const row& expected : rows) {
    kernel_interface kernel(expected.hw);
    kernel.need_local_size = true;
    kernel.use_enqueued_local_size = true;
    declare_scalars(kernel, expected.scalars, type_uint);
    kernel.finalize();
    expect_place(kernel, "__local_size0", expected.number, expected.sub_register);
    ASSERT_EQ(kernel.arguments.size(), static_cast<std::size_t>(expected.scalars) + 3);
    const kernel_argument& hidden = kernel.arguments[static_cast<std::size_t>(expected.scalars)];
    EXPECT_EQ(hidden.kind, argument_kind::hidden);
    EXPECT_EQ(hidden.type, 0x40);
    EXPECT_EQ(hidden.index, -1);
    EXPECT_EQ(hidden.surface, 128);
  }
}

TEST(ForgeInterface, EnqueuedLocalSizesFollowEachOther) {
  kernel_interface kernel(hw_fir);
  kernel.need_local_size = true;
  kernel.use_enqueued_local_size = true;
  kernel.finalize();
  expect_place(kernel, "__local_size0", 2, 0);
  expect_place(kernel, "__local_size1", 2, 3);
  expect_place(kernel, "__local_size2", 2, 4);
  EXPECT_EQ(kernel.cross_thread_bytes, 32U);
  EXPECT_EQ(kernel.get_local_size(1).sub_register(), 3);
}

TEST(ForgeInterface, TheKindOfLocalSizesIsNoWishForThem) {
  kernel_interface kernel(hw_fir);
  kernel.use_enqueued_local_size = true;
  kernel.finalize();
  EXPECT_TRUE(kernel.arguments.empty());
}

TEST(ForgeInterface, LocalSizesOfTheHeaderTakeNoSpace) {
  for (const hw_code hw : {hw_fir, hw_larch}) {
    kernel_interface kernel(hw);
    kernel.need_local_size = true;
    kernel.finalize();
    ASSERT_EQ(kernel.arguments.size(), 3U);
    for (std::int32_t dimension = 0; dimension < 3; ++dimension) {
      const kernel_argument& size = kernel.arguments[static_cast<std::size_t>(dimension)];
      EXPECT_EQ(size.name, "__local_size" + std::to_string(dimension));
      EXPECT_EQ(size.type, 0x40);
      EXPECT_EQ(size.kind, argument_kind::hidden);
      EXPECT_EQ(size.index, -1);
      EXPECT_EQ(size.surface, 128);
      const register_location place = kernel.get_local_size(dimension);
      EXPECT_EQ(place.number(), hw == hw_fir ? 2 : 1);
      EXPECT_EQ(place.sub_register(), 3 + dimension);
      EXPECT_EQ(place.type(), 0x40);
    }
    EXPECT_EQ(kernel.cross_thread_bytes, 0U);
  }
}

TEST(ForgeInterface, ScratchIsAHiddenArgumentBehindTheOthers) {
  kernel_interface kernel(hw_fir);
  kernel.scratch_size = 1;
  kernel.new_argument("s", type_uint);
  kernel.finalize();
  ASSERT_EQ(kernel.arguments.size(), 2U);
  EXPECT_EQ(kernel.arguments[1].name, "__scratch_size");
  EXPECT_EQ(kernel.arguments[1].type, 0x68);
  EXPECT_EQ(kernel.arguments[1].kind, argument_kind::hidden);
  expect_place(kernel, "__scratch_size", 2, 1);
}

TEST(ForgeInterface, WhatWasPlacedByHandStays) {
  kernel_interface kernel(hw_fir);
  kernel.new_argument("a", type_uint);
  kernel.new_argument("b", type_uint);
  kernel.arguments[0].location = register_location(40, 7, type_uint);
  kernel.location_overridden = true;
  kernel.finalize();
  expect_place(kernel, "a", 40, 7);
  expect_place(kernel, "b", 2, 0);
}

TEST(ForgeInterface, OnlyTheFirstFinalizeCounts) {
  kernel_interface kernel(hw_fir);
  kernel.scratch_size = 64;
  kernel.need_local_size = true;
  kernel.finalize();
  kernel.finalize();
  EXPECT_EQ(kernel.arguments.size(), 4U);
}

TEST(ForgeInterface, LocalIdsLieInFrontOfTheArguments) {
  struct row {
    hw_code hw;
    std::int32_t simd;
    std::int32_t number[3];
    std::int32_t sub_register[3];
  };
  const row rows[] = {{hw_fir, 1, {1, 1, 1}, {0, 1, 2}},
                      {hw_fir, 16, {1, 2, 3}, {0, 0, 0}},
                      {hw_ash, 32, {1, 3, 5}, {0, 0, 0}},
                      {hw_pine, 32, {1, 2, 3}, {0, 0, 0}}};
  for (const row& expected : rows) {
    kernel_interface kernel(expected.hw);
    kernel.simd = expected.simd;
    EXPECT_THROW(kernel.get_local_id(0), unknown_argument_exception) << "not asked for";
    kernel.need_local_id = true;
    for (std::int32_t dimension = 0; dimension < 3; ++dimension) {
      const register_location place = kernel.get_local_id(dimension);
      EXPECT_EQ(place.number(), expected.number[dimension]);
      EXPECT_EQ(place.sub_register(), expected.sub_register[dimension]);
      EXPECT_EQ(place.type(), type_ushort);
    }
    EXPECT_THROW(kernel.get_local_id(-1), unknown_argument_exception);
    EXPECT_THROW(kernel.get_local_id(3), unknown_argument_exception);
  }
}

TEST(ForgeInterface, UnknownArguments) {
  kernel_interface kernel(hw_fir);
  kernel.new_argument("s", type_uint);
  kernel.finalize();
  EXPECT_THROW(kernel.get_argument("t"), unknown_argument_exception);
  EXPECT_THROW(kernel.get_argument(""), unknown_argument_exception);
  EXPECT_THROW(kernel.get_local_size(0), unknown_argument_exception) << "not asked for";
  EXPECT_THROW(kernel.get_local_size(-1), unknown_argument_exception);
  EXPECT_THROW(kernel.get_local_size(3), unknown_argument_exception);
}

}  // namespace
