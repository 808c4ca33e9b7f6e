// SPDX-License-Identifier: Apache-2.0
// multinomial on a device: which parameters it takes, and the road of those. The method's name is
// that of the host's algorithm; a device draws the trials one by one.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng/continuous.hpp>
#include <kestrel/tarn/rng/discrete.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/multinomial_gpu_device.hpp"
#include "distributions/service_functions.hpp"
#include "distributions/uniform.hpp"
#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace multinomial_algorithm {
/// A trial is one uniform of [0, 1), to be located among the sums of the probabilities.
using icdf = uniform<float, uniform_method::standard>;
}  // namespace multinomial_algorithm

/// Draws the trials of all rows, then counts. Over on return. `Out` is std::int32_t* or a buffer of
/// them.
template <typename Call, typename Out>
compound_result generate_multinomial(const Call& call, std::int32_t ntrial,
                                     const std::vector<double>& p, Out out) {
  using algorithm = multinomial_algorithm::icdf;
  const distribution_impl<float, algorithm, device_type::gpu> trial(algorithm(0, 1));
  const category_probabilities probabilities(call.queue, p, call.engine_name);
  const std::int64_t count = values_of(call.n, ntrial);
  // For no trials there is room for one, as some runtimes have no buffers of no elements.
  sycl::buffer<float, 1> trials{
      sycl::range<1>(static_cast<std::size_t>(std::max<std::int64_t>(count, 1)))};
  const sycl::event drawn = call.draw(trial, count, trials);
  return {probabilities.count(call.queue, call.n, trials, ntrial, out, drawn), count};
}

/// Raises invalid_argument for parameters that a device does not take. No trials fill the first `n`
/// elements alone and leave the rest of the rows as they are. Kept: results depend on it.
template <typename Engine, typename Out, typename IntType, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const multinomial<IntType, Method>& distr) {
  const std::int32_t ntrial = distr.ntrial();
  const std::vector<double>& p = distr.p();
  if (ntrial == 0) {
    return {fill_single_num(call.queue, call.n, as_int(call.out), 0), 0};
  }
  if (p.size() == 1 && ntrial > 0) {
    return {fill_single_num(call.queue, call.n, as_int(call.out), ntrial), 0};
  }
  check_trials(ntrial, p.size());
  return generate_multinomial(call, ntrial, p, as_int(call.out));
}

}  // namespace kestrel::tarn::rng::detail::gpu
