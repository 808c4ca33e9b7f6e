// SPDX-License-Identifier: Apache-2.0
// Sharing a loop among threads.
#pragma once

#include <cstddef>
#include <functional>

namespace tarn::statistics {

// Calls body(first, count) for the pieces of [0, n) that have `piece` numbers each, the last one
// fewer, on at most `threads` threads, and returns when all are done. The body must not throw.
void for_pieces(std::size_t n, std::size_t piece, int threads,
                const std::function<void(std::size_t first, std::size_t count)>& body);

}  // namespace tarn::statistics
