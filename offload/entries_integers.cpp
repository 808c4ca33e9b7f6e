// SPDX-License-Identifier: Apache-2.0
// The entries of integer results.
#define TARN_TAKE_float(...)
#define TARN_TAKE_double(...)
#define TARN_TAKE_int32_t(...) __VA_ARGS__
#define TARN_TAKE_uint32_t(...) __VA_ARGS__
#define TARN_TAKE_uint64_t(...) __VA_ARGS__

#include "entries.hpp"
