// SPDX-License-Identifier: Apache-2.0
// All names of OpenCL, since it is bound as a whole or not at all. Those that opencl_events.cpp
// does not define are not to be called.
#include <cstdlib>

#define TARN_NAME(name)                                                 \
  extern "C" __attribute__((weak, visibility("default"))) void name() { \
    std::abort();                                                       \
  }
#include "tests/service/binding/opencl_names.def"
