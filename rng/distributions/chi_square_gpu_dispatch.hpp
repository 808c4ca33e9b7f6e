// SPDX-License-Identifier: Apache-2.0
// chi_square on a device, by the degrees of freedom: for 1 and 3 sums of squares of normals, for
// even ones up to 16 products of uniforms, for others twice a gamma number.
#pragma once

#include <cstddef>
#include <cstdint>

#include <kestrel/tarn/rng/continuous.hpp>
#include <sycl/sycl.hpp>

#include "distributions/chi_square_gpu_device.hpp"
#include "distributions/compound_call.hpp"
#include "distributions/gamma_gpu_dispatch.hpp"
#include "distributions/gaussian.hpp"
#include "distributions/uniform.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// `each` variates of `distribution`, which take a word each, for every result, then the kernel
/// that makes the results of them. Over on return.
template <typename T, typename Engine, typename Out, typename Distribution>
compound_result chi_square_by_folding(const compound_call<Engine, Out>& call, std::int32_t each,
                                      const Distribution& distribution,
                                      sycl::event (*post_process)(sycl::queue&, std::int64_t,
                                                                  std::int32_t, const T*, Out)) {
  const std::int64_t count = values_of(call.n, each);
  call_memory<T, sycl::usm::alloc::device> scratch(call.queue, static_cast<std::size_t>(count),
                                                   call.engine_name);
  scratch.last_kernel = call.draw(distribution, count, scratch.array.get());
  scratch.last_kernel.wait_and_throw();
  scratch.last_kernel = post_process(call.queue, call.n, each, scratch.array.get(), call.out);
  scratch.last_kernel.wait_and_throw();
  return {scratch.last_kernel, count};
}

template <typename Engine, typename Out, typename T, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const chi_square<T, Method>& distr) {
  const std::int32_t df = distr.n();
  if (df == 1 || df == 3) {
    using normal = gaussian<T, gaussian_method::icdf>;
    const distribution_impl<T, normal, device_type::gpu> normals(normal(0, 1));
    return chi_square_by_folding<T>(call, df, normals, &chi_square_gauss_post_process<T, Out>);
  }
  if (df % 2 == 0 && df <= 16) {
    using standard = uniform<T, uniform_method::standard>;
    const distribution_impl<T, standard, device_type::gpu> uniforms(standard(0, 1));
    return chi_square_by_folding<T>(call, df / 2, uniforms, &chi_square_ln_post_process<T, Out>);
  }
  const T half = static_cast<T>(0.5);
  return generate_compound(
      call, gamma<T, gamma_method::marsaglia>(static_cast<T>(df) * half, T(0), T(2)));
}

}  // namespace kestrel::tarn::rng::detail::gpu
