// SPDX-License-Identifier: Apache-2.0
// A watch on calls that draw in passes until they have enough: for some parameters hardly anything
// is accepted, and a user should learn why a call does not come back.
#pragma once

#include <cstdint>

namespace kestrel::tarn::rng::detail {

class pass_count {
 public:
  /// Counts a pass. In verbose mode the pass behind number 10000 prints a warning, once a call.
  void next();

 private:
  std::int64_t passes_ = 0;
};

}  // namespace kestrel::tarn::rng::detail
