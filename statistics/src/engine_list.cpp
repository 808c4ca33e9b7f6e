// SPDX-License-Identifier: Apache-2.0
// The engines of this library: every row of engines.def. Row `name` stands for the table of
// functions `name_engine`, defined in engines/<name>.cpp.
#include "engine.hpp"

namespace tarn::statistics {

#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  extern const engine_ops name##_engine;
#include "rng/engines/engines.def"

namespace {

#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {code, word_bits, skip_list != 0, uniform_bits != 0, &name##_engine},
constexpr engine_row rows[] = {
#include "rng/engines/engines.def"
};

}  // namespace

const engine_row* find_engine(std::uint32_t code) {
  const std::uint32_t member = code & member_mask;
  for (const engine_row& row : rows) {
    if (row.code == code - member && member < row.ops->members)
      return &row;
  }
  return nullptr;
}

}  // namespace tarn::statistics
