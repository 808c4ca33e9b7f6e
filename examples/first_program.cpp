// SPDX-License-Identifier: Apache-2.0
// The first program: one million uniform numbers on the processor, and their mean.
#include <cstdio>
#include <numeric>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

int main() {
  namespace rng = kestrel::tarn::rng;
  constexpr std::int64_t n = 1000000;

  sycl::queue queue{sycl::cpu_selector_v};
  rng::philox4x32x10 engine(queue, 42);
  rng::uniform<float> distribution(0.0f, 1.0f);

  float* r = sycl::malloc_shared<float>(n, queue);
  rng::generate(distribution, engine, n, r).wait();
  std::printf("mean of %lld numbers: %.4f\n", static_cast<long long>(n),
              std::accumulate(r, r + n, 0.0) / n);
  sycl::free(r, queue);
}
