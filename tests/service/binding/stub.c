/* SPDX-License-Identifier: Apache-2.0 */
/* A stand-in for a library that is bound late. Each function gives its place in the list of names,
 * and notes the call. -D<name>=<other> takes a name away. */
#include <stdint.h>

#ifndef TARN_STUB_FIRST
#define TARN_STUB_FIRST 0 /* what the first function gives */
#endif

#define SHOWN __attribute__((visibility("default")))

SHOWN int stub_calls[100];
SHOWN unsigned stub_arguments[100]; /* the first one of the latest call */

static intptr_t answer(int place, uintptr_t argument) {
  __atomic_fetch_add(&stub_calls[place], 1, __ATOMIC_RELAXED);
  __atomic_store_n(&stub_arguments[place], (unsigned)argument, __ATOMIC_RELAXED);
  return place == 0 ? TARN_STUB_FIRST : place;
}

#define TARN_NAME(name)                     \
  SHOWN intptr_t name(uintptr_t argument) { \
    return answer(__COUNTER__, argument);   \
  }

#if defined(TARN_STUB_OPENCL)
#include "opencl_names.def"
#elif defined(TARN_STUB_LEVEL_ZERO)
#include "level_zero_names.def"
#else
#include "openmp_names.def"
#endif
