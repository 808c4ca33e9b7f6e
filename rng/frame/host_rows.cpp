// SPDX-License-Identifier: Apache-2.0
// The routine of every row of distributions.def, for all engines at once.
#include "distributions/all.hpp"
#include "frame/host_road.hpp"

namespace kestrel::tarn::rng::detail {

template <typename Distr>
void run_host_routine(const void* distribution, rvx_stream stream, std::int64_t n, void* r) {
  using T = typename Distr::result_type;
  const auto& distr = *static_cast<const Distr*>(distribution);
  distribution_impl<T, Distr, device_type::cpu>{distr}.generate(stream, n, static_cast<T*>(r));
}

#define TARN_HOST_ROW(...) \
  template void run_host_routine<__VA_ARGS__>(const void*, rvx_stream, std::int64_t, void*);
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) TARN_HOST_ROW type
#include "distributions/distributions.def"

}  // namespace kestrel::tarn::rng::detail
