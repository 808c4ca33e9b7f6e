// SPDX-License-Identifier: Apache-2.0
// The header serves C programs, and its macros do not leak.
#include <cstddef>

#include <gtest/gtest.h>

#include "tarn_serv.h"

#if defined(TARN_SERV_PRINTF)
#error "a macro of the header's own is left defined"
#endif

extern "C" int core_used_from_c(void);

namespace {

TEST(CoreHeader, AllServicesAreReachableFromC) {
  EXPECT_EQ(core_used_from_c(), 0);
}

}  // namespace
