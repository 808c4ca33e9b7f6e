// SPDX-License-Identifier: Apache-2.0
// negative_binomial on a device: by a table where the law's mode is below 100, else by rejection.
#pragma once

#include <cstdint>

#include <kestrel/tarn/rng/discrete.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/negbinomial_functors.hpp"

namespace kestrel::tarn::rng::detail {

using negative_binomial_counts = negative_binomial<std::int32_t, negative_binomial_method::nbar>;

template <>
struct distribution_impl_ex<std::int32_t, negative_binomial_counts, device_type::gpu,
                            gpu::negative_binomial_algorithm::nbar> {
  std::int64_t consumed = 0;
  using functor = gpu::functors::negative_binomial<gpu::negative_binomial_algorithm::nbar>;
  functor kernel;
  using post_type = gpu::functors::negative_binomial_post;
  post_type post;
};

template <>
struct distribution_impl_ex<std::int32_t, negative_binomial_counts, device_type::gpu,
                            gpu::negative_binomial_algorithm::icdf> {
  using functor = gpu::functors::negative_binomial<gpu::negative_binomial_algorithm::icdf>;
  functor kernel;
};

namespace gpu {

/// The mode of the law before it is truncated; below 0 for a < 1.
double negative_binomial_mode(double a, double p);

/// The record of a law with a mode of 100 or more. Raises invalid_argument where the law has no
/// such hat, so that no candidate, or no sensible one, would ever be accepted: a - 1 has to be
/// above (1 + p) / (1 - p) by a little, and the numbers must not be so large that doubles lose the
/// steps between counts.
service::_nbar_params nbar_record(double a, double p);

/// Entries of the table of a law with a mode below 100: 128 behind the mode.
std::int32_t negative_binomial_table_size(double a, double p);

/// Sums of the probabilities of the first `size` counts. Not normalised.
void fill_negative_binomial_table(double a, double p, std::int32_t size, double* cdf);

TARN_ACCEPTANCE_REJECTION(extern template, std::int32_t, functors::negative_binomial_post)

template <typename Engine, typename Out>
compound_result generate_negative_binomial(const compound_call<Engine, Out>& call, double a,
                                           double p) {
  const auto to = as_int(call.out);
  if (negative_binomial_mode(a, p) >= 100.0) {
    using algorithm = negative_binomial_algorithm::nbar;
    const call_memory<service::_nbar_params> record(call.queue, 1, call.engine_name);
    record.array[0] = nbar_record(a, p);
    distribution_impl_ex<std::int32_t, negative_binomial_counts, device_type::gpu, algorithm> distr{
        0, {0.0, 1.0, record.array.get(), a - 1, 1 - p}, {}};
    return call.reject(distr, to);
  }
  using algorithm = negative_binomial_algorithm::icdf;
  const std::int32_t size = negative_binomial_table_size(a, p);
  call_memory<double> table(call.queue, static_cast<std::size_t>(size), call.engine_name);
  fill_negative_binomial_table(a, p, size, table.array.get());
  const distribution_impl_ex<std::int32_t, negative_binomial_counts, device_type::gpu, algorithm>
      distr{{0.0, 1.0, table.array.get(), a, p, 1 - p, size}};
  table.last_kernel = call.draw(distr, call.n, to);
  return {table.last_kernel, call.n};
}

template <typename Engine, typename Out, typename IntType, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const negative_binomial<IntType, Method>& distr) {
  return generate_negative_binomial(call, distr.a(), distr.p());
}

}  // namespace gpu
}  // namespace kestrel::tarn::rng::detail
