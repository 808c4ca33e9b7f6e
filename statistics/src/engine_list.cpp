// SPDX-License-Identifier: Apache-2.0
// The engines of this library, from the rows of engines.def that are built. Row `name` stands for
// the table of functions `name_engine`, defined in engines/<name>.cpp.
#include "engine.hpp"

namespace tarn::statistics {

#define TARN_ENGINE_0(name)
#define TARN_ENGINE_1(name) extern const engine_ops name##_engine;
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_ENGINE_##built(name)
#include "rng/engines/engines.def"
#undef TARN_ENGINE_0
#undef TARN_ENGINE_1

namespace {

#define TARN_ENGINE_0(name, code, uniform_bits)
#define TARN_ENGINE_1(name, code, uniform_bits) {code, uniform_bits != 0, &name##_engine},
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits, built)                                                     \
  TARN_ENGINE_##built(name, code, uniform_bits)
constexpr engine_row rows[] = {
#include "rng/engines/engines.def"
};
#undef TARN_ENGINE_0
#undef TARN_ENGINE_1

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
