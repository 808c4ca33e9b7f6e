// SPDX-License-Identifier: Apache-2.0
// How a way of filling device memory is timed: on the device, by calls that stand behind each other
// in a stream that never runs dry, and from the call to the end of the wait, on an idle stream.
#pragma once

namespace gpu_bench {

/// One way of filling the values on the device. Its calls run one after the other.
class filler {
 public:
  virtual ~filler() = default;
  /// Issues one call and need not wait for it.
  virtual void draw() = 0;
  /// Notes the end of what was issued so far as mark 0 or 1.
  virtual void mark(int which) = 0;
  /// Returns when all that was issued has ended.
  virtual void wait() = 0;
  /// Device time from mark 0 to mark 1, after wait().
  virtual double seconds_between_marks() const = 0;
};

struct timing {
  double device;  // seconds of a call on the device
  double wall;    // seconds from a call to the end of the wait for it
};

/// Times one call by the clock and `calls` calls behind each other on the device, or one alone if a
/// call takes longer than a few milliseconds. A first call goes untimed.
timing time_calls(filler& way, int calls);

}  // namespace gpu_bench
