// SPDX-License-Identifier: Apache-2.0
// The generation routines under their plain names. Every routine goes the same steps in the same
// order; the parameters of a distribution and the bits of its method are checked only when there
// is something to generate.
#include <cstring>
#include <limits>

#include "checks.hpp"
#include "entry.hpp"
#include "pieces.hpp"
#include "statistics/common/engine_code.hpp"
#include "statistics/common/parameters.hpp"
#include "tarn_rvx.h"

namespace {

using namespace tarn::rvx;
namespace parameters = tarn::statistics::parameters;

// A failure that the checks in front cannot foresee: the method's bits, numbers behind a pointer,
// or a stream that is not in order. Callers may drop the status, so it has to be reported here; a
// missing entry has been.
int report_failure(const char* name, int status) {
  constexpr int last_argument = -8;
  if (status >= 0 || status == RVX_STATUS_NO_ENTRY)
    return status;
  return report(name, status >= last_argument ? -status : 2, status);
}

// Values that one raw word of the stream's engine takes: words of more than 32 bits take two.
int values_per_word(rvx_stream stream) {
  std::uint32_t code;
  std::memcpy(&code, stream, sizeof code);
  switch (code & ~tarn::statistics::member_mask) {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  case code:                                                                                 \
    return word_bits > 32 ? 2 : 1;
#include "rng/engines/engines.def"
  }
  return 1;
}

constexpr int one_value = 1;

// The steps of a routine. `check()` gives the position of the first bad parameter of the
// distribution, or 0; `width()` the values of one result; `call(method, stream, count, to)` is the
// library's routine.
template <class Value, class Check, class Width, class Call>
int routine(const char* name, std::int64_t method, int methods, rvx_stream stream, std::int64_t n,
            Value* r, const Check& check, const Width& width, const Call& call) {
  if (method < 0)
    return report(name, 1, -1);
  if (const int status = check_stream(name, 2, stream); status != 0)
    return status;
  if (n < 0)
    return report(name, 3, -3);
  if (n == 0)
    return RVX_STATUS_OK;
  if (r == nullptr)
    return report(name, 4, -4);
  if (const int position = check(); position != parameters::good)
    return report(name, position, -position);
  if ((method & ~std::int64_t{methods}) != 0)
    return report(name, 1, -1);
  const int status = in_pieces(n, r, width(), largest_piece, [&](int count, Value* to) {
    return call(static_cast<int>(method), stream, count, to);
  });
  return report_failure(name, status);
}

}  // namespace

#define TARN_UNWRAP(...) __VA_ARGS__
#define TARN_ROUTINE(name, value, methods, width, parameters_, arguments, check)                   \
  int rvx##name(std::int64_t method, rvx_stream stream, std::int64_t n,                            \
                value* r TARN_UNWRAP parameters_) {                                                \
    static entry<int(int, rvx_stream, int, value* TARN_UNWRAP parameters_)> library("_rvx" #name); \
    return routine(                                                                                \
        __func__, method, parameters::methods, stream, n, r, [&] { return parameters::check; },    \
        [&] { return width; },                                                                     \
        [&](int code, rvx_stream source, int count, value* to) {                                   \
          return library(code, source, count, to TARN_UNWRAP arguments);                           \
        });                                                                                        \
  }
#include "statistics/common/routines.def"

// A rate for each result: the rates move along with the pieces.
int rvxiRngPoissonV(std::int64_t method, rvx_stream stream, std::int64_t n, std::int32_t* r,
                    const double* lambda) {
  static entry<int(int, rvx_stream, int, std::int32_t*, const double*)> library("_rvxiRngPoissonV");
  return routine(
      __func__, method, parameters::any_method, stream, n, r,
      [&] { return parameters::poisson_v(lambda); }, [] { return one_value; },
      [&](int m, rvx_stream s, int count, std::int32_t* to) {
        return library(m, s, count, to, lambda + (to - r));
      });
}
