// SPDX-License-Identifier: Apache-2.0
// gaussian_mv on a device: standard normals straight into the output, as gaussian draws them, then
// a kernel that makes vectors of them in place. Pairs of normals know nothing of the ends of
// vectors.
#pragma once

#include <cstdint>
#include <type_traits>

#include <kestrel/tarn/rng/gaussian_mv.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/gaussian.hpp"
#include "distributions/gaussian_mv_gpu_device.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// The method of gaussian that draws the normals.
template <typename Method>
struct normals_of;
template <>
struct normals_of<gaussian_mv_method::box_muller> {
  using type = gaussian_method::box_muller;
};
template <>
struct normals_of<gaussian_mv_method::box_muller2> {
  using type = gaussian_method::box_muller2;
};
template <>
struct normals_of<gaussian_mv_method::icdf> {
  using type = gaussian_method::icdf;
};

/// Over on return.
template <typename Engine, typename Out, typename T, matrix_layout layout, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const gaussian_mv<T, layout, Method>& distr) {
  using standard = gaussian<T, typename normals_of<Method>::type>;
  using normals = distribution_impl<T, standard, device_type::gpu>;
  // Vectors of no dimensions are none.
  const std::int64_t count = distr.dimension() == 0 ? 0 : values_of(call.n, distr.dimension());
  last_pass last;
  last.event = call.draw(normals(standard(0, 1)), count, call.out);
  if (count != 0) {
    last.event = post_process_gaussian_mv<T>(call.queue, call.n, call.out, distr.mean(),
                                             distr.matrix(), layout, last.event);
  }
  constexpr auto words = static_cast<std::int64_t>(words_per_result<typename normals::functor>);
  return {last.event, words * count};
}

}  // namespace kestrel::tarn::rng::detail::gpu
