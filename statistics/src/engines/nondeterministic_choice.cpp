// SPDX-License-Identifier: Apache-2.0
// The choice of a source, made once per process.
#include "engines/nondeterministic.hpp"

namespace tarn::statistics::nondeterministic {

const entropy_source* chosen_source() {
  static const entropy_source* const source = choose(sources_of_machine());
  return source;
}

}  // namespace tarn::statistics::nondeterministic
