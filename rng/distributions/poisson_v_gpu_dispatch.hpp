// SPDX-License-Identifier: Apache-2.0
// poisson_v on a device: one kernel, which reads the rates where they lie if it can reach them.
#pragma once

#include <algorithm>
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng/discrete.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/poisson_functors.hpp"
#include "frame/checks.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail {

template <typename T, typename Method>
struct distribution_impl<T, poisson_v<T, Method>, device_type::gpu> {
  using functor = gpu::poisson_v_gaussian_icdf_based<T>;

  /// `n` rates that the kernel reaches, until it has run.
  distribution_impl(const double* rates, std::int64_t n)
      : kernel{rates, -1, 1, static_cast<std::uint64_t>(n)} {}

  functor kernel;
};

namespace gpu {

/// Raises invalid_argument unless there are `n` rates. A list of rates in memory of the queue's
/// context is not copied: the call does not wait, and the list has to last until its event. Of any
/// other list the kernel gets a copy, and the call is over on return.
template <typename Engine, typename Out, typename IntType, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const poisson_v<IntType, Method>& distr) {
  using distribution = distribution_impl<IntType, poisson_v<IntType, Method>, device_type::gpu>;
  const std::vector<double>& rates = distr.lambda();
  check_rates(rates.size(), call.n);
  if (sycl::get_pointer_type(rates.data(), call.queue.get_context()) != sycl::usm::alloc::unknown) {
    return {call.draw(distribution(rates.data(), call.n), call.n, call.out), call.n};
  }
  call_memory<double> copy(call.queue, rates.size(), call.engine_name);
  std::copy(rates.begin(), rates.end(), copy.array.get());
  copy.last_kernel = call.draw(distribution(copy.array.get(), call.n), call.n, call.out);
  return {copy.last_kernel, call.n};
}

}  // namespace gpu

}  // namespace kestrel::tarn::rng::detail
