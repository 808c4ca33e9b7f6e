// SPDX-License-Identifier: Apache-2.0
// The order in which calls are issued, waited for and timed.
#include "filler.hpp"

#include <chrono>

namespace gpu_bench {
namespace {

// Seconds beyond which a call by itself is far longer than what is uncertain about its time: the
// stamps of events are good to about a microsecond.
constexpr double long_call = 0.005;

double seconds_to_the_end_of_a_call(filler& way) {
  const auto start = std::chrono::steady_clock::now();
  way.draw();
  way.wait();
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

}  // namespace

timing time_calls(filler& way, int calls) {
  way.draw();  // code is loaded and states are made
  way.wait();
  const double wall = seconds_to_the_end_of_a_call(way);
  const int timed = wall > long_call ? 1 : calls;
  // The device works on this call while the others are issued: their launches cost it no pause.
  way.draw();
  way.mark(0);
  for (int i = 0; i < timed; ++i)
    way.draw();
  way.mark(1);
  way.wait();
  return {way.seconds_between_marks() / timed, wall};
}

}  // namespace gpu_bench
