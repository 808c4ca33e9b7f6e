// SPDX-License-Identifier: Apache-2.0
// The engine mcg31m1.
#include "engines/mcg31m1.hpp"

#include "distributions/real_words.hpp"
#include "engines/multiplicative.hpp"

namespace tarn::statistics {

extern const engine_ops mcg31m1_engine;
constexpr engine_ops mcg31m1_engine =
    multiplicative_engine<mcg31m1::group>::table(&mcg31m1_word_rule);

}  // namespace tarn::statistics
