// SPDX-License-Identifier: Apache-2.0
// Work-groups: ids in three dimensions, barriers and local memory, group algorithms against serial
// loops, asynchronous copies.
#include <numeric>

#include "every_device.hpp"

namespace {

struct write_local {
  sycl::local_accessor<char> block;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1>) const { block[0] = 1; }
};

struct visit_with_ids {
  sycl::range<3> global, local;
  int* seen;
  SYCL_EXTERNAL void operator()(sycl::nd_item<3> i) const {
    bool right = i.get_global_range() == global && i.get_local_range() == local &&
                 i.get_group_range() == global / local;
    for (int d = 0; d < 3; ++d) {
      right = right && i.get_global_id(d) == i.get_group(d) * local[d] + i.get_local_id(d);
      right = right && i.get_local_id(d) < local[d];
    }
    const auto g = i.get_global_id();
    const auto l = i.get_local_id();
    right = right && i.get_global_linear_id() == (g[0] * global[1] + g[1]) * global[2] + g[2];
    right = right && i.get_local_linear_id() == (l[0] * local[1] + l[1]) * local[2] + l[2];
    right = right && i.get_group().get_local_id() == l;
    right = right && i.get_group().leader() == (i.get_local_linear_id() == 0);
    right = right && i.get_sub_group().get_local_range()[0] == 1;
    seen[i.get_global_linear_id()] += right ? 1 : 100;
  }
};

struct reverse_groups {
  sycl::local_accessor<int> block;
  int* out;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    const std::size_t l = i.get_local_id(0);
    block[l] = static_cast<int>(i.get_global_id(0));
    i.barrier(sycl::access::fence_space::local_space);
    out[i.get_global_id(0)] = block[i.get_local_range(0) - 1 - l];
  }
};

struct pass_to_the_left {
  sycl::local_accessor<long, 2> block;
  long* out;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    const std::size_t l = i.get_local_id(0);
    block[0][l] = static_cast<long>(l);
    for (int round = 0; round < 5; ++round) {
      sycl::group_barrier(i.get_group());
      block[1][l] = block[0][(l + 1) % i.get_local_range(0)];
      sycl::group_barrier(i.get_group());
      block[0][l] = block[1][l] + 1;
    }
    out[i.get_global_id(0)] = block[0][l];
  }
};

// Two blocks of unlike types, the second of which must not overlap the first.
struct swap_between_blocks {
  sycl::local_accessor<char> bytes;
  sycl::local_accessor<double> reals;
  double* out;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    const std::size_t l = i.get_local_id(0), other = i.get_local_range(0) - 1 - l;
    bytes[l] = static_cast<char>(l % 100);
    reals[l] = 0.5 + static_cast<double>(i.get_global_id(0));
    sycl::group_barrier(i.get_group());
    out[i.get_global_id(0)] = reals[other] + bytes[other];
  }
};

SYCL_EXTERNAL long sample(std::size_t l) {
  return static_cast<long>((l * 7919 + 3) % 101);
}

struct all_algorithms {
  enum { broadcast, reduce, inclusive, exclusive, any, all, none, rows };
  long* out;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    const auto g = i.get_group();
    const std::size_t l = i.get_local_id(0), size = i.get_local_range(0);
    const long x = sample(l);
    out[broadcast * size + l] = sycl::group_broadcast(g, x, size - 1);
    out[reduce * size + l] = sycl::reduce_over_group(g, x, sycl::maximum<long>());
    out[inclusive * size + l] = sycl::inclusive_scan_over_group(g, x, sycl::plus<long>());
    // A smaller type in between must not disturb what other items still read.
    const bool odd = sycl::any_of_group(g, x % 2 == 1);
    out[exclusive * size + l] = sycl::exclusive_scan_over_group(g, x, sycl::plus<>());
    out[any * size + l] = odd;
    out[all * size + l] = sycl::all_of_group(g, x, [](long v) { return v < 100; });
    out[none * size + l] = sycl::none_of_group(g, x > 100);
  }
};

struct joint_algorithms {
  const int* first;
  const int* last;
  int *inclusive, *exclusive, *totals;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    const auto g = i.get_group();
    const auto size = last - first;
    const int* end_a = sycl::joint_inclusive_scan(g, first, last, inclusive, sycl::plus<int>());
    const int* end_b = sycl::joint_exclusive_scan(g, first, last, exclusive, 10, sycl::plus<int>());
    const bool ends = end_a == inclusive + size && end_b == exclusive + size;
    const bool found = sycl::joint_any_of(g, first, last, [](int x) { return x == 0; }) &&
                       sycl::joint_none_of(g, first, last, [](int x) { return x == 1000; }) &&
                       sycl::joint_all_of(g, first, last, [](int x) { return x < 1000; });
    totals[i.get_local_id(0)] =
        ends && found ? sycl::joint_reduce(g, first, last, sycl::plus<int>()) : -1;
  }
};

// Takes every third element, reverses them, and lays them at every second place.
struct copy_in_turn_out {
  sycl::accessor<int, 1, sycl::access_mode::read> source;
  sycl::accessor<int, 1, sycl::access_mode::read_write> target;
  sycl::local_accessor<int> block;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    constexpr auto yes = sycl::access::decorated::yes;
    i.async_work_group_copy(block.get_multi_ptr<yes>(), source.get_multi_ptr<yes>(), 64, 3).wait();
    const std::size_t l = i.get_local_id(0);
    const int left = block[63 - l], right = block[l];
    sycl::group_barrier(i.get_group());
    block[l] = left;
    block[63 - l] = right;
    sycl::group_barrier(i.get_group());
    const auto g = i.get_group();
    g.wait_for(
        g.async_work_group_copy(target.get_multi_ptr<yes>(), block.get_multi_ptr<yes>(), 64, 2));
  }
};

struct read_local {
  sycl::local_accessor<int> block;
  SYCL_EXTERNAL void operator()(sycl::id<1>) const { (void)block; }
};

}  // namespace

class groups : public on_every_device {
 protected:
  // The sizes that this device allows.
  std::vector<std::size_t> sizes() const {
    std::vector<std::size_t> allowed;
    for (std::size_t size : {1, 2, 3, 64, 224, 256, 1024}) {
      if (size <= device().get_info<sycl::info::device::max_work_group_size>()) {
        allowed.push_back(size);
      }
    }
    return allowed;
  }
};

TEST_P(groups, wrong_ranges_are_refused_at_once) {
  sycl::queue q(device());
  const std::size_t most = device().get_info<sycl::info::device::max_work_group_size>();
  const auto launch = [&](auto range) {
    return code_of([&] { q.parallel_for(range, nothing()); });
  };
  EXPECT_EQ(launch(sycl::nd_range<1>(100, 64)), sycl::errc::nd_range);
  EXPECT_EQ(launch(sycl::nd_range<1>(64, 0)), sycl::errc::nd_range);
  EXPECT_EQ(launch(sycl::nd_range<1>(4 * most, 2 * most)), sycl::errc::nd_range);
  EXPECT_EQ(launch(sycl::nd_range<2>({most, 4}, {most, 2})), sycl::errc::nd_range);
  EXPECT_EQ(launch(sycl::nd_range<1>(2 * most, most)), sycl::errc::success);
  q.wait();
}

TEST_P(groups, too_much_local_memory_is_refused_at_once) {
  sycl::queue q(device());
  const std::size_t bytes = device().get_info<sycl::info::device::local_mem_size>();
  const auto launch = [&](std::size_t size) {
    return code_of([&] {
      q.submit([&](sycl::handler& h) {
        h.parallel_for(sycl::nd_range<1>(2, 2), write_local{{size, h}});
      });
    });
  };
  EXPECT_EQ(launch(bytes), sycl::errc::success);
  EXPECT_EQ(launch(bytes + 1), sycl::errc::memory_allocation);
  q.wait_and_throw();
}

TEST_P(groups, ids_of_three_dimensions_agree) {
  sycl::queue q(device());
  const sycl::range<3> global(4, 6, 8), local(2, 3, 4);
  const shared_array<int> visits(global.size(), q);
  q.parallel_for(sycl::nd_range<3>(global, local), visit_with_ids{global, local, visits.data()})
      .wait();
  EXPECT_EQ(visits.values(), std::vector<int>(global.size(), 1));
}

TEST_P(groups, local_memory_is_reversed_across_a_barrier) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    const shared_array<int> data(size * 37, q);
    q.submit([&](sycl::handler& h) {
       h.parallel_for(sycl::nd_range<1>(data.size(), size), reverse_groups{{size, h}, data.data()});
     }).wait();
    for (std::size_t i = 0; i < data.size(); ++i) {
      ASSERT_EQ(static_cast<std::size_t>(data[i]), i / size * size + size - 1 - i % size) << size;
    }
  }
}

TEST_P(groups, loops_with_two_barriers_keep_step) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    const shared_array<long> data(size * 5, q);
    q.submit([&](sycl::handler& h) {
       h.parallel_for(sycl::nd_range<1>(data.size(), size),
                      pass_to_the_left{{sycl::range<2>(2, size), h}, data.data()});
     }).wait();
    for (std::size_t i = 0; i < data.size(); ++i) {
      ASSERT_EQ(data[i], static_cast<long>((i + 5) % size + 5)) << size;
    }
  }
}

TEST_P(groups, blocks_of_local_memory_lie_apart) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    const shared_array<double> data(size * 3, q);
    q.submit([&](sycl::handler& h) {
       h.parallel_for(sycl::nd_range<1>(data.size(), size),
                      swap_between_blocks{{size, h}, {size, h}, data.data()});
     }).wait();
    for (std::size_t i = 0; i < data.size(); ++i) {
      const std::size_t other = size - 1 - i % size;
      const auto expected = static_cast<double>(i / size * size + other + other % 100);
      ASSERT_EQ(data[i], expected + 0.5) << size;
    }
  }
}

TEST_P(groups, algorithms_equal_serial_loops) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    using of = all_algorithms;
    const shared_array<long> data(of::rows * size, q);
    q.parallel_for(sycl::nd_range<1>(size, size), all_algorithms{data.data()}).wait();
    long sum = 0, most = 0;
    bool odd = false, small = true;
    for (std::size_t l = 0; l < size; ++l) {
      most = std::max(most, sample(l));
      odd = odd || sample(l) % 2 == 1;
      small = small && sample(l) < 100;
    }
    for (std::size_t l = 0; l < size; ++l) {
      ASSERT_EQ(data[of::broadcast * size + l], sample(size - 1));
      ASSERT_EQ(data[of::reduce * size + l], most);
      ASSERT_EQ(data[of::exclusive * size + l], sum) << size << ' ' << l;
      sum += sample(l);
      ASSERT_EQ(data[of::inclusive * size + l], sum) << size << ' ' << l;
      ASSERT_EQ(data[of::any * size + l], odd);
      ASSERT_EQ(data[of::all * size + l], small);
      ASSERT_EQ(data[of::none * size + l], 1);
    }
  }
}

TEST_P(groups, joint_algorithms_equal_serial_loops) {
  sycl::queue q(device());
  const shared_array<int> in(777, q), inclusive(777, q), exclusive(777, q), totals(64, q);
  std::iota(in.begin(), in.end(), -300);
  q.parallel_for(sycl::nd_range<1>(64, 64), joint_algorithms{in.begin(), in.end(), inclusive.data(),
                                                             exclusive.data(), totals.data()})
      .wait();
  int sum = 0;
  for (std::size_t i = 0; i < in.size(); ++i) {
    ASSERT_EQ(exclusive[i], sum + 10);
    sum += in[i];
    ASSERT_EQ(inclusive[i], sum);
  }
  EXPECT_EQ(totals.values(), std::vector<int>(64, sum));
}

TEST_P(groups, asynchronous_copies_with_strides) {
  sycl::queue q(device());
  std::vector<int> in(64 * 3), out(64 * 2, -1);
  std::iota(in.begin(), in.end(), 0);
  {
    sycl::buffer<int> from(in.data(), in.size()), to(out.data(), out.size());
    q.submit([&](sycl::handler& h) {
      h.parallel_for(sycl::nd_range<1>(32, 32), copy_in_turn_out{{from, h}, {to, h}, {64, h}});
    });
  }
  for (int i = 0; i < 64; ++i) {
    EXPECT_EQ(out[static_cast<std::size_t>(2 * i)], 3 * (63 - i));
    EXPECT_EQ(out[static_cast<std::size_t>(2 * i + 1)], -1);
  }
}

TEST_P(groups, local_memory_needs_groups) {
  sycl::queue q(device());
  EXPECT_EQ(
      code_of([&] {
        q.submit([](sycl::handler& h) { h.parallel_for(sycl::range<1>(1), read_local{{4, h}}); });
      }),
      sycl::errc::kernel_argument);
}

LUMEN_ON_EVERY_DEVICE(groups);
LUMEN_REPORTS_CUDA(groups)
