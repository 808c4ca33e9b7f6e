// SPDX-License-Identifier: Apache-2.0
// The laws of rejecting, compound and discrete distributions on a GPU queue, held against the
// reference laws of tests/laws by the same tests with the same critical values.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "frame/rows.hpp"
#include "laws/critical.hpp"
#include "laws/examination.hpp"
#include "laws/reference.hpp"
#include "laws/sampling.hpp"
#include "laws/specimen.hpp"
#include "queues.hpp"

namespace tarn_test {

/// The laws of the statistics library take 23 of the programs that the false alarms are shared out
/// among; the programs of these suites share the other two.
inline constexpr std::size_t device_law_programs = 5;
inline constexpr std::size_t tests_of_device_laws =
    2 * laws::tests_of_a_program / device_law_programs;

class within_budget : public testing::Environment {
  void TearDown() override { EXPECT_LE(laws::tests_made(), tests_of_device_laws); }
};
inline const testing::Environment* const law_budget =
    testing::AddGlobalTestEnvironment(new within_budget);  // gtest owns it

/// A counter, a congruence and a shift register.
using engines_of_laws = testing::Types<rng::philox4x32x10, rng::mcg59, rng::mt19937>;

struct name_of_engine {
  template <typename Engine>
  static std::string GetName(int) {
    return rng::detail::engine_row<Engine>::name;
  }
};

/// Results of a case; TARN_LONG_TESTS=1 draws twenty times as many. Groups of mt19937 pass over
/// each other's words, so that long calls take long.
template <typename Engine>
std::int64_t results_of_case() {
  const char* wish = std::getenv("TARN_LONG_TESTS");
  const std::int64_t n = std::is_same_v<Engine, rng::mt19937> ? 20'000 : 50'000;
  return wish != nullptr && std::string(wish) == "1" ? 20 * n : n;
}

/// An approximation of a total variation distance of up to 0.002 is held against its law with so
/// few results that it cannot fail for what it is: the distances and the tails allow for it by
/// law_of_approximation, and the mean of z^k of the variate clamped at its tails, whose range is
/// 5.6, 7.9, 44 and 62 for a normal one, moves by less than a third of the critical value.
inline constexpr std::int64_t results_of_approximation = 20'000;
inline laws::view law_of_approximation(const laws::law& of, double distance = 2e-3) {
  laws::view seen{of, laws::integer_resolution()};
  seen.resolution.probability = distance;
  return seen;
}

inline laws::view law_of_integers(const laws::law& of) {
  return {of, laws::integer_resolution()};
}

template <typename... Parameters>
std::string text_of(const std::string& family, Parameters... parameters) {
  std::ostringstream text;
  text.precision(9);
  text << family;
  ((text << ' ' << parameters), ...);
  return text.str();
}

template <typename Engine>
class device_laws : public testing::Test {
 protected:
  /// Draws `n` results of `width` values with a seed of the case's own and examines each view.
  template <typename Distr>
  static void expect_laws(const std::string& what, const Distr& distr,
                          const std::vector<laws::view>& views,
                          std::int64_t n = results_of_case<Engine>(), std::size_t width = 1) {
    Engine engine = engine_of(what);
    examine(what, draw(distr, engine, n, width), width, views);
  }

  /// The same where a view looks at `width` results together.
  template <typename Distr>
  static void expect_laws_of_rows(const std::string& what, const Distr& distr,
                                  const std::vector<laws::view>& views, std::int64_t rows,
                                  std::size_t width) {
    Engine engine = engine_of(what);
    examine(what, draw(distr, engine, rows * static_cast<std::int64_t>(width)), width, views);
  }

 private:
  static Engine engine_of(const std::string& what) {
    using seed_type = std::remove_const_t<decltype(Engine::default_seed)>;
    const std::uint64_t seed = laws::seed_of(what + name_of_engine::GetName<Engine>(0));
    return Engine(gpu_queue(), static_cast<seed_type>(seed));
  }

  template <typename T>
  static void examine(const std::string& what, const std::vector<T>& values, std::size_t width,
                      const std::vector<laws::view>& views) {
    const std::size_t n = values.size() / width;
    std::vector<double> result(width);
    for (std::size_t v = 0; v < views.size(); ++v) {
      laws::examination examined(views[v].expected, views[v].resolution, n);
      for (std::size_t i = 0; i < n; ++i) {
        std::transform(values.begin() + static_cast<std::ptrdiff_t>(i * width),
                       values.begin() + static_cast<std::ptrdiff_t>((i + 1) * width),
                       result.begin(), [](T value) { return static_cast<double>(value); });
        examined.add(views[v].of(result.data()));
      }
      EXPECT_EQ(laws::failures(examined.findings()), "") << what << ", view " << v;
    }
  }
};

}  // namespace tarn_test
