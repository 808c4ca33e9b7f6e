// SPDX-License-Identifier: Apache-2.0
// What a kernel needs to know of an engine. Each stepping header specialises it:
//   record                 plain words of the engine, as they stand in the host stream's memory
//   scale<Real>(lo, hi)    the word-to-real rule of the engine: real = word * scale + offset,
//   offset<Real>(lo, hi)   computed on the host in the precision of the result
//   four<T>(record*, block, out, scale, offset)
//                          words 4 * block to 4 * block + 3 from the record's position, raw for
//                          T = std::uint32_t; may overwrite the record
#pragma once

#include <kestrel/tarn/rng/engines.hpp>

namespace kestrel::tarn::rng::detail {

template <typename Engine>
struct engine_traits;

}  // namespace kestrel::tarn::rng::detail
