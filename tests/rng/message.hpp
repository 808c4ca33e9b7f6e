// SPDX-License-Identifier: Apache-2.0
// The text and the class of what a call raises, in one string to compare.
#pragma once

#include <string>
#include <typeinfo>

#include <gtest/gtest.h>

namespace tarn_test {

/// what() of an exception of exactly class `Expected`; otherwise a text that no message equals.
template <typename Expected, typename Call>
std::string message_of(Call call) {
  try {
    call();
  } catch (const Expected& raised) {
    return typeid(raised) == typeid(Expected) ? raised.what()
                                              : std::string("[derived class] ") + raised.what();
  } catch (const std::exception& raised) {
    return std::string("[other class] ") + raised.what();
  }
  return "[nothing raised]";
}

}  // namespace tarn_test
