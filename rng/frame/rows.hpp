// SPDX-License-Identifier: Apache-2.0
// The two lists as types: engine_row<Engine> and distribution_row<Distr> carry the columns of
// engines.def and distributions.def. TARN_IF_0 and TARN_IF_1 let a walk over the rows keep or skip
// by a column, TARN_UNWRAP takes the parentheses off a type.
#pragma once

#include <cstdint>

#include <kestrel/tarn/rng/distributions.hpp>
#include <kestrel/tarn/rng/engines.hpp>

#define TARN_IF_1(...) __VA_ARGS__
#define TARN_IF_0(...)
#define TARN_UNWRAP(...) __VA_ARGS__

namespace kestrel::tarn::rng::detail {

template <typename Engine>
struct engine_row;

#define TARN_ENGINE(name_, code_, label, word_bits_, seed_type, gpu_, skip, skip_list, leapfrog, \
                    uniform_bits_)                                                               \
  template <>                                                                                    \
  struct engine_row<name_> {                                                                     \
    static constexpr const char* name = #name_;                                                  \
    static constexpr std::int64_t code = code_;                                                  \
    static constexpr int word_bits = word_bits_;                                                 \
    static constexpr int stored_words = (word_bits_ + 31) / 32;                                  \
    static constexpr bool gpu = gpu_;                                                            \
    static constexpr bool uniform_bits = uniform_bits_;                                          \
  };
#include "engines/engines.def"

enum class device_entry : std::uint8_t { generate, generate_ex };

template <typename Distr>
struct distribution_row;

#define TARN_DISTRIBUTION(family_, result, method_, type, words_, road, gpu_) \
  template <>                                                                 \
  struct distribution_row<TARN_UNWRAP type> {                                 \
    static constexpr const char* family = #family_;                           \
    static constexpr const char* method = #method_;                           \
    static constexpr bool gpu = gpu_;                                         \
    static constexpr std::uint64_t per_output_words = words_;                 \
    static constexpr device_entry entry = device_entry::road;                 \
  };
#include "distributions/distributions.def"

}  // namespace kestrel::tarn::rng::detail
