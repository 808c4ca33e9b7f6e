// SPDX-License-Identifier: Apache-2.0
// What the C++ fragments of the manual's pages find in front of them, and how they are run.
// split.awk puts each into a function of its own.
#pragma once

#include <algorithm>
#include <array>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <functional>
#include <iostream>
#include <memory>
#include <numeric>
#include <random>
#include <sstream>
#include <string>
#include <tarn_rvx.h>
#include <thread>
#include <utility>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/bit_generator.hpp>
#include <sycl/sycl.hpp>

namespace rng = kestrel::tarn::rng;

// Ends the program with the page and the line where a condition does not hold.
#define check(...)                                                                              \
  ((__VA_ARGS__)                                                                                \
       ? void()                                                                                 \
       : (std::fprintf(stderr, "%s:%d: does not hold: %s\n", __FILE__, __LINE__, #__VA_ARGS__), \
          std::exit(1)))

struct doc_block {
  int line;  // where it stands on the page
  void (*run)();
};

// Runs the blocks up to the one without a function; a line in front of the output of each says
// whose it is.
inline int run_blocks(const doc_block* block) {
  for (; block->run; ++block) {
    std::printf("== block %d\n", block->line);
    try {
      block->run();
    } catch (const std::exception& error) {
      std::fprintf(stderr, "the block of line %d raised: %s\n", block->line, error.what());
      return 1;
    }
    std::cout.flush();
    std::fflush(stdout);
  }
  return 0;
}
