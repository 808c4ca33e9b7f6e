// SPDX-License-Identifier: Apache-2.0
// The helper program of the suite that looks at the end of a process from outside: makes one call
// that is not waited for and ends in the way that its argument names. The completion function says
// what it finds.
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <tarn_rvx.h>
#include <tarn_rvx_offload.h>
#include <unistd.h>
#include <vector>

#include <sycl/sycl.hpp>

#include <sys/wait.h>

#include "gpu_interop.hpp"

namespace {

using tarn_test::gpu_interop;

// Enough that the process would end first if nobody waited.
constexpr std::int64_t n = 3'000'000;

// What the completion function looks at lives as long as the process.
std::uint32_t* values = nullptr;
std::vector<std::uint32_t>& expected() {
  static auto* const words = new std::vector<std::uint32_t>(n);
  return *words;
}
bool ends_the_process = false;

void say(const char* text) {
  if (::write(STDOUT_FILENO, text, std::strlen(text)) < 0) {
    std::_Exit(99);
  }
}

void completed(void*) {
  const bool right = std::memcmp(values, expected().data(), n * sizeof *values) == 0;
  say(right ? "told, the results are there\n" : "told, other results\n");
  if (ends_the_process) {
    std::exit(0);
  }
}

struct told_at_the_end {
  ~told_at_the_end() { say("a static object ends\n"); }
};

/// The call; 0 is its good status.
int call(gpu_interop& interop) {
  rvx_stream stream = nullptr;
  rvx_stream serial = nullptr;
  values = sycl::malloc_shared<std::uint32_t>(n, tarn_test::common_queue());
  std::memset(values, 0xA5, n * sizeof *values);
  int status = rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 5);
  status |= rvxCopyStream(&serial, stream);
  status |= rvxiRngUniformBits(0, serial, n, expected().data());
  interop.set_nowait(true);
  interop.set_completion(completed);
  status |= tarn_rvx_viRngUniformBits_omp_offload_ilp64(0, stream, n, values, interop.handle());
  status |= rvxDeleteStream(&stream);
  status |= rvxDeleteStream(&serial);
  return status;
}

/// The child has none of its parent's threads, and ends nevertheless; so does the parent.
int fork_after() {
  const pid_t child = ::fork();
  if (child == 0) {
    std::exit(0);
  }
  int status = -1;
  ::waitpid(child, &status, 0);
  say(WIFEXITED(status) && WEXITSTATUS(status) == 0 ? "the child has ended\n" : "no good end\n");
  return 0;
}

}  // namespace

int main(int count, char** arguments) {
  const std::string way = count > 1 ? arguments[1] : "";
  static auto* const interop = new gpu_interop(tarn_test::common_queue());
  static const told_at_the_end last;
  ends_the_process = way == "exit_when_told";
  const int status = call(*interop);
  if (status != 0) {
    return status;
  }
  if (way == "exit") {
    std::exit(0);
  }
  if (ends_the_process) {
    for (;;) {
      ::pause();
    }
  }
  return way == "fork" ? fork_after() : 0;
}
