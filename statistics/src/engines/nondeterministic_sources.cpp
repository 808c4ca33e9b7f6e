// SPDX-License-Identifier: Apache-2.0
// The sources of this machine: the operating system's generator (getrandom) first, the processor's
// (RDRAND) where the system refuses.
//
// Both are cryptographic generators that the hardware reseeds. The system's one comes first: it
// mixes RDRAND with its other sources, so that no single one has to be trusted, and it is the
// faster one. Measured on an AMD EPYC (Zen 5), Linux 6.18, one thread, per word: in blocks of 1024
// 8.9 ns against 15.9 ns, in long calls 7.5 against 15.7; only calls below 50 words are quicker
// with RDRAND.
#include <cerrno>

#include <sys/random.h>

#if defined(__x86_64__)
#include <cpuid.h>
#endif

#include "engines/nondeterministic.hpp"

namespace tarn::statistics::nondeterministic {

namespace {

// Without waiting: the system's generator blocks while it is not seeded, soon after start-up.
bool system_present() {
  unsigned char byte;
  return getrandom(&byte, sizeof byte, GRND_NONBLOCK) == 1;
}

bool system_draw(std::uint32_t* out, std::size_t n) {
  auto* to = reinterpret_cast<unsigned char*>(out);
  std::size_t left = n * sizeof *out;
  while (left != 0) {
    // Long requests are cut by the system, and by signals.
    const ssize_t got = getrandom(to, left, 0);
    if (got > 0) {
      to += got;
      left -= static_cast<std::size_t>(got);
    } else if (got == 0 || errno != EINTR) {
      return false;
    }
  }
  return true;
}

#if defined(__x86_64__)

bool processor_present() {
  unsigned eax, ebx, ecx, edx;
  return __get_cpuid(1, &eax, &ebx, &ecx, &edx) != 0 && (ecx & bit_RDRND) != 0;
}

__attribute__((target("rdrnd"))) bool rdrand(std::uint64_t& number) {
  unsigned long long drawn;
  const bool given = __builtin_ia32_rdrand64_step(&drawn) != 0;
  number = drawn;
  return given;
}

bool processor_draw(std::uint32_t* out, std::size_t n) {
  return draw_numbers(rdrand, out, n);
}

#else

bool processor_present() {
  return false;
}
bool processor_draw(std::uint32_t*, std::size_t) {
  return false;
}

#endif

constexpr entropy_source sources[] = {{system_present, system_draw},
                                      {processor_present, processor_draw}};

}  // namespace

span<entropy_source> sources_of_machine() {
  return {sources, sizeof sources / sizeof *sources};
}

}  // namespace tarn::statistics::nondeterministic
