// SPDX-License-Identifier: Apache-2.0
// The first program: a million uniform numbers on the processor, and the first five of them.
#include <cstdio>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

int main() {
  namespace rng = kestrel::tarn::rng;
  sycl::queue queue{sycl::cpu_selector_v};                                    // where to draw
  rng::philox4x32x10 engine(queue, 42);                                       // which words
  float* r = sycl::malloc_shared<float>(1000000, queue);                      // where to
  rng::generate(rng::uniform<float>(0.0f, 1.0f), engine, 1000000, r).wait();  // what to draw
  for (int i = 0; i < 5; ++i)
    std::printf("%.6f\n", r[i]);
  sycl::free(r, queue);
}
