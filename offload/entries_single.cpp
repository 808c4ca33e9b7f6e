// SPDX-License-Identifier: Apache-2.0
// The entries of single precision.
#define TARN_TAKE_float(...) __VA_ARGS__
#define TARN_TAKE_double(...)
#define TARN_TAKE_int32_t(...)
#define TARN_TAKE_uint32_t(...)
#define TARN_TAKE_uint64_t(...)

#include "entries.hpp"
