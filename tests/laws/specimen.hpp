// SPDX-License-Identifier: Apache-2.0
// A specimen: one routine with one method and one set of parameters, and what its results must be.
// The tests of this folder walk lists of them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <limits>
#include <ostream>
#include <sstream>
#include <string>
#include <type_traits>
#include <vector>

#include "examination.hpp"
#include "law.hpp"
#include "tarn_rvx.h"

namespace laws {

// A number made of one result, and its law.
struct view {
  law expected;
  grain resolution;
  std::function<double(const double* result)> of = [](const double* result) { return *result; };
};

struct specimen {
  std::string routine;  // without the prefix rvx
  std::int64_t method;
  std::string parameters;
  std::size_t width;  // values of one result
  std::size_t bytes;  // of one value
  bool paired;        // results come in pairs, which a call must not cut
  std::function<int(rvx_stream, std::size_t n, void* r)> draw;
  std::function<double(const void* r, std::size_t i)> value;
  std::vector<view> views;

  std::string name() const {
    return routine + "(" + parameters + ") method " + std::to_string(method);
  }
};

inline void PrintTo(const specimen& s, std::ostream* out) {
  *out << s.name();
}

// All specimens of a family, and of all families.
#define TARN_FAMILY(name) std::vector<specimen> name##_cases();
#include "families.def"
std::vector<specimen> every_case();
// One specimen for each routine and method.
std::vector<specimen> every_method();

// The float or the double form of a routine.
template <class Real, class Single, class Double>
auto form(Single single, Double twofold) {
  if constexpr (std::is_same_v<Real, float>)
    return single;
  else
    return twofold;
}
template <class Real>
std::string form_name(const std::string& name) {
  return (std::is_same_v<Real, float> ? "s" : "d") + name;
}

// A canonical value has one word: 32 bits, or the 24 of a float. Formulas lose a few units in the
// last place on the way to a result.
template <class Real>
grain resolution_of(double place, bool exact_range = false) {
  constexpr double units = 4 * static_cast<double>(std::numeric_limits<Real>::epsilon());
  return {units, place, static_cast<double>(std::numeric_limits<Real>::min()),
          std::is_same_v<Real, float> ? 0x1p-24 : 0x1p-32, exact_range};
}
// Integers are what they are.
inline grain integer_resolution() {
  return {0, 0, 0, 0x1p-32, true};
}

// A routine whose parameters are plain numbers: draw(method, stream, n, r, parameters...).
template <class Value, class... Formal, class... Actual>
specimen routine(const std::string& name,
                 int (*draw)(std::int64_t, rvx_stream, std::int64_t, Value*, Formal...),
                 std::int64_t method, const law& expected, const grain& resolution,
                 Actual... parameters) {
  std::ostringstream text;
  text.precision(9);
  [[maybe_unused]] const char* comma = "";
  ((text << comma << parameters, comma = ", "), ...);
  return {name,
          method,
          text.str(),
          1,
          sizeof(Value),
          false,
          [=](rvx_stream stream, std::size_t n, void* r) {
            return draw(method, stream, static_cast<std::int64_t>(n), static_cast<Value*>(r),
                        parameters...);
          },
          [](const void* r, std::size_t i) {
            return static_cast<double>(static_cast<const Value*>(r)[i]);
          },
          {{expected, resolution}}};
}

// One result, drawn by itself or among others, as doubles.
inline std::vector<double> result(const specimen& s, const void* r, std::size_t i) {
  std::vector<double> values(s.width);
  for (std::size_t j = 0; j < s.width; ++j)
    values[j] = s.value(r, i * s.width + j);
  return values;
}

}  // namespace laws
