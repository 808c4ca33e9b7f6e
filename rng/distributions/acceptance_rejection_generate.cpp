// SPDX-License-Identifier: Apache-2.0
// The steps of a pass between the candidates and the output: flags and their sums within groups,
// the sums of the groups, and both together. Group sums go through local memory and barriers, as
// the scans over groups of the standard are not there in every implementation of it.
#include "distributions/acceptance_rejection_generate.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace {

using count_reader = sycl::accessor<std::int64_t, 1, sycl::access_mode::read>;
using count_writer = sycl::accessor<std::int64_t, 1, sycl::access_mode::write>;
using counts = sycl::accessor<std::int64_t, 1, sycl::access_mode::read_write>;

/// Inclusive sums over a work-group. Each work-item leaves its number, one for each segment adds up
/// a segment, and each adds the segments before its own to the numbers of its own: two barriers,
/// whatever the size of the group, and at most 2 `segment` + size / `segment` additions.
template <typename T>
struct group_sums {
  static constexpr std::size_t segment = 32;

  sycl::local_accessor<T, 1> numbers;
  sycl::local_accessor<T, 1> segments;

  group_sums(sycl::handler& group, std::size_t size)
      : numbers(sycl::range<1>(size), group),
        segments(sycl::range<1>((size + segment - 1) / segment), group) {}

  SYCL_EXTERNAL T inclusive(const sycl::nd_item<1>& item, T number) const {
    const std::size_t l = item.get_local_id(0);
    const std::size_t size = item.get_local_range(0);
    numbers[l] = number;
    sycl::group_barrier(item.get_group());
    if (l * segment < size) {
      segments[l] = sum(l * segment, l * segment + segment < size ? l * segment + segment : size);
    }
    sycl::group_barrier(item.get_group());
    const std::size_t own = l / segment;
    T result = sum(own * segment, l + 1);
    for (std::size_t i = 0; i < own; ++i) {
      result += segments[i];
    }
    return result;
  }

 private:
  SYCL_EXTERNAL T sum(std::size_t first, std::size_t end) const {
    T result = 0;
    for (std::size_t i = first; i < end; ++i) {
      result += numbers[i];
    }
    return result;
  }
};

/// The survivors in each group: each candidate's number among them, and their total.
template <typename T>
struct flag_survivors {
  sycl::accessor<T, 1, sycl::access_mode::read> candidates;
  count_writer positions;
  count_writer totals;
  group_sums<std::int32_t> sums;
  std::size_t count;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::size_t g = item.get_global_id(0);
    const std::int32_t flag = g < count && is_accepted(candidates[g]) ? 1 : 0;
    const std::int32_t number = sums.inclusive(item, flag);
    positions[g] = number;
    if (item.get_local_id(0) + 1 == item.get_local_range(0)) {
      totals[item.get_group(0)] = number;
    }
  }
};

struct add_up_totals {
  counts totals;
  group_sums<std::int64_t> sums;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::size_t g = item.get_global_id(0);
    totals[g] = sums.inclusive(item, totals[g]);
  }
};

struct spread_totals {
  counts positions;
  count_reader totals;

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::size_t group = item.get_group(0);
    if (group > 0) {
      positions[item.get_global_id(0)] += totals[group - 1];
    }
  }
};

std::size_t largest_group(const sycl::queue& queue) {
  return queue.get_device().get_info<sycl::info::device::max_work_group_size>();
}

/// Small calls have a capacity of their own, so that their passes do not hang on the device.
std::int64_t capacity_of(std::int64_t n, std::size_t group_size) {
  constexpr std::int64_t small_call = 10000;
  constexpr std::int64_t small_capacity = 16384;
  const auto size = static_cast<std::int64_t>(group_size);
  return n < small_call ? small_capacity : size * size;
}

}  // namespace

template <typename T>
survivor_search<T>::survivor_search(const sycl::queue& queue, std::int64_t n)
    : survivor_search(largest_group(queue), capacity_of(n, largest_group(queue))) {}

// Where the capacity is no multiple of the group size the last group is filled up.
template <typename T>
survivor_search<T>::survivor_search(std::size_t group_size, std::int64_t capacity)
    : candidate_buffer(sycl::range<1>(static_cast<std::size_t>(capacity))),
      position_buffer(sycl::range<1>((static_cast<std::size_t>(capacity) + group_size - 1) /
                                     group_size * group_size)),
      group_size_(group_size),
      capacity_(capacity),
      groups_(position_buffer.size() / group_size),
      group_total_buffer_(sycl::range<1>(groups_)) {}

template <typename T>
sycl::event survivor_search<T>::number(sycl::queue& queue, std::int64_t count,
                                       const sycl::event& drawn) {
  const sycl::nd_range<1> all(position_buffer.get_range(), sycl::range<1>(group_size_));
  const sycl::event flagged = queue.submit([&](sycl::handler& group) {
    group.depends_on(drawn);
    const flag_survivors<T> kernel{{candidate_buffer, group},
                                   {position_buffer, group},
                                   {group_total_buffer_, group},
                                   {group, group_size_},
                                   static_cast<std::size_t>(count)};
    group.parallel_for(all, kernel);
  });
  const sycl::event added = queue.submit([&](sycl::handler& group) {
    group.depends_on(flagged);
    const add_up_totals kernel{{group_total_buffer_, group}, {group, groups_}};
    group.parallel_for(sycl::nd_range<1>(groups_, groups_), kernel);
  });
  return queue.submit([&](sycl::handler& group) {
    group.depends_on(added);
    const spread_totals kernel{{position_buffer, group}, {group_total_buffer_, group}};
    group.parallel_for(all, kernel);
  });
}

template <typename T>
std::int64_t survivor_search<T>::survivors() {
  const std::size_t last = position_buffer.size() - 1;
  const sycl::host_accessor total(position_buffer, sycl::range<1>(1), sycl::id<1>(last),
                                  sycl::read_only);
  return total[0];
}

template class survivor_search<std::int32_t>;
template class survivor_search<float>;
template class survivor_search<double>;

}  // namespace kestrel::tarn::rng::detail::gpu
