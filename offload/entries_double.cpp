// SPDX-License-Identifier: Apache-2.0
// The entries of double precision.
#define TARN_TAKE_float(...)
#define TARN_TAKE_double(...) __VA_ARGS__
#define TARN_TAKE_int32_t(...)
#define TARN_TAKE_uint32_t(...)
#define TARN_TAKE_uint64_t(...)

#include "entries.hpp"
