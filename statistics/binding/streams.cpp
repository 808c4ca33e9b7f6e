// SPDX-License-Identifier: Apache-2.0
// The stream services under their plain names: check, report, and call the statistics library.
#include <limits>

#include "checks.hpp"
#include "entry.hpp"
#include "stream_verbose.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

using namespace tarn::rvx;

constexpr std::int64_t int_max = std::numeric_limits<int>::max();

// Reports a failure of the library at the given position; a missing entry has been reported.
int reported(const char* name, int position, int status) {
  return status < 0 && status != RVX_STATUS_NO_ENTRY ? report(name, position, status) : status;
}

int new_stream(const char* name, rvx_stream* stream, std::int64_t code, std::int64_t n,
               const std::uint32_t* params) {
  static entry<int(rvx_stream*, int, int, const std::uint32_t*)> call("__rvxNewStreamEx");
  const verbose_call verbose;
  if (const int status = check_handle(name, 1, stream); status != 0)
    return status;
  if (code < 0 || code > int_max)
    return report(name, 2, RVX_STATUS_BAD_CODE);
  if (n < 0 || n > int_max)
    return report(name, 3, -3);
  if (n > 0 && params == nullptr)
    return report(name, 4, -4);
  // The core reads its settings before the first stream exists.
  static_cast<void>(tarn_serv_get_dynamic());
  const int status = call(stream, static_cast<int>(code), static_cast<int>(n), params);
  if (status == RVX_STATUS_BAD_CODE)
    return report(name, 2, status);
  char engine[engine_text_bytes];
  verbose.print("%s(%p,%s)", name, status == 0 ? *stream : nullptr, engine_text(code, engine));
  return status;
}

}  // namespace

int rvxNewStream(rvx_stream* stream, std::int64_t code, std::uint64_t seed) {
  const std::uint32_t words[2] = {static_cast<std::uint32_t>(seed),
                                  static_cast<std::uint32_t>(seed >> 32)};
  const bool one_word = seed <= static_cast<std::uint64_t>(int_max);
  return new_stream(__func__, stream, code, one_word ? 1 : 2, words);
}

int rvxNewStreamEx(rvx_stream* stream, std::int64_t code, std::int64_t n,
                   const std::uint32_t* params) {
  return new_stream(__func__, stream, code, n, params);
}

int rvxDeleteStream(rvx_stream* stream) {
  static entry<int(rvx_stream*)> call("__rvxDeleteStream");
  const verbose_call verbose;
  if (const int status = check_handle(__func__, 1, stream); status != 0)
    return status;
  if (const int status = check_stream(__func__, 1, *stream); status != 0)
    return status;
  const void* was = *stream;
  const int status = call(stream);
  verbose.print("%s(%p)", __func__, was);
  return status;
}

int rvxCopyStream(rvx_stream* out, rvx_stream in) {
  static entry<int(rvx_stream*, rvx_stream)> call("__rvxCopyStream");
  if (const int status = check_handle(__func__, 1, out); status != 0)
    return status;
  if (const int status = check_stream(__func__, 2, in); status != 0)
    return status;
  return reported(__func__, 2, call(out, in));
}

int rvxLeapfrogStream(rvx_stream stream, std::int64_t idx, std::int64_t stride) {
  static entry<int(rvx_stream, int, int)> call("__rvxLeapfrogStream");
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  if (idx < 0 || idx > int_max)
    return report(__func__, 2, -2);
  if (stride < 1 || stride > int_max)
    return report(__func__, 3, -3);
  return reported(__func__, 1, call(stream, static_cast<int>(idx), static_cast<int>(stride)));
}

int rvxSkipAheadStream(rvx_stream stream, std::int64_t count) {
  static entry<int(rvx_stream, std::int64_t)> call("__rvxSkipAheadStream");
  const verbose_call verbose;
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  const int status = reported(__func__, 1, call(stream, count));
  verbose.print("%s(%p,%lli)", __func__, stream, static_cast<long long>(count));
  return status;
}

int rvxSkipAheadStreamEx(rvx_stream stream, std::int64_t n, const std::uint64_t* words) {
  static entry<int(rvx_stream, int, const std::uint64_t*)> call("__rvxSkipAheadStreamEx");
  const verbose_call verbose;
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  if (n < 0 || n > int_max)
    return report(__func__, 2, -2);
  if (n > 0 && words == nullptr)
    return report(__func__, 3, -3);
  const int status = reported(__func__, 1, call(stream, static_cast<int>(n), words));
  verbose.print("%s(%p,%lli)", __func__, stream, static_cast<long long>(n));
  return status;
}

int rvxGetStreamSize(rvx_stream stream) {
  static entry<int(rvx_stream)> call("__rvxGetStreamSize");
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  return reported(__func__, 1, call(stream));
}

int rvxSaveStreamM(rvx_stream stream, std::uint8_t* mem) {
  static entry<int(rvx_stream, std::uint8_t*)> call("__rvxSaveStreamM");
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  if (mem == nullptr)
    return report(__func__, 2, -2);
  return reported(__func__, 2, call(stream, mem));
}

int rvxLoadStreamM(rvx_stream* stream, const std::uint8_t* mem) {
  static entry<int(rvx_stream*, const std::uint8_t*)> call("__rvxLoadStreamM");
  if (const int status = check_handle(__func__, 1, stream); status != 0)
    return status;
  if (mem == nullptr)
    return report(__func__, 2, -2);
  return reported(__func__, 2, call(stream, mem));
}

int rvxSaveStreamF(rvx_stream stream, const char* name, int length) {
  static entry<int(rvx_stream, const char*, int)> call("__rvxSaveStreamF");
  if (const int status = check_stream(__func__, 1, stream); status != 0)
    return status;
  if (name == nullptr)
    return report(__func__, 2, -2);
  if (length < -1)
    return report(__func__, 3, -3);
  return reported(__func__, 2, call(stream, name, length));
}

int rvxLoadStreamF(rvx_stream* stream, const char* name, int length) {
  static entry<int(rvx_stream*, const char*, int)> call("__rvxLoadStreamF");
  if (const int status = check_handle(__func__, 1, stream); status != 0)
    return status;
  if (name == nullptr)
    return report(__func__, 2, -2);
  if (length < -1)
    return report(__func__, 3, -3);
  return reported(__func__, 2, call(stream, name, length));
}
