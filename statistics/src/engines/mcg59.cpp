// SPDX-License-Identifier: Apache-2.0
// The engine mcg59.
#include "engines/mcg59.hpp"

#include "distributions/real_words.hpp"
#include "engines/multiplicative.hpp"

namespace tarn::statistics {

extern const engine_ops mcg59_engine;
constexpr engine_ops mcg59_engine = multiplicative_engine<mcg59::group>::table(&mcg59_word_rule);

}  // namespace tarn::statistics
