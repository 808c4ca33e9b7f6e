// SPDX-License-Identifier: Apache-2.0
// The kernels of chi_square, once for each type and form of output: each work-item makes four
// results.
#include "distributions/chi_square_gpu_device.hpp"

#include "distributions/formulas.hpp"
#include "frame/engine_func.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace {

constexpr std::int32_t per_item = 4;

struct sum_of_squares {
  template <typename T>
  SYCL_EXTERNAL static T of(const T* normals, std::int32_t count) {
    T sum = 0;
    for (std::int32_t j = 0; j < count; ++j) {
      sum = sycl::fma(normals[j], normals[j], sum);
    }
    return sum;
  }
};

/// Finite where the product is 0, by underflow or by a factor.
struct minus_twice_log_of_product {
  template <typename T>
  SYCL_EXTERNAL static T of(const T* uniforms, std::int32_t count) {
    T product = 1;
    for (std::int32_t j = 0; j < count; ++j) {
      product *= uniforms[j];
    }
    return -2 * guarded_log(product);
  }
};

/// Neither reads nor writes past the call's results in the last work-item.
template <typename Fold, typename T, typename Out>
struct chi_square_post_process {
  const T* scratch;
  Out out;
  std::int32_t each;
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::item<1> item) const {
    const std::uint64_t base = item.get_id(0) * std::uint64_t{per_item};
    sycl::vec<T, per_item> results(T(0));
    for (int c = 0; c < per_item; ++c) {
      const std::uint64_t element = base + static_cast<std::uint64_t>(c);
      if (element < n) {
        results[c] = Fold::of(scratch + element * static_cast<std::uint64_t>(each), each);
      }
    }
    store_values(out, base, n, results);
  }
};

template <typename Fold, typename T, typename Out>
sycl::event submit_post_process(sycl::queue& queue, std::int64_t n, std::int32_t each,
                                const T* scratch, Out& out) {
  return queue.submit([&](sycl::handler& group) {
    auto bound = bind_output(group, out);
    using kernel = chi_square_post_process<Fold, T, decltype(bound)>;
    group.parallel_for(sycl::range<1>(work_items(n, per_item)),
                       kernel{scratch, bound, each, static_cast<std::uint64_t>(n)});
  });
}

}  // namespace

template <typename T, typename Out>
sycl::event chi_square_gauss_post_process(sycl::queue& queue, std::int64_t n, std::int32_t each,
                                          const T* scratch, Out out) {
  return submit_post_process<sum_of_squares>(queue, n, each, scratch, out);
}

template <typename T, typename Out>
sycl::event chi_square_ln_post_process(sycl::queue& queue, std::int64_t n, std::int32_t each,
                                       const T* scratch, Out out) {
  return submit_post_process<minus_twice_log_of_product>(queue, n, each, scratch, out);
}

#define TARN_POST_PROCESS(T, ...)                                                              \
  template sycl::event chi_square_gauss_post_process(sycl::queue&, std::int64_t, std::int32_t, \
                                                     const T*, __VA_ARGS__);                   \
  template sycl::event chi_square_ln_post_process(sycl::queue&, std::int64_t, std::int32_t,    \
                                                  const T*, __VA_ARGS__);
TARN_POST_PROCESS(float, float*)
TARN_POST_PROCESS(float, sycl::buffer<float, 1>)
TARN_POST_PROCESS(double, double*)
TARN_POST_PROCESS(double, sycl::buffer<double, 1>)
#undef TARN_POST_PROCESS

}  // namespace kestrel::tarn::rng::detail::gpu
