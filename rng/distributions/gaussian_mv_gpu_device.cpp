// SPDX-License-Identifier: Apache-2.0
// What the device road of gaussian_mv does without an engine.
#include "distributions/gaussian_mv_gpu_device.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace {

/// The host's values as a kernel reads them. They are const, so nothing is written back.
template <typename T>
sycl::buffer<T, 1> wrapped(const std::vector<T>& values) {
  return {values.data(), sycl::range<1>(values.size())};
}

}  // namespace

template <typename T, typename Out>
sycl::event post_process_gaussian_mv(sycl::queue& queue, std::int64_t n, Out out,
                                     const std::vector<T>& mean, const std::vector<T>& matrix,
                                     matrix_layout layout, const sycl::event& drawn) {
  const auto dimension = static_cast<std::uint32_t>(mean.size());
  const sycl::buffer<T, 1> mean_buffer = wrapped(mean);
  const sycl::buffer<T, 1> matrix_buffer = wrapped(matrix);
  sycl::event transformed = queue.submit([&](sycl::handler& group) {
    submit_post_process_gaussian_mv(group, out, mean_buffer, n, layout, matrix_buffer, dimension,
                                    drawn);
  });
  transformed.wait_and_throw();
  return transformed;
}

#define TARN_POST_PROCESS(T, ...)                                                             \
  template sycl::event post_process_gaussian_mv(sycl::queue&, std::int64_t, __VA_ARGS__,      \
                                                const std::vector<T>&, const std::vector<T>&, \
                                                matrix_layout, const sycl::event&);
TARN_POST_PROCESS(float, float*)
TARN_POST_PROCESS(float, sycl::buffer<float, 1>)
TARN_POST_PROCESS(double, double*)
TARN_POST_PROCESS(double, sycl::buffer<double, 1>)
#undef TARN_POST_PROCESS

}  // namespace kestrel::tarn::rng::detail::gpu
