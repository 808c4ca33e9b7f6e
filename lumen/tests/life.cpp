// SPDX-License-Identifier: Apache-2.0
// Waiting, ending and dying at awkward moments: all workers blocked, buffers that die inside
// command groups and closures, exits in the middle of work. The program has two worker threads.
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <iterator>
#include <stdexcept>
#include <thread>

#include "every_device.hpp"

// An output iterator that other threads may watch.
struct assign_atomic {
  using iterator_category = std::output_iterator_tag;
  using value_type = void;
  using difference_type = std::ptrdiff_t;
  using pointer = void;
  using reference = void;
  std::atomic<int>* place;
  assign_atomic& operator*() { return *this; }
  assign_atomic& operator++() { return *this; }
  assign_atomic operator++(int) { return *this; }
  assign_atomic& operator=(int value) {
    *place = value;
    return *this;
  }
};

namespace {
void sleep_until(const std::atomic<bool>& flag) {
  while (!flag) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
}

struct store_and_count {
  sycl::accessor<unsigned, 1, sycl::access_mode::write> a;
  unsigned* total;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const {
    a[i] = 3;
    sycl::atomic_ref<unsigned, sycl::memory_order::relaxed, sycl::memory_scope::device,
                     sycl::access::address_space::global_space>(*total) += a[i];
  }
};

struct add_one {
  sycl::accessor<int> a;
  SYCL_EXTERNAL void operator()() const { a[0] += 1; }
};

struct add_group_size {
  int* sums;
  SYCL_EXTERNAL void operator()(sycl::nd_item<1> i) const {
    sums[i.get_global_id(0)] += sycl::reduce_over_group(i.get_group(), 1, sycl::plus<int>());
  }
};
}  // namespace

// The tasks that wait hold all workers when `middle` becomes ready: one of them must run it.
TEST(waiters, run_what_becomes_ready_while_all_workers_wait) {
  sycl::queue q;
  std::atomic<bool> started{false}, gate{false};
  sycl::event first = q.submit([&](sycl::handler& h) {
    h.host_task([&] {
      started = true;
      sleep_until(gate);
    });
  });
  std::thread runner([&] { first.wait(); });
  sleep_until(started);
  std::atomic<int> ran{0};
  const auto after = [&](const sycl::event& before) {
    return q.submit([&](sycl::handler& h) {
      h.depends_on(before);
      h.host_task([&] { ++ran; });
    });
  };
  const sycl::event middle = after(first);
  sycl::event last = after(middle);
  std::vector<sycl::event> waiting;
  for (int i = 0; i < 4; ++i) {
    waiting.push_back(q.submit([&](sycl::handler& h) {
      h.host_task([&ran, last]() mutable {
        last.wait();
        ++ran;
      });
    }));
  }
  std::this_thread::sleep_for(std::chrono::milliseconds(50));
  gate = true;
  runner.join();
  std::this_thread::sleep_for(std::chrono::milliseconds(50));
  sycl::event::wait(waiting);
  EXPECT_EQ(ran, 6);
}

// The second task comes after the first, whose closure holds the last copy of the buffer.
TEST(buffer_life, a_closure_with_the_last_copy_does_not_wait_for_later_users) {
  std::atomic<int> written{0};
  sycl::queue q;
  {
    sycl::buffer<int> b(sycl::range<1>(1));
    b.set_final_data(assign_atomic{&written});
    q.submit([&](sycl::handler& h) {
      sycl::accessor a(b, h, sycl::write_only_host_task);
      h.host_task([a, b] { a[0] = 9; });
    });
    q.submit([&](sycl::handler& h) {
      sycl::accessor a(b, h, sycl::read_write_host_task);
      h.host_task([a] { a[0] += 1; });
    });
  }
  q.wait();
  for (int i = 0; i < 10000 && written == 0; ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  EXPECT_EQ(written, 10);
}

class buffer_lives : public on_every_device {};

TEST_P(buffer_lives, memory_outlives_a_buffer_that_dies_in_its_command_group_function) {
  sycl::queue q(device());
  const shared_array<unsigned> total(1, q);
  for (int i = 0; i < 20; ++i) {
    q.submit([&](sycl::handler& h) {
      sycl::buffer<unsigned> b(sycl::range<1>(1000));
      h.parallel_for(1000, store_and_count{{b, h}, total.data()});
    });
  }
  q.wait();
  EXPECT_EQ(total[0], 60000U);
}

TEST_P(buffer_lives, a_throwing_command_group_leaves_its_buffers_free) {
  sycl::queue q(device());
  sycl::buffer<int> b(sycl::range<1>(1));
  EXPECT_THROW(q.submit([&](sycl::handler& h) {
    sycl::accessor a(b, h, sycl::write_only);
    throw std::runtime_error("no");
  }),
               std::runtime_error);
  b.get_host_access()[0] = 4;
  q.submit([&](sycl::handler& h) { h.single_task(add_one{{b, h}}); });
  EXPECT_EQ(b.get_host_access()[0], 5);
}
LUMEN_ON_EVERY_DEVICE(buffer_lives);
LUMEN_REPORTS_CUDA(life)

TEST(sizes, that_cannot_be_counted_are_refused) {
  constexpr std::size_t most = ~std::size_t{0};
  constexpr std::size_t half = std::size_t{1} << 32;
  EXPECT_EQ(code_of([] { sycl::buffer<int> b(sycl::range<1>(most / 4 + 2)); }),
            sycl::errc::memory_allocation);
  EXPECT_EQ(code_of([] { sycl::buffer<int, 2> b(sycl::range<2>(half, half)); }),
            sycl::errc::memory_allocation);
  EXPECT_EQ(code_of([] { sycl::buffer<int, 3> b(sycl::range<3>(half, half, 0)); }),
            sycl::errc::success);
  sycl::queue q;
  const auto launch = [&q](auto make) {
    return code_of([&] {
      q.submit([&](sycl::handler& h) {
        make(h);
        h.parallel_for(sycl::nd_range<1>(1, 1), nothing());
      });
    });
  };
  EXPECT_EQ(launch([](sycl::handler& h) { sycl::local_accessor<int> a(most / 4 + 2, h); }),
            sycl::errc::memory_allocation);
  EXPECT_EQ(launch([](sycl::handler& h) {
              sycl::local_accessor<int, 2> a(sycl::range<2>(half, half), h);
            }),
            sycl::errc::memory_allocation);
  EXPECT_EQ(launch([](sycl::handler& h) { sycl::local_accessor<char> a(most - 8, h), b(64, h); }),
            sycl::errc::memory_allocation);
}

TEST(sizes, a_reinterpreted_part_begins_at_a_whole_element) {
  sycl::buffer<char> bytes(sycl::range<1>(64));
  sycl::buffer<char> odd(bytes, 3, 8), even(bytes, 4, 8);
  EXPECT_EQ(code_of([&] { odd.reinterpret<int>(); }), sycl::errc::invalid);
  EXPECT_EQ(even.reinterpret<int>().get_range()[0], 2U);
}

TEST(process_exit_deathtest, a_task_may_end_the_process) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [] {
    sycl::queue q;
    q.submit([](sycl::handler& h) { h.host_task([] { std::exit(7); }); }).wait();
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(7), "");
}

class device_exit_deathtest : public on_every_device {};

TEST_P(device_exit_deathtest, group_kernels_still_run_while_the_process_ends) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [this] {
    static sycl::queue q = in_order();
    static int* const sums = sycl::malloc_shared<int>(64, q);
    std::fill_n(sums, 64, 0);
    const add_group_size kernel{sums};
    q.parallel_for(sycl::nd_range<1>(64, 64), kernel).wait();
    for (int i = 0; i < 200; ++i) {
      q.parallel_for(sycl::nd_range<1>(64, 64), kernel);
    }
    q.submit([](sycl::handler& h) {
      h.host_task([] { std::fprintf(stderr, "the last sum is %d", sums[63]); });
    });
    std::exit(0);
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(0), "the last sum is 12864");
}
LUMEN_ON_EVERY_DEVICE(device_exit_deathtest);
