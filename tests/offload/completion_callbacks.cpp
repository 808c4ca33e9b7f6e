// SPDX-License-Identifier: Apache-2.0
// Callbacks of events that end as a test says: who is told, and what becomes of the references.
#include <vector>

#include <gtest/gtest.h>

#include "completions.hpp"
#include "offload/opencl_completion.hpp"
#include "omptarget.hpp"
#include "opencl_events.hpp"

namespace {

using kestrel::tarn::rng::detail::openmp::complete_after;
using opencl_events::get;
using tarn_test::completions;

class completion_callback : public testing::Test {
 protected:
  completion_callback() { interop_.set_completion(completions::note); }
  void TearDown() override {
    get().refuse(0);
    EXPECT_EQ(completions::all().count(), 0u) << "told more than once";
    EXPECT_EQ(omptarget::mistakes(), 0);
  }

  _cl_event* const event_ = get().make();
  omptarget::interop interop_;
};

TEST_F(completion_callback, tells_once_of_an_event_that_is_complete) {
  ASSERT_EQ(complete_after(event_, interop_.handle()), 0);
  EXPECT_EQ(get().references(event_), 2);
  EXPECT_EQ(completions::all().count(), 0u);
  get().end(event_, 0);
  const auto told = completions::all().take(1);
  ASSERT_EQ(told.size(), 1u);
  EXPECT_EQ(told[0].interop, interop_.handle());
  EXPECT_EQ(get().references(event_), 1);
}

TEST_F(completion_callback, tells_nobody_of_an_event_that_fails) {
  for (const int code : {-1, -5, -4242}) {
    ASSERT_EQ(complete_after(event_, interop_.handle()), 0);
    get().end(event_, code);
    EXPECT_EQ(completions::all().count(), 0u) << code;
    EXPECT_EQ(get().references(event_), 1) << code;
  }
}

TEST_F(completion_callback, that_is_not_taken_is_minus_2) {
  for (const int code : {-6, -58, 1}) {
    get().refuse(code);
    EXPECT_EQ(complete_after(event_, interop_.handle()), -2) << code;
    EXPECT_EQ(get().references(event_), 1) << code;
    get().end(event_, 0);
    EXPECT_EQ(completions::all().count(), 0u) << code;
  }
}

TEST_F(completion_callback, of_an_object_without_a_function_gives_the_reference_back) {
  for (const bool null : {false, true}) {
    omptarget::interop nobody;
    if (null) {
      nobody.set_native(4, nullptr);
    }
    ASSERT_EQ(complete_after(event_, nobody.handle()), 0);
    get().end(event_, 0);
    EXPECT_EQ(get().references(event_), 1);
  }
}

TEST_F(completion_callback, knows_its_object_among_many) {
  std::vector<omptarget::interop> objects(20);
  std::vector<_cl_event*> events;
  for (omptarget::interop& object : objects) {
    object.set_completion(completions::note);
    events.push_back(get().make());
    ASSERT_EQ(complete_after(events.back(), object.handle()), 0);
  }
  for (std::size_t i = objects.size(); i-- > 0;) {
    get().end(events[i], 0);
    const auto told = completions::all().take(1);
    ASSERT_EQ(told.size(), 1u);
    EXPECT_EQ(told[0].interop, objects[i].handle());
  }
}

}  // namespace
