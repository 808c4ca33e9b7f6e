// SPDX-License-Identifier: Apache-2.0
// The helper program of the suite that looks at late calls from outside: it makes one call that is
// not waited for, and one from the destructor of a static object, when the process has done its
// waiting. The completion function says what it finds, in the words of verbose mode's own stream.
#include <cstdio>
#include <cstring>
#include <tarn_rvx.h>
#include <tarn_rvx_offload.h>
#include <vector>

#include <sycl/sycl.hpp>

#include "gpu_interop.hpp"

namespace {

using tarn_test::gpu_interop;

constexpr std::int64_t n = 100'000;

struct one_call {
  std::uint32_t* values = sycl::malloc_shared<std::uint32_t>(n, tarn_test::common_queue());
  std::vector<std::uint32_t> expected = std::vector<std::uint32_t>(n);
  rvx_stream stream = nullptr;  // never deleted: lines about streams are those of the library
};
one_call* current = nullptr;
bool was_told = false;

void say(const char* text) {
  std::fputs(text, stdout);
  std::fflush(stdout);
}

void completed(void*) {
  was_told = true;
  const bool right = std::memcmp(current->values, current->expected.data(), n * 4) == 0;
  say(right ? "told, the results are there\n" : "told, other results\n");
}

int call(gpu_interop& interop) {
  current = new one_call;
  std::memset(current->values, 0xA5, n * 4);
  rvx_stream serial = nullptr;
  int status = rvxNewStream(&current->stream, RVX_BRNG_PHILOX4X32X10, 5);
  status |= rvxCopyStream(&serial, current->stream);
  status |= rvxiRngUniformBits(0, serial, n, current->expected.data());
  return status | tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, current->stream, n,
                                                              current->values, interop.handle());
}

/// Its end comes after that of the wait, which is registered later.
struct late_caller {
  gpu_interop* interop;
  ~late_caller() {
    say("a static object ends\n");
    was_told = false;
    const int status = call(*interop);
    say(status == 0 ? "the late call is served\n" : "the late call is refused\n");
    say(was_told ? "and was told of before it returned\n" : "and was not told of\n");
  }
};

}  // namespace

int main() {
  static auto* const interop = new gpu_interop(tarn_test::common_queue());
  // One that is waited for: all that a call needs is there before the object below.
  if (call(*interop) != 0) {
    return 1;
  }
  static const late_caller last{interop};
  interop->set_nowait(true);
  interop->set_completion(completed);
  return call(*interop);
}
