// SPDX-License-Identifier: Apache-2.0
// What the suites of late binding share: the program that binds one runtime, and the proof that a
// function passes its arguments on.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "tests/core/child_process.hpp"

namespace binding_test {

using texts = std::vector<std::string>;

/// Runs the child with the stand-ins of a folder that CMakeLists.txt makes. An empty name leaves
/// the machine's libraries in their places.
inline core_test::outcome run(const std::string& runtime, const std::string& action,
                              const std::string& folder, texts settings = {}) {
  if (!folder.empty()) {
    settings.push_back("LD_LIBRARY_PATH=" TARN_STUBS "/" + folder);
  }
  return core_test::run_child({runtime, action}, settings);
}

/// Runs the child as on a machine that has none of the libraries. Where the audit library that
/// hides them cannot be used, files of their names are found that are none.
inline core_test::outcome run_without_libraries(const std::string& runtime,
                                                const std::string& action) {
  const std::string audit = TARN_NO_DRIVERS;
  return audit.empty() ? run(runtime, action, "no_library")
                       : run(runtime, action, "", {"LD_AUDIT=" + audit});
}

/// What the child prints of a function that is missing.
inline std::string missing_line(const std::string& name) {
  return "Tarn: no loaded library has the function '" + name + "'\n";
}

/// What the child's action "bind" prints: the result of binding, and how many of `size` pointers
/// are there, the first ones.
inline std::string bind_lines(int result, std::size_t found, std::size_t size) {
  const std::string text = std::to_string(result);
  return text + " " + text + " state " + (result == 0 ? "1" : "-1") + "\n" +
         std::string(found, '1') + std::string(size - found, '0') + "\n";
}

/// A value that no other place has.
template <class T>
T value_at(std::size_t place) {
  if constexpr (std::is_pointer_v<T>) {
    return reinterpret_cast<T>(std::uintptr_t{0x10000} + 16 * place);
  } else {
    return static_cast<T>(100 + place);
  }
}

constexpr std::size_t place_of_result = 50;

/// Stands in for a function, and keeps what it is called with.
template <class Result, class... Argument>
struct recorder {
  static inline std::tuple<Argument...> seen;
  static Result record(Argument... arguments) {
    seen = {arguments...};
    if constexpr (!std::is_void_v<Result>) {
      return value_at<Result>(place_of_result);
    }
  }
};

template <class Result, class... Argument, std::size_t... place>
void expect_passed_on(const char* name, std::atomic<void*>& slot, Result (*function)(Argument...),
                      std::index_sequence<place...>) {
  using double_of = recorder<Result, Argument...>;
  const std::tuple<Argument...> given(value_at<Argument>(place)...);
  double_of::seen = {};
  slot = reinterpret_cast<void*>(&double_of::record);
  if constexpr (std::is_void_v<Result>) {
    std::apply(function, given);
  } else {
    EXPECT_EQ(std::apply(function, given), value_at<Result>(place_of_result)) << name;
  }
  EXPECT_EQ(double_of::seen, given) << name;
  slot = nullptr;
}

/// The function calls what the slot points to, with its arguments, and gives back its result.
template <class Result, class... Argument>
void expect_passed_on(const char* name, std::atomic<void*>& slot, Result (*function)(Argument...)) {
  static_assert(sizeof...(Argument) < place_of_result);
  expect_passed_on(name, slot, function, std::index_sequence_for<Argument...>());
}

}  // namespace binding_test
