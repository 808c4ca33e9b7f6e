// SPDX-License-Identifier: Apache-2.0
// What the device road of multinomial does without an engine.
#include "distributions/multinomial_gpu_device.hpp"

#include <limits>

#include <kestrel/tarn/exceptions.hpp>

namespace kestrel::tarn::rng::detail::gpu {

void check_trials(std::int32_t ntrial, std::size_t categories) {
  constexpr std::int32_t most_trials = 16;
  constexpr std::size_t categories_per_trial = 16;
  constexpr std::size_t most_categories = std::numeric_limits<std::int32_t>::max();
  if (ntrial < 0 || ntrial > most_trials ||
      categories < categories_per_trial * static_cast<std::size_t>(ntrial) ||
      categories > most_categories) {
    throw invalid_argument("rng", "multinomial", "these parameters are not supported on GPU");
  }
}

category_probabilities::category_probabilities(const sycl::queue& queue,
                                               const std::vector<double>& p, const char* engine)
    : p_(p) {
  if (sycl::get_pointer_type(p.data(), queue.get_context()) == sycl::usm::alloc::unknown) {
    narrowed_.emplace(queue, p.size(), engine);
    for (std::size_t j = 0; j < p.size(); ++j) {
      (*narrowed_)[j] = static_cast<float>(p[j]);
    }
  }
}

template <typename Out>
sycl::event category_probabilities::count(sycl::queue& queue, std::int64_t n,
                                          const sycl::buffer<float, 1>& trials, std::int32_t ntrial,
                                          Out out, const sycl::event& drawn) const {
  const auto k = static_cast<std::int32_t>(p_.size());
  sycl::event counted = queue.submit([&](sycl::handler& group) {
    if (narrowed_) {
      submit_multinomial_naive_add<std::int32_t>(
          group, n, trials, k, ntrial, static_cast<const float*>(narrowed_->get()), out, drawn);
    } else {
      submit_multinomial_naive_add<std::int32_t>(group, n, trials, k, ntrial, p_.data(), out,
                                                 drawn);
    }
  });
  counted.wait_and_throw();
  return counted;
}

template sycl::event category_probabilities::count(sycl::queue&, std::int64_t,
                                                   const sycl::buffer<float, 1>&, std::int32_t,
                                                   std::int32_t*, const sycl::event&) const;
template sycl::event category_probabilities::count(sycl::queue&, std::int64_t,
                                                   const sycl::buffer<float, 1>&, std::int32_t,
                                                   sycl::buffer<std::int32_t, 1>,
                                                   const sycl::event&) const;

}  // namespace kestrel::tarn::rng::detail::gpu
