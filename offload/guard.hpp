// SPDX-License-Identifier: Apache-2.0
// No exception crosses the C boundary.
#pragma once

#include <utility>

namespace kestrel::tarn::rng::detail::openmp {

/// To be called while an exception is handled: tells it on standard error.
/// \returns -2
int tell_exception() noexcept;

/// What `body` returns, or -2 if it throws.
template <typename Body>
int guarded(Body&& body) noexcept {
  try {
    return std::forward<Body>(body)();
  } catch (...) {
    return tell_exception();
  }
}

}  // namespace kestrel::tarn::rng::detail::openmp
