// SPDX-License-Identifier: Apache-2.0
// Work-groups: ids in three dimensions, barriers and local memory, divergence, group algorithms
// against serial loops, asynchronous copies.
#include <atomic>
#include <numeric>
#include <stdexcept>
#include <string>

#include "every_device.hpp"

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
    return code_of([&] { q.parallel_for(range, [](auto) {}); });
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
        sycl::local_accessor<char> block(size, h);
        h.parallel_for(sycl::nd_range<1>(2, 2), [=](sycl::nd_item<1>) { block[0] = 1; });
      });
    });
  };
  EXPECT_EQ(launch(bytes), sycl::errc::success);
  EXPECT_EQ(launch(bytes + 1), sycl::errc::memory_allocation);
  q.wait();
}

TEST_P(groups, ids_of_three_dimensions_agree) {
  sycl::queue q(device());
  const sycl::range<3> global(4, 6, 8), local(2, 3, 4);
  std::vector<int> visits(global.size());
  int* seen = visits.data();
  q.parallel_for(sycl::nd_range<3>(global, local), [=](sycl::nd_item<3> i) {
     bool right = i.get_global_range() == global && i.get_local_range() == local &&
                  i.get_group_range() == global / local;
     for (int d = 0; d < 3; ++d) {
       right = right && i.get_global_id(d) == i.get_group(d) * local[d] + i.get_local_id(d);
       right = right && i.get_local_id(d) < local[d];
     }
     const auto g = i.get_global_id();
     const auto l = i.get_local_id();
     right = right && i.get_global_linear_id() == (g[0] * 6 + g[1]) * 8 + g[2];
     right = right && i.get_local_linear_id() == (l[0] * 3 + l[1]) * 4 + l[2];
     right = right && i.get_group().get_local_id() == l;
     right = right && i.get_group().leader() == (i.get_local_linear_id() == 0);
     right = right && i.get_sub_group().get_local_range()[0] == 1;
     seen[i.get_global_linear_id()] += right ? 1 : 100;
   }).wait();
  EXPECT_EQ(visits, std::vector<int>(global.size(), 1));
}

TEST_P(groups, local_memory_is_reversed_across_a_barrier) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    const std::size_t count = size * 37;
    std::vector<int> data(count);
    int* out = data.data();
    q.submit([&](sycl::handler& h) {
       sycl::local_accessor<int> block(size, h);
       h.parallel_for(sycl::nd_range<1>(count, size), [=](sycl::nd_item<1> i) {
         const std::size_t l = i.get_local_id(0);
         block[l] = static_cast<int>(i.get_global_id(0));
         i.barrier(sycl::access::fence_space::local_space);
         out[i.get_global_id(0)] = block[size - 1 - l];
       });
     }).wait();
    for (std::size_t i = 0; i < count; ++i) {
      ASSERT_EQ(static_cast<std::size_t>(data[i]), i / size * size + size - 1 - i % size) << size;
    }
  }
}

TEST_P(groups, loops_with_two_barriers_keep_step) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    std::vector<long> data(size * 5);
    long* out = data.data();
    q.submit([&](sycl::handler& h) {
       sycl::local_accessor<long, 2> block(sycl::range<2>(2, size), h);
       h.parallel_for(sycl::nd_range<1>(data.size(), size), [=](sycl::nd_item<1> i) {
         const std::size_t l = i.get_local_id(0);
         block[0][l] = static_cast<long>(l);
         for (int round = 0; round < 5; ++round) {
           sycl::group_barrier(i.get_group());
           block[1][l] = block[0][(l + 1) % size];
           sycl::group_barrier(i.get_group());
           block[0][l] = block[1][l] + 1;
         }
         out[i.get_global_id(0)] = block[0][l];
       });
     }).wait();
    for (std::size_t i = 0; i < data.size(); ++i) {
      ASSERT_EQ(data[i], static_cast<long>((i + 5) % size + 5)) << size;
    }
  }
}

TEST_P(groups, divergent_barriers_are_reported) {
  std::string text;
  sycl::queue q(device(), [&](sycl::exception_list errors) {
    for (const auto& error : errors) {
      try {
        std::rethrow_exception(error);
      } catch (const sycl::exception& known) {
        text = known.what();
      }
    }
  });
  const auto diverges = [&](auto kernel) {
    text.clear();
    q.parallel_for(sycl::nd_range<1>(64, 16), kernel).wait_and_throw();
    return text.find("divergent barrier") != std::string::npos;
  };
  EXPECT_TRUE(diverges([](sycl::nd_item<1> i) {
    if (i.get_local_id(0) == 5) {
      sycl::group_barrier(i.get_group());
    }
  }));
  EXPECT_TRUE(diverges([](sycl::nd_item<1> i) {
    if (i.get_local_id(0) != 15) {
      sycl::group_barrier(i.get_group());
    }
  }));
  EXPECT_TRUE(diverges([](sycl::nd_item<1> i) {
    for (std::size_t k = 0; k <= i.get_local_id(0) / 8; ++k) {
      sycl::group_barrier(i.get_group());
    }
  }));
  EXPECT_FALSE(diverges([](sycl::nd_item<1> i) { sycl::group_barrier(i.get_group()); }));
}

// Counts the objects that are alive, also when a barrier never returns.
struct counted {
  explicit counted(std::atomic<int>& where) : alive(where) { ++alive; }
  ~counted() { --alive; }
  std::atomic<int>& alive;
};

TEST_P(groups, parked_items_are_unwound_when_one_throws) {
  std::atomic<int> alive{0};
  int errors = 0;
  sycl::queue q(device(),
                [&](sycl::exception_list list) { errors += static_cast<int>(list.size()); });
  q.parallel_for(sycl::nd_range<1>(64, 64), [&alive](sycl::nd_item<1> i) {
     const counted object(alive);
     sycl::group_barrier(i.get_group());
     if (i.get_local_id(0) == 20) {
       throw 7;
     }
     sycl::group_barrier(i.get_group());
   }).wait_and_throw();
  EXPECT_EQ(errors, 1);
  EXPECT_EQ(alive, 0);
}

TEST_P(groups, algorithms_equal_serial_loops) {
  sycl::queue q(device());
  for (std::size_t size : sizes()) {
    enum { broadcast, reduce, inclusive, exclusive, any, all, none, rows };
    std::vector<long> data(rows * size);
    long* out = data.data();
    const auto value = [](std::size_t l) { return static_cast<long>((l * 7919 + 3) % 101); };
    q.parallel_for(sycl::nd_range<1>(size, size), [=](sycl::nd_item<1> i) {
       const auto g = i.get_group();
       const std::size_t l = i.get_local_id(0);
       const long x = value(l);
       out[broadcast * size + l] = sycl::group_broadcast(g, x, size - 1);
       out[reduce * size + l] = sycl::reduce_over_group(g, x, sycl::maximum<long>());
       out[inclusive * size + l] = sycl::inclusive_scan_over_group(g, x, sycl::plus<long>());
       // A smaller type in between must not disturb what other items still read.
       const bool odd = sycl::any_of_group(g, x % 2 == 1);
       out[exclusive * size + l] = sycl::exclusive_scan_over_group(g, x, sycl::plus<>());
       out[any * size + l] = odd;
       out[all * size + l] = sycl::all_of_group(g, x, [](long v) { return v < 100; });
       out[none * size + l] = sycl::none_of_group(g, x > 100);
     }).wait();
    long sum = 0, most = 0;
    bool odd = false, small = true;
    for (std::size_t l = 0; l < size; ++l) {
      most = std::max(most, value(l));
      odd = odd || value(l) % 2 == 1;
      small = small && value(l) < 100;
    }
    for (std::size_t l = 0; l < size; ++l) {
      ASSERT_EQ(data[broadcast * size + l], value(size - 1));
      ASSERT_EQ(data[reduce * size + l], most);
      ASSERT_EQ(data[exclusive * size + l], sum) << size << ' ' << l;
      sum += value(l);
      ASSERT_EQ(data[inclusive * size + l], sum) << size << ' ' << l;
      ASSERT_EQ(data[any * size + l], odd);
      ASSERT_EQ(data[all * size + l], small);
      ASSERT_EQ(data[none * size + l], 1);
    }
  }
}

TEST_P(groups, joint_algorithms_equal_serial_loops) {
  sycl::queue q(device());
  std::vector<int> in(777), inclusive(777), exclusive(777), totals(64);
  std::iota(in.begin(), in.end(), -300);
  const int* first = in.data();
  const int* last = first + in.size();
  int *a = inclusive.data(), *b = exclusive.data(), *t = totals.data();
  q.parallel_for(sycl::nd_range<1>(64, 64), [=](sycl::nd_item<1> i) {
     const auto g = i.get_group();
     const int* end_a = sycl::joint_inclusive_scan(g, first, last, a, sycl::plus<int>());
     const int* end_b = sycl::joint_exclusive_scan(g, first, last, b, 10, sycl::plus<int>());
     const bool ends = end_a == a + 777 && end_b == b + 777;
     const bool found = sycl::joint_any_of(g, first, last, [](int x) { return x == 0; }) &&
                        sycl::joint_none_of(g, first, last, [](int x) { return x == 1000; }) &&
                        sycl::joint_all_of(g, first, last, [](int x) { return x < 1000; });
     t[i.get_local_id(0)] =
         ends && found ? sycl::joint_reduce(g, first, last, sycl::plus<int>()) : -1;
   }).wait();
  int sum = 0;
  for (std::size_t i = 0; i < in.size(); ++i) {
    ASSERT_EQ(exclusive[i], sum + 10);
    sum += in[i];
    ASSERT_EQ(inclusive[i], sum);
  }
  EXPECT_EQ(totals, std::vector<int>(64, sum));
}

TEST_P(groups, asynchronous_copies_with_strides) {
  sycl::queue q(device());
  std::vector<int> in(64 * 3), out(64 * 2, -1);
  std::iota(in.begin(), in.end(), 0);
  {
    sycl::buffer<int> from(in.data(), in.size()), to(out.data(), out.size());
    q.submit([&](sycl::handler& h) {
      sycl::accessor source(from, h, sycl::read_only);
      sycl::accessor target(to, h, sycl::read_write);
      sycl::local_accessor<int> block(64, h);
      h.parallel_for(sycl::nd_range<1>(32, 32), [=](sycl::nd_item<1> i) {
        constexpr auto yes = sycl::access::decorated::yes;
        i.async_work_group_copy(block.get_multi_ptr<yes>(), source.get_multi_ptr<yes>(), 64, 3)
            .wait();
        const std::size_t l = i.get_local_id(0);
        const int left = block[63 - l], right = block[l];
        sycl::group_barrier(i.get_group());
        block[l] = left;
        block[63 - l] = right;
        sycl::group_barrier(i.get_group());
        const auto g = i.get_group();
        g.wait_for(g.async_work_group_copy(target.get_multi_ptr<yes>(), block.get_multi_ptr<yes>(),
                                           64, 2));
      });
    });
  }
  for (int i = 0; i < 64; ++i) {
    EXPECT_EQ(out[static_cast<std::size_t>(2 * i)], 3 * (63 - i));
    EXPECT_EQ(out[static_cast<std::size_t>(2 * i + 1)], -1);
  }
}
// The C++ runtime stacks caught exceptions by thread, but items leave in the middle of a handler.
TEST_P(groups, items_may_wait_while_they_handle_an_exception) {
  sycl::queue q(device());
  std::vector<int> right(64);
  int* out = right.data();
  q.parallel_for(sycl::nd_range<1>(64, 64), [=](sycl::nd_item<1> i) {
     const std::string text = "the text of work-item " + std::to_string(i.get_local_id(0));
     try {
       throw std::runtime_error(text);
     } catch (const std::exception& error) {
       sycl::group_barrier(i.get_group());
       const bool mine = text == error.what();
       try {
         throw;
       } catch (const std::exception& again) {
         out[i.get_local_id(0)] = mine && text == again.what();
       }
     }
   }).wait();
  EXPECT_EQ(right, std::vector<int>(64, 1));
}

TEST_P(groups, local_memory_needs_groups) {
  sycl::queue q(device());
  EXPECT_EQ(code_of([&] {
              q.submit([](sycl::handler& h) {
                sycl::local_accessor<int> block(4, h);
                h.parallel_for(sycl::range<1>(1), [=](sycl::id<1>) { (void)block; });
              });
            }),
            sycl::errc::kernel_argument);
}

LUMEN_ON_EVERY_DEVICE(groups);
