// SPDX-License-Identifier: Apache-2.0
// The raw generation routines.
#include <exception>

#include "blocks.hpp"
#include "distributions/uniform.hpp"
#include "raw_entries.hpp"
#include "stream.hpp"

namespace {

using namespace tarn::statistics;

// Routines with a single method take the code as it is.
constexpr int any_method = 0x7FFFFFFF;

// The common head of every routine: checks method, stream, count and results in this order and
// runs use(stream) if there is something to do. `flags` are the bits that the method may have; a
// negative method is always refused.
template <class Use>
int routine(int method, int flags, void* stream, int n, const void* r, const Use& use) {
  if (method < 0 || (method & ~flags) != 0)
    return -1;
  live_stream found;
  if (const int status = find_stream(stream, found); status != RVX_STATUS_OK)
    return status;
  if (n < 0)
    return -3;
  if (n == 0)
    return RVX_STATUS_OK;
  if (r == nullptr)
    return -4;
  try {
    return use(found);
  } catch (const std::exception&) {
    // Sharing out the work found no memory or no threads. The stream has not moved.
    return RVX_STATUS_NO_MEMORY;
  }
}

word_source source_of(const live_stream& stream) {
  return {stream.engine->ops, stream.state()};
}

template <class Real>
int uniform(int method, void* stream, int n, Real* r, Real a, Real b) {
  return routine(method, RVX_RNG_METHOD_ACCURACY_FLAG, stream, n, r, [&](const live_stream& s) {
    if (!(a < b))
      return -5;
    const bool accurate = (method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;
    draw(source_of(s), static_cast<std::size_t>(n), 1, r, uniform_real<Real>{a, b, accurate});
    return RVX_STATUS_OK;
  });
}

template <class Value>
int words(int method, void* stream, int n, Value* r, bool equidistributed) {
  return routine(method, any_method, stream, n, r, [&](const live_stream& s) {
    if (equidistributed && !s.engine->uniform_bits)
      return RVX_STATUS_UNSUPPORTED;
    using producer = raw_words<Value>;
    draw(source_of(s), static_cast<std::size_t>(n), producer::words_per_value, r, producer{});
    return RVX_STATUS_OK;
  });
}

}  // namespace

int _rvxsRngUniform(int method, void* stream, int n, float* r, float a, float b) {
  return uniform(method, stream, n, r, a, b);
}

int _rvxdRngUniform(int method, void* stream, int n, double* r, double a, double b) {
  return uniform(method, stream, n, r, a, b);
}

int _rvxiRngUniform(int method, void* stream, int n, std::int32_t* r, std::int32_t a,
                    std::int32_t b) {
  return routine(method, any_method, stream, n, r, [&](const live_stream& s) {
    if (a >= b)
      return -5;
    draw(source_of(s), static_cast<std::size_t>(n), 1, r, uniform_int32{a, b});
    return RVX_STATUS_OK;
  });
}

int _rvxiRngUniformBits(int method, void* stream, int n, std::uint32_t* r) {
  return words(method, stream, n, r, false);
}

int _rvxiRngUniformBits32(int method, void* stream, int n, std::uint32_t* r) {
  return words(method, stream, n, r, true);
}

int _rvxiRngUniformBits64(int method, void* stream, int n, std::uint64_t* r) {
  return words(method, stream, n, r, true);
}
