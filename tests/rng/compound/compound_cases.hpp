// SPDX-License-Identifier: Apache-2.0
// Parameters for every road of every rejecting or compound row on a GPU, with the words that a call
// takes where parameters alone say so, and the walk over those rows.
#pragma once

#include <cstdint>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include "frame/rows.hpp"

namespace tarn_test {

/// A distribution for n results.
template <typename Distr>
struct compound_case {
  std::string road;
  Distr distr;
  std::int64_t width;  // values of one result
  std::int64_t words;  // that n results take; -1 where that hangs on what is accepted
};

inline constexpr std::int64_t by_rejection = -1;

template <typename Distr>
struct compound_cases;

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::gamma<T, Method>> {
  using distr = kestrel::tarn::rng::gamma<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"one", distr(1, T(0.25), T(1.75)), 1, n},
            {"above one", distr(T(2.5), T(0.25), T(1.75)), 1, by_rejection},
            {"above 0.6", distr(T(0.75), T(0.25), T(1.75)), 1, by_rejection},
            {"below 0.6", distr(T(0.5), T(0.25), T(1.75)), 1, by_rejection}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::beta<T, Method>> {
  using distr = kestrel::tarn::rng::beta<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"first is one", distr(1, T(0.75), T(-1), 3), 1, n},
            {"second is one", distr(T(0.75), 1, T(-1), 3), 1, n},
            {"both below, little", distr(T(0.5), T(0.5), T(-1), 3), 1, by_rejection},
            {"both below, much", distr(T(0.875), T(0.875), T(-1), 3), 1, by_rejection},
            {"first below", distr(T(0.75), 4, T(-1), 3), 1, by_rejection},
            {"second below", distr(4, T(0.75), T(-1), 3), 1, by_rejection},
            {"both above", distr(2, 3, T(-1), 3), 1, by_rejection}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::chi_square<T, Method>> {
  using distr = kestrel::tarn::rng::chi_square<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"square", distr(1), 1, n},
            {"three squares", distr(3), 1, 3 * n},
            {"two uniforms", distr(4), 1, 2 * n},
            {"eight uniforms", distr(16), 1, 8 * n},
            {"gamma, odd", distr(5), 1, by_rejection},
            {"gamma, even", distr(18), 1, by_rejection}};
  }
};

template <typename T, kestrel::tarn::rng::matrix_layout layout, typename Method>
struct compound_cases<kestrel::tarn::rng::gaussian_mv<T, layout, Method>> {
  using distr = kestrel::tarn::rng::gaussian_mv<T, layout, Method>;
  static std::vector<T> factor(std::size_t d) {
    using kestrel::tarn::rng::matrix_layout;
    return std::vector<T>(layout == matrix_layout::full     ? d * d
                          : layout == matrix_layout::packed ? d * (d + 1) / 2
                                                            : d,
                          T(0.5));
  }
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    constexpr bool two_words =
        std::is_same_v<Method, kestrel::tarn::rng::gaussian_mv_method::box_muller>;
    std::vector<compound_case<distr>> cases;
    for (const std::uint32_t d : {1u, 3u}) {
      cases.push_back({std::to_string(d), distr(d, std::vector<T>(d, 2), factor(d)), d,
                       d * n * (two_words ? 2 : 1)});
    }
    return cases;
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::poisson_v<T, Method>> {
  using distr = kestrel::tarn::rng::poisson_v<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    std::vector<double> rates;
    for (std::int64_t i = 0; i < n; ++i) {
      rates.push_back(0.01 + static_cast<double>(i % 50));
    }
    if (rates.empty()) {  // there is no such distribution
      return {};
    }
    return {{"rates", distr(rates), 1, n}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::binomial<T, Method>> {
  using distr = kestrel::tarn::rng::binomial<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"no trials", distr(0, 0.3), 1, 0},
            {"table", distr(20, 0.3), 1, n},
            {"turned table", distr(20, 0.7), 1, n},
            {"rejection", distr(200, 0.3), 1, by_rejection},
            {"turned rejection", distr(200, 0.7), 1, by_rejection}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::negative_binomial<T, Method>> {
  using distr = kestrel::tarn::rng::negative_binomial<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"table", distr(3.5, 0.4), 1, n}, {"rejection", distr(200, 0.5), 1, by_rejection}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::hypergeometric<T, Method>> {
  using distr = kestrel::tarn::rng::hypergeometric<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"a single value", distr(10, 10, 3), 1, 0},
            {"table", distr(50, 5, 10), 1, n},
            {"rejection", distr(500, 200, 150), 1, by_rejection}};
  }
};

template <typename T, typename Method>
struct compound_cases<kestrel::tarn::rng::multinomial<T, Method>> {
  using distr = kestrel::tarn::rng::multinomial<T, Method>;
  static std::vector<compound_case<distr>> all(std::int64_t n) {
    return {{"no trials", distr(0, {0.25, 0.75}), 2, 0},
            {"one category", distr(3, {1.0}), 1, 0},
            {"count", distr(2, std::vector<double>(32, 0x1p-5)), 32, 2 * n}};
  }
};

template <typename Distr>
struct row_type {
  using type = Distr;
};

/// Calls `call(row_type<Distr>{}, text of the row)` for each row that generate_ex draws on devices.
template <typename Call>
void for_every_compound_row(const Call& call) {
  using namespace kestrel::tarn::rng;
  using kestrel::tarn::rng::gamma;  // <math.h> has one as well
#define TARN_ROW_OF_generate(...)
#define TARN_ROW_OF_generate_ex(...) __VA_ARGS__
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) \
  TARN_ROW_OF_##road(                                                     \
      TARN_IF_##gpu(call(row_type<TARN_UNWRAP type>{}, #family " " #result " " #method);))
#include "distributions/distributions.def"
#undef TARN_ROW_OF_generate
#undef TARN_ROW_OF_generate_ex
}

}  // namespace tarn_test
