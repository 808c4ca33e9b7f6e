// SPDX-License-Identifier: Apache-2.0
// The peer of ars5, in a source of its own since it is compiled for processors with AES.
#include <Random123/ars.h>

#include "engine_peers.hpp"

namespace peers {

void random123_ars5(std::size_t n, std::uint32_t* out) {
  using generator = r123::ARS4x32_R<5>;
  const generator ars;
  const generator::ukey_type user_key = {{1, 0, 0, 0}};
  const generator::key_type key = user_key;
  for (std::size_t i = 0; i < n; i += 4) {
    const std::uint64_t c = i / 4;
    const generator::ctr_type block = {
        {static_cast<std::uint32_t>(c), static_cast<std::uint32_t>(c >> 32), 0, 0}};
    const generator::ctr_type words = ars(block, key);
    for (std::size_t j = 0; j < 4; ++j)
      out[i + j] = words[j];
  }
}

}  // namespace peers
