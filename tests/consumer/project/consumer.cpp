// SPDX-License-Identifier: Apache-2.0
// A user's program: 1000 uniforms on the CPU device. It prints every 100th as exact hexadecimal,
// then the mean; consumer.c must print the same text.
#include <cstdint>
#include <cstdio>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

namespace rng = kestrel::tarn::rng;

int main() {
  constexpr std::int64_t count = 1000;
  sycl::queue queue{sycl::cpu_selector_v};
  float* values = sycl::malloc_shared<float>(count, queue);
  if (!values) {
    return 1;
  }
  rng::philox4x32x10 engine(queue, 42);
  rng::uniform<float> distribution(0.0f, 1.0f);
  sycl::event filled = rng::generate(distribution, engine, count, values);
  filled.wait();

  double sum = 0;
  for (std::int64_t i = 0; i < count; ++i) {
    sum += static_cast<double>(values[i]);
    if (i % 100 == 0) {
      std::printf("%d %a\n", static_cast<int>(i), static_cast<double>(values[i]));
    }
  }
  std::printf("mean %.6f\n", sum / static_cast<double>(count));
  sycl::free(values, queue);
  return 0;
}
