// SPDX-License-Identifier: Apache-2.0
// Group algorithms on every device against serial loops: groups of all sizes around those of warps,
// exact for integers, and for an operation that does not commute. Floating sums are of values
// whose every sum is exact, so that their order does not matter.
#include <cstdint>
#include <numeric>
#include <vector>

#include "every_device.hpp"

namespace {

class device_pass_groups : public on_every_device {
 protected:
  std::vector<std::size_t> sizes() const {
    std::vector<std::size_t> allowed;
    for (const std::size_t size : {1, 2, 31, 32, 33, 64, 100, 255, 256, 257, 1000, 1024}) {
      if (size <= device().get_info<sycl::info::device::max_work_group_size>()) {
        allowed.push_back(size);
      }
    }
    return allowed;
  }
};

// x -> scale * x + shift, one after the other: associative, but not commutative.
struct affine {
  std::uint32_t scale;
  std::uint32_t shift;
  friend bool operator==(const affine& a, const affine& b) {
    return a.scale == b.scale && a.shift == b.shift;
  }
};
struct then {
  SYCL_EXTERNAL affine operator()(const affine& a, const affine& b) const {
    return {a.scale * b.scale, a.shift * b.scale + b.shift};
  }
};

// Values of item or element i.
template <typename T>
SYCL_EXTERNAL T value_at(std::size_t i) {
  return static_cast<T>((i * 7919 + 3) % 101);
}
template <>
SYCL_EXTERNAL affine value_at<affine>(std::size_t i) {
  return {static_cast<std::uint32_t>(2 * i + 3), static_cast<std::uint32_t>(i * i + 1)};
}

enum row : std::size_t { broadcast, reduced, reduced_from, before, through, through_from, rows };

template <typename T, typename Op>
struct group_values {
  T* out;
  T init;

  SYCL_EXTERNAL void operator()(const sycl::nd_item<1>& i) const {
    const auto g = i.get_group();
    const std::size_t items = i.get_local_range(0);
    const std::size_t l = i.get_local_id(0);
    const T x = value_at<T>(i.get_global_id(0));
    T* own = out + i.get_group(0) * rows * items + l;
    own[broadcast * items] = sycl::group_broadcast(g, x, items / 2);
    own[reduced * items] = sycl::reduce_over_group(g, x, Op());
    own[reduced_from * items] = sycl::reduce_over_group(g, x, init, Op());
    own[before * items] = sycl::exclusive_scan_over_group(g, x, init, Op());
    own[through * items] = sycl::inclusive_scan_over_group(g, x, Op());
    own[through_from * items] = sycl::inclusive_scan_over_group(g, x, Op(), init);
  }
};

template <typename T, typename Op>
void check_values(sycl::queue q, std::size_t size, T init) {
  const std::size_t groups = 3;
  const shared_array<T> out(groups * rows * size, q, value_at<T>(12345));
  q.parallel_for(sycl::nd_range<1>(groups * size, size), group_values<T, Op>{out.data(), init})
      .wait_and_throw();
  const Op op;
  for (std::size_t g = 0; g < groups; ++g) {
    const T* got = out.data() + g * rows * size;
    T total = value_at<T>(g * size);
    for (std::size_t l = 1; l < size; ++l) {
      total = op(total, value_at<T>(g * size + l));
    }
    T so_far = init;
    T sum = total;
    for (std::size_t l = 0; l < size; ++l) {
      const T x = value_at<T>(g * size + l);
      sum = l == 0 ? x : T(op(sum, x));
      ASSERT_TRUE(got[broadcast * size + l] == value_at<T>(g * size + size / 2)) << size;
      ASSERT_TRUE(got[reduced * size + l] == total) << size << " " << l;
      ASSERT_TRUE(got[reduced_from * size + l] == T(op(init, total))) << size << " " << l;
      ASSERT_TRUE(got[before * size + l] == so_far) << size << " " << l;
      so_far = op(so_far, x);
      ASSERT_TRUE(got[through * size + l] == sum) << size << " " << l;
      ASSERT_TRUE(got[through_from * size + l] == so_far) << size << " " << l;
    }
  }
}

TEST_P(device_pass_groups, values_of_items) {
  const sycl::queue q(device());
  for (const std::size_t size : sizes()) {
    check_values<std::int64_t, sycl::plus<>>(q, size, 7);
    check_values<std::int32_t, sycl::maximum<>>(q, size, 50);
    check_values<std::uint32_t, sycl::bit_xor<std::uint32_t>>(q, size, 0xF00);
    check_values<std::int16_t, sycl::minimum<std::int16_t>>(q, size, 90);
    check_values<float, sycl::plus<float>>(q, size, 0.5F);
    check_values<double, sycl::maximum<>>(q, size, -1.0);
    check_values<affine, then>(q, size, {5, 6});
  }
}

struct exceeds {
  SYCL_EXTERNAL bool operator()(std::int64_t x) const { return x > limit; }
  std::int64_t limit;
};

enum truth_row : std::size_t { any, all, none, any_one, all_one, sub_any, sub_sum, truth_rows };

struct group_truths {
  std::int64_t* out;
  std::size_t chosen;

  SYCL_EXTERNAL void operator()(const sycl::nd_item<1>& i) const {
    const auto g = i.get_group();
    const auto alone = i.get_sub_group();
    const std::size_t items = i.get_local_range(0);
    const std::size_t l = i.get_local_id(0);
    const auto x = static_cast<std::int64_t>(l);
    std::int64_t* own = out + l;
    own[any * items] = sycl::any_of_group(g, x, exceeds{100000});
    own[all * items] = sycl::all_of_group(g, x, exceeds{-1});
    own[none * items] = sycl::none_of_group(g, x, exceeds{100000});
    own[any_one * items] = sycl::any_of_group(g, l == chosen);
    own[all_one * items] = sycl::all_of_group(g, l != chosen);
    own[sub_any * items] = sycl::any_of_group(alone, l == chosen);
    own[sub_sum * items] = sycl::exclusive_scan_over_group(alone, x, sycl::plus<>()) +
                           sycl::reduce_over_group(alone, x, sycl::plus<>()) +
                           sycl::inclusive_scan_over_group(alone, x, sycl::plus<>()) +
                           sycl::group_broadcast(alone, x);
  }
};

TEST_P(device_pass_groups, truths_of_items) {
  sycl::queue q(device());
  for (const std::size_t size : sizes()) {
    for (const std::size_t chosen : {std::size_t{0}, size / 2, size - 1}) {
      const shared_array<std::int64_t> out(truth_rows * size, q, -7);
      q.parallel_for(sycl::nd_range<1>(size, size), group_truths{out.data(), chosen})
          .wait_and_throw();
      for (std::size_t l = 0; l < size; ++l) {
        const auto x = static_cast<std::int64_t>(l);
        const std::int64_t want[truth_rows] = {0, 1, 1, 1, 0, l == chosen, 3 * x};
        for (std::size_t r = 0; r < truth_rows; ++r) {
          ASSERT_EQ(out[r * size + l], want[r]) << size << " row " << r << " item " << l;
        }
      }
    }
  }
}

// The group works on `length` elements; `scanned` is scanned in place.
template <typename T, typename Op>
struct group_ranges {
  const T* from;
  T* scanned;
  T* through;
  T* results;
  std::size_t length;
  T init;

  SYCL_EXTERNAL void operator()(const sycl::nd_item<1>& i) const {
    const auto g = i.get_group();
    results[i.get_local_id(0)] = sycl::joint_reduce(g, from, from + length, init, Op());
    sycl::joint_inclusive_scan(g, from, from + length, through, Op(), init);
    for (std::size_t k = i.get_local_id(0); k < length; k += i.get_local_range(0)) {
      scanned[k] = from[length - 1 - k];
    }
    sycl::group_barrier(g);
    sycl::joint_exclusive_scan(g, scanned, scanned + length, scanned, init, Op());
  }
};

template <typename T, typename Op>
void check_ranges(sycl::queue q, std::size_t size, std::size_t length, T init) {
  const T poison = value_at<T>(54321);
  const shared_array<T> from(length + 1, q, poison), scanned(length + 1, q, poison),
      through(length + 1, q, poison), results(size, q, poison);
  for (std::size_t i = 0; i < length; ++i) {
    from[i] = value_at<T>(i);
  }
  q.parallel_for(sycl::nd_range<1>(size, size),
                 group_ranges<T, Op>{from.data(), scanned.data(), through.data(), results.data(),
                                     length, init})
      .wait_and_throw();
  const Op op;
  T sum = init;
  T backwards = init;
  for (std::size_t i = 0; i < length; ++i) {
    sum = op(sum, value_at<T>(i));
    ASSERT_TRUE(through[i] == sum) << size << " " << length << " " << i;
    ASSERT_TRUE(scanned[i] == backwards) << size << " " << length << " " << i;
    backwards = op(backwards, value_at<T>(length - 1 - i));
  }
  for (std::size_t l = 0; l < size; ++l) {
    ASSERT_TRUE(results[l] == sum) << size << " " << length;
  }
  EXPECT_TRUE(through[length] == poison && scanned[length] == poison);
}

TEST_P(device_pass_groups, ranges) {
  const sycl::queue q(device());
  for (const std::size_t size : sizes()) {
    for (const std::size_t length :
         {std::size_t{0}, std::size_t{1}, size - 1, size, size + 1, 3 * size + 5}) {
      check_ranges<std::int64_t, sycl::plus<>>(q, size, length, 11);
      check_ranges<float, sycl::maximum<>>(q, size, length, 2.5F);
    }
  }
}

struct range_truths {
  const std::int64_t* from;
  std::size_t length;
  int* out;

  SYCL_EXTERNAL void operator()(const sycl::nd_item<1>& i) const {
    const auto g = i.get_group();
    const auto alone = i.get_sub_group();
    const std::int64_t* end = from + length;
    const auto last = static_cast<std::int64_t>(length) - 1;
    out[i.get_local_id(0)] = (sycl::joint_any_of(g, from, end, exceeds{last - 1}) ? 1 : 0) +
                             (sycl::joint_any_of(g, from, end, exceeds{last}) ? 2 : 0) +
                             (sycl::joint_all_of(g, from, end, exceeds{-1}) ? 4 : 0) +
                             (sycl::joint_all_of(g, from, end, exceeds{0}) ? 8 : 0) +
                             (sycl::joint_none_of(g, from, end, exceeds{last}) ? 16 : 0) +
                             (sycl::joint_any_of(alone, from, end, exceeds{last - 1}) ? 32 : 0);
  }
};

TEST_P(device_pass_groups, truths_of_ranges) {
  sycl::queue q(device());
  for (const std::size_t size : sizes()) {
    for (const std::size_t length : {std::size_t{1}, size, 2 * size + 1}) {
      const shared_array<std::int64_t> from(length, q);
      std::iota(from.begin(), from.end(), 0);
      const shared_array<int> out(size, q, -1);
      q.parallel_for(sycl::nd_range<1>(size, size), range_truths{from.data(), length, out.data()})
          .wait_and_throw();
      EXPECT_EQ(out.values(), std::vector<int>(size, 1 + 4 + 16 + 32)) << size << " " << length;
    }
  }
}

LUMEN_ON_EVERY_DEVICE(device_pass_groups);
LUMEN_REPORTS_CUDA(device_pass_groups)

}  // namespace
