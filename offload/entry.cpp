// SPDX-License-Identifier: Apache-2.0
// The engine code of a stream.
#include "entry.hpp"

#include <cstring>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail::openmp {

static_assert(engine_index(RVX_BRNG_MCG31) == 0 && engine_index(RVX_BRNG_MRG32K3A) == 2 &&
              engine_index(RVX_BRNG_MCG59) == 3 && engine_index(RVX_BRNG_SOBOL) == 5 &&
              engine_index(RVX_BRNG_MT19937) == 7 && engine_index(RVX_BRNG_MT2203) == 8 &&
              engine_index(RVX_BRNG_PHILOX4X32X10) == 15 && engine_index(RVX_BRNG_MT2203 + 1) > 15);

std::uint32_t engine_index_of(rvx_stream stream) {
  if (stream == nullptr) {
    throw invalid_argument("rng", "generate", "stream");
  }
  std::uint32_t code = 0;
  std::memcpy(&code, stream, sizeof code);
  return engine_index(code);
}

}  // namespace kestrel::tarn::rng::detail::openmp
