// SPDX-License-Identifier: Apache-2.0
// The generation routines under their plain names. Every routine goes the same steps in the same
// order; the parameters of a distribution and the bits of its method are checked only when there
// is something to generate.
#include <limits>

#include "checks.hpp"
#include "entry.hpp"
#include "pieces.hpp"
#include "tarn_rvx.h"

namespace {

using namespace tarn::rvx;

// Bits that a method may have.
constexpr std::int64_t accuracy_methods = RVX_RNG_METHOD_ACCURACY_FLAG;
constexpr std::int64_t any_method = std::numeric_limits<int>::max();  // taken as it is

constexpr int parameters_good = 0;

// A failure that the checks in front cannot foresee: the method's bits, or a stream that is not in
// order. Callers may drop the status, so it has to be reported here; a missing entry has been.
int report_failure(const char* name, int status) {
  if (status >= 0 || status == RVX_STATUS_NO_ENTRY)
    return status;
  return report(name, status == -1 ? 1 : 2, status);
}

// `bad_parameter` gives the position of the first bad parameter of the distribution, or
// parameters_good; `call(method, stream, n, r)` is the library's routine.
template <class Value, class BadParameter, class Call>
int routine(const char* name, std::int64_t method, std::int64_t method_bits, rvx_stream stream,
            std::int64_t n, Value* r, const BadParameter& bad_parameter, const Call& call) {
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
  if (const int position = bad_parameter(); position != parameters_good)
    return report(name, position, -position);
  if ((method & ~method_bits) != 0)
    return report(name, 1, -1);
  const int status = in_pieces(n, r, largest_piece, [&](int count, Value* to) {
    return call(static_cast<int>(method), stream, count, to);
  });
  return report_failure(name, status);
}

template <class Value>
int uniform(const char* name, std::int64_t method, std::int64_t method_bits, rvx_stream stream,
            std::int64_t n, Value* r, Value a, Value b,
            entry<int(int, rvx_stream, int, Value*, Value, Value)>& library) {
  return routine(
      name, method, method_bits, stream, n, r,
      // Also true for bounds that are not numbers.
      [&] { return a < b ? parameters_good : 5; },
      [&](int m, rvx_stream s, int count, Value* to) { return library(m, s, count, to, a, b); });
}

template <class Word>
int words(const char* name, std::int64_t method, rvx_stream stream, std::int64_t n, Word* r,
          entry<int(int, rvx_stream, int, Word*)>& library) {
  return routine(
      name, method, any_method, stream, n, r, [] { return parameters_good; },
      [&](int m, rvx_stream s, int count, Word* to) { return library(m, s, count, to); });
}

}  // namespace

int rvxsRngUniform(std::int64_t method, rvx_stream stream, std::int64_t n, float* r, float a,
                   float b) {
  static entry<int(int, rvx_stream, int, float*, float, float)> library("_rvxsRngUniform");
  return uniform(__func__, method, accuracy_methods, stream, n, r, a, b, library);
}

int rvxdRngUniform(std::int64_t method, rvx_stream stream, std::int64_t n, double* r, double a,
                   double b) {
  static entry<int(int, rvx_stream, int, double*, double, double)> library("_rvxdRngUniform");
  return uniform(__func__, method, accuracy_methods, stream, n, r, a, b, library);
}

int rvxiRngUniform(std::int64_t method, rvx_stream stream, std::int64_t n, std::int32_t* r,
                   std::int32_t a, std::int32_t b) {
  static entry<int(int, rvx_stream, int, std::int32_t*, std::int32_t, std::int32_t)> library(
      "_rvxiRngUniform");
  return uniform(__func__, method, any_method, stream, n, r, a, b, library);
}

int rvxiRngUniformBits(std::int64_t method, rvx_stream stream, std::int64_t n, std::uint32_t* r) {
  static entry<int(int, rvx_stream, int, std::uint32_t*)> library("_rvxiRngUniformBits");
  return words(__func__, method, stream, n, r, library);
}

int rvxiRngUniformBits32(std::int64_t method, rvx_stream stream, std::int64_t n, std::uint32_t* r) {
  static entry<int(int, rvx_stream, int, std::uint32_t*)> library("_rvxiRngUniformBits32");
  return words(__func__, method, stream, n, r, library);
}

int rvxiRngUniformBits64(std::int64_t method, rvx_stream stream, std::int64_t n, std::uint64_t* r) {
  static entry<int(int, rvx_stream, int, std::uint64_t*)> library("_rvxiRngUniformBits64");
  return words(__func__, method, stream, n, r, library);
}
