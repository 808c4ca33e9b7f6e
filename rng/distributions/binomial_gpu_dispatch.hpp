// SPDX-License-Identifier: Apache-2.0
// binomial on a device: a fill for no trials, a table where the mean is below 30, else BTPE.
#pragma once

#include <cstdint>

#include <kestrel/tarn/rng/discrete.hpp>
#include <sycl/sycl.hpp>

#include "distributions/binomial_functors.hpp"
#include "distributions/compound_call.hpp"
#include "distributions/service_functions.hpp"

namespace kestrel::tarn::rng::detail {

using binomial_counts = binomial<std::int32_t, binomial_method::btpe>;

template <>
struct distribution_impl_ex<std::int32_t, binomial_counts, device_type::gpu,
                            gpu::binomial_algorithm::btpe> {
  std::int64_t consumed = 0;
  using functor = gpu::functors::binomial<gpu::binomial_algorithm::btpe>;
  functor kernel;
  using post_type = gpu::functors::binomial_post;
  post_type post;
};

template <>
struct distribution_impl_ex<std::int32_t, binomial_counts, device_type::gpu,
                            gpu::binomial_algorithm::icdf> {
  using functor = gpu::functors::binomial<gpu::binomial_algorithm::icdf>;
  functor kernel;
};

namespace gpu {

/// Whether the law is drawn as that of the failures.
bool is_binomial_flipped(double p);

/// Mean of the rarer of successes and failures.
double binomial_mean(std::int32_t ntrial, double p);

/// The table of a law whose mean is below 30, so that its 64 entries are enough.
service::_bcdf_params bcdf_record(std::int32_t ntrial, double p);

/// The hat of a law whose mean is 30 or more. For p > 1/2 it is not that of the failures, and the
/// results have another law than the binomial one: see the source.
service::_btpe_params btpe_record(std::int32_t ntrial, double p);

TARN_ACCEPTANCE_REJECTION(extern template, std::int32_t, functors::binomial_post)

template <typename Engine, typename Out>
compound_result generate_binomial(const compound_call<Engine, Out>& call, std::int32_t ntrial,
                                  double p) {
  const auto to = as_int(call.out);
  if (ntrial == 0) {
    return {fill_single_num(call.queue, call.n, to, 0), 0};
  }
  const std::uint8_t flip = is_binomial_flipped(p);
  if (30.0 > binomial_mean(ntrial, p)) {
    using algorithm = binomial_algorithm::icdf;
    call_memory<service::_bcdf_params> record(call.queue, 1, call.engine_name);
    record.array[0] = bcdf_record(ntrial, p);
    const distribution_impl_ex<std::int32_t, binomial_counts, device_type::gpu, algorithm> distr{
        {0.0, 1.0, record.array.get(), flip}};
    record.last_kernel = call.draw(distr, call.n, to);
    return {record.last_kernel, call.n};
  }
  using algorithm = binomial_algorithm::btpe;
  const call_memory<service::_btpe_params> record(call.queue, 1, call.engine_name);
  record.array[0] = btpe_record(ntrial, p);
  distribution_impl_ex<std::int32_t, binomial_counts, device_type::gpu, algorithm> distr{
      0, {0.0, 1.0, record.array.get(), ntrial}, {ntrial, flip}};
  return call.reject(distr, to);
}

template <typename Engine, typename Out, typename IntType, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const binomial<IntType, Method>& distr) {
  return generate_binomial(call, distr.ntrial(), distr.p());
}

}  // namespace gpu
}  // namespace kestrel::tarn::rng::detail
