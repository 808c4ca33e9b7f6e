// SPDX-License-Identifier: Apache-2.0
// The double of the OpenMP offload runtime does what its header says.
#include "omptarget.hpp"

#include <memory>

#include <gtest/gtest.h>

namespace {

using native_function = int (*)(void*, int, void**);
using int_function = std::intptr_t (*)(const void*, int, int*);
using ptr_function = void* (*)(const void*, int, int*);
using str_function = const char* (*)(const void*, int, int*);

/// A function, as a program finds it.
template <typename Function>
Function find(const char* name) {
  return reinterpret_cast<Function>(dlsym(dlopen("libomptarget.so", RTLD_NOW), name));
}

const auto native = find<native_function>("__tgt_get_interop_property");
const auto get_int = find<int_function>("omp_get_interop_int");
const auto get_ptr = find<ptr_function>("omp_get_interop_ptr");
const auto get_str = find<str_function>("omp_get_interop_str");

constexpr int untouched = 77;

TEST(OmptargetDouble, NativePropertiesAreWhatATestSets) {
  omptarget::interop object;
  int device = 0;
  void* value = &object;
  EXPECT_NE(native(object.handle(), 9, &value), 0);
  EXPECT_EQ(value, &object) << "stored though the property is missing";
  object.set_native(9, &device);
  EXPECT_EQ(native(object.handle(), 9, &value), 0);
  EXPECT_EQ(value, &device);
  object.fail_native(9, 5);
  value = &object;
  EXPECT_EQ(native(object.handle(), 9, &value), 5);
  EXPECT_EQ(value, &object) << "stored though the call failed";
  object.fail_native_with(9, 5, &device);
  EXPECT_EQ(native(object.handle(), 9, &value), 5);
  EXPECT_EQ(value, &device) << "such a runtime stores";
}

TEST(OmptargetDouble, TheFlagNowaitIsAByteThatPropertyTwoPointsTo) {
  omptarget::interop object;
  for (const bool nowait : {true, false, true}) {
    object.set_nowait(nowait);
    void* value = nullptr;
    ASSERT_EQ(native(object.handle(), 2, &value), 0);
    EXPECT_EQ(*static_cast<unsigned char*>(value), nowait ? 1 : 0);
  }
}

void* completed = nullptr;

TEST(OmptargetDouble, PropertyFourIsAFunctionThatTakesTheObject) {
  omptarget::interop object;
  object.set_completion([](void* interop) { completed = interop; });
  void* value = nullptr;
  ASSERT_EQ(native(object.handle(), 4, &value), 0);
  reinterpret_cast<void (*)(void*)>(value)(object.handle());
  EXPECT_EQ(completed, object.handle());
}

TEST(OmptargetDouble, EachPropertyOfOpenmpHasOneType) {
  omptarget::interop object;
  object.set_int(-1, 3);
  object.set_ptr(-7, &object);
  object.set_str(-2, "opencl");
  int status = untouched;
  EXPECT_EQ(get_int(object.handle(), -1, &status), 3);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(get_ptr(object.handle(), -7, &status), &object);
  EXPECT_EQ(status, 0);
  EXPECT_STREQ(get_str(object.handle(), -2, &status), "opencl");
  EXPECT_EQ(status, 0);
  EXPECT_EQ(get_ptr(object.handle(), -1, &status), nullptr);
  EXPECT_EQ(status, -3) << "an integer";
  EXPECT_EQ(get_str(object.handle(), -7, &status), nullptr);
  EXPECT_EQ(status, -4) << "a pointer";
  EXPECT_EQ(get_int(object.handle(), -2, &status), 0);
  EXPECT_EQ(status, -5) << "a text";
  EXPECT_EQ(get_int(object.handle(), 10, &status), 0);
  EXPECT_EQ(status, 1) << "not set";
  EXPECT_EQ(get_int(object.handle(), -1, nullptr), 3);
  object.fail_int_with(-1, 1, 6);
  EXPECT_EQ(get_int(object.handle(), -1, &status), 6);
  EXPECT_EQ(status, 1) << "and a value";
}

TEST(OmptargetDouble, CallsAreCountedAndAnObjectThatIsGoneIsAMistake) {
  auto object = std::make_unique<omptarget::interop>();
  void* const handle = object->handle();
  object->set_int(-1, 3);
  const int before = omptarget::calls("omp_get_interop_int");
  const int mistakes = omptarget::mistakes();
  EXPECT_EQ(get_int(handle, -1, nullptr), 3);
  EXPECT_EQ(omptarget::mistakes(), mistakes);
  object.reset();
  int status = untouched;
  EXPECT_EQ(get_int(handle, -1, &status), 0);
  EXPECT_EQ(status, -1);
  void* value = nullptr;
  EXPECT_NE(native(nullptr, 2, &value), 0);
  EXPECT_EQ(omptarget::calls("omp_get_interop_int"), before + 2);
  EXPECT_EQ(omptarget::mistakes(), mistakes + 2);
  EXPECT_THROW(omptarget::calls("omp_get_interop_name"), std::invalid_argument);
}

}  // namespace
