// SPDX-License-Identifier: Apache-2.0
// hypergeometric on a device: a fill where the parameters leave no choice, a table where the mode
// is below 40, else H2PE.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng/discrete.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/hypergeometric_functors.hpp"
#include "distributions/service_functions.hpp"

namespace kestrel::tarn::rng::detail {

using hypergeometric_counts = hypergeometric<std::int32_t, hypergeometric_method::h2pe>;

template <>
struct distribution_impl_ex<std::int32_t, hypergeometric_counts, device_type::gpu,
                            gpu::hypergeometric_algorithm::h2pe> {
  std::int64_t consumed = 0;
  using functor = gpu::functors::hypergeometric<gpu::hypergeometric_algorithm::h2pe>;
  functor kernel;
  using post_type = gpu::functors::hypergeometric_post;
  post_type post;
};

template <>
struct distribution_impl_ex<std::int32_t, hypergeometric_counts, device_type::gpu,
                            gpu::hypergeometric_algorithm::icdf> {
  using functor = gpu::functors::hypergeometric<gpu::hypergeometric_algorithm::icdf>;
  functor kernel;
};

namespace gpu {

/// The law of y, the count of the rarer kind in the smaller of sample and rest.
struct canonical_hypergeometric {
  std::int32_t lot;
  std::int32_t marked;
  std::int32_t sample;
  std::int32_t n1;    // items of the rarer kind
  std::int32_t n2;    // and of the other
  std::int32_t k;     // items taken
  std::int32_t low;   // least value
  std::int32_t high;  // greatest value
  std::int32_t mode;
};

/// Sample and marked items are at most the lot.
canonical_hypergeometric canonical_form(std::int32_t lot, std::int32_t sample, std::int32_t marked);

/// The result where y has one value. Kept: it is the sample where the sample is the smaller part,
/// although none is marked; results depend on it.
std::int32_t hypergeometric_constant(const canonical_hypergeometric& law);

/// Sums of the probabilities of the values from `low` on, the last of which is 1. For a mode below
/// 40.
std::vector<double> hypergeometric_table(const canonical_hypergeometric& law);

/// The hat of a law with a mode of 40 or more.
service::_h2pe_params h2pe_record(const canonical_hypergeometric& law);

functors::hypergeometric<hypergeometric_algorithm::h2pe> h2pe_functor(
    const canonical_hypergeometric& law, const service::_h2pe_params* params);

TARN_ACCEPTANCE_REJECTION(extern template, std::int32_t, functors::hypergeometric_post)

template <typename Engine, typename Out>
compound_result generate_hypergeometric(const compound_call<Engine, Out>& call,
                                        const canonical_hypergeometric& law) {
  const auto to = as_int(call.out);
  if (law.high == law.low) {
    return {fill_single_num(call.queue, call.n, to, hypergeometric_constant(law)), 0};
  }
  if (law.mode - law.low < 40) {
    using algorithm = hypergeometric_algorithm::icdf;
    const std::vector<double> cdf = hypergeometric_table(law);
    call_memory<double> table(call.queue, cdf.size(), call.engine_name);
    std::copy(cdf.begin(), cdf.end(), table.array.get());
    const distribution_impl_ex<std::int32_t, hypergeometric_counts, device_type::gpu, algorithm>
        distr{{0.0, 1.0, table.array.get(), law.low, law.lot, law.marked, law.sample,
               static_cast<std::int32_t>(cdf.size()), law.n1}};
    table.last_kernel = call.draw(distr, call.n, to);
    return {table.last_kernel, call.n};
  }
  using algorithm = hypergeometric_algorithm::h2pe;
  const call_memory<service::_h2pe_params> record(call.queue, 1, call.engine_name);
  record.array[0] = h2pe_record(law);
  distribution_impl_ex<std::int32_t, hypergeometric_counts, device_type::gpu, algorithm> distr{
      0, h2pe_functor(law, record.array.get()), {law.lot, law.marked, law.sample, law.n1}};
  return call.reject(distr, to);
}

template <typename Engine, typename Out, typename IntType, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const hypergeometric<IntType, Method>& distr) {
  return generate_hypergeometric(call, canonical_form(distr.l(), distr.s(), distr.m()));
}

}  // namespace gpu
}  // namespace kestrel::tarn::rng::detail
