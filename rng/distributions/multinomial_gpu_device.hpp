// SPDX-License-Identifier: Apache-2.0
// The kernel of multinomial: each trial is a uniform that is located among the partial sums of the
// probabilities, by a walk from the first category on. For few trials over many categories that
// beats a draw of each category's count, most of which are 0.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include <sycl/sycl.hpp>

#include "frame/kernel_launch.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// One row for each work-item, which owns its counts. `P` is float or double; `Out` is a pointer to
/// `T` or an accessor that reads and writes.
template <typename T, typename Out, typename P>
struct multinomial_naive_add {
  sycl::accessor<float, 1, sycl::access_mode::read> trials;  // ntrial for each row
  const P* p;
  Out out;
  std::int32_t k;  // categories
  std::int32_t ntrial;

  SYCL_EXTERNAL void operator()(sycl::item<1> item) const {
    const std::size_t row = item.get_id(0);
    const std::size_t counts = row * static_cast<std::size_t>(k);
    for (std::int32_t j = 0; j < k; ++j) {
      out[counts + static_cast<std::size_t>(j)] = 0;
    }
    for (std::int32_t t = 0; t < ntrial; ++t) {
      const std::size_t trial = row * static_cast<std::size_t>(ntrial);
      const std::int32_t category = category_of(trials[trial + static_cast<std::size_t>(t)]);
      if (category < k) {
        out[counts + static_cast<std::size_t>(category)] += 1;
      }
    }
  }

 private:
  /// The category whose stretch (sum before it, sum with it] holds `u`; `k` if none does. That is
  /// so for 0, and for what lies above the last sum, which rounding leaves next to 1. Sums are in
  /// float whatever `P` is, so that both forms count alike. Kept: results depend on it.
  SYCL_EXTERNAL std::int32_t category_of(float u) const {
    float sum = 0;
    std::int32_t j = 0;
    for (; j < k; ++j) {
      const float next = sum + static_cast<float>(p[j]);
      if (sum < u && u <= next) {
        break;
      }
      sum = next;
    }
    return j;
  }
};

/// Launches the kernel on `n` rows, behind `drawn`, which fills `trials`. `Out` is T* or
/// sycl::buffer<T, 1>.
template <typename T, typename Out, typename P>
void submit_multinomial_naive_add(sycl::handler& group, std::int64_t n,
                                  sycl::buffer<float, 1> trials, std::int32_t k,
                                  std::int32_t ntrial, const P* p, Out out,
                                  const sycl::event& drawn) {
  group.depends_on(drawn);
  auto bound = bind_in_place(group, out);
  group.parallel_for(sycl::range<1>(work_items(n, 1)), multinomial_naive_add<T, decltype(bound), P>{
                                                           {trials, group}, p, bound, k, ntrial});
}

/// Raises invalid_argument ("multinomial") for what is too many trials for the categories: a walk
/// for each trial pays off where most counts are 0.
void check_trials(std::int32_t ntrial, std::size_t categories);

/// The probabilities of a call, which they have to outlive, where a kernel can read them.
class category_probabilities {
 public:
  /// Makes a copy in float, unless the device of the queue can use `p` as it is. Raises
  /// device_bad_alloc in the name of `engine`.
  category_probabilities(const sycl::queue& queue, const std::vector<double>& p,
                         const char* engine);

  /// Counts `n` rows of `ntrial` trials, which `drawn` fills. Over on return. `Out` is
  /// std::int32_t* or a buffer of them.
  template <typename Out>
  sycl::event count(sycl::queue& queue, std::int64_t n, const sycl::buffer<float, 1>& trials,
                    std::int32_t ntrial, Out out, const sycl::event& drawn) const;

 private:
  const std::vector<double>& p_;
  std::optional<shared_array<float>> narrowed_;
};

}  // namespace kestrel::tarn::rng::detail::gpu
