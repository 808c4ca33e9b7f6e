// SPDX-License-Identifier: Apache-2.0
// The order of asynchronous work: chains of USM commands and kernels across queues and devices,
// events, times, and ends in the middle of work.
#include <array>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <thread>

#include "own_memory.hpp"

namespace {

constexpr std::size_t size = 500;

// Rounds make it as long as one likes.
struct step {
  number* a;
  int rounds;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { a[i] = stepped(a[i], rounds); }
};
struct add {
  const number *x, *y;
  number* sum;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { sum[i] = x[i] + y[i]; }
};
struct step_buffer {
  sycl::accessor<number> a;
  SYCL_EXTERNAL void operator()() const { a[0] = stepped(a[0]); }
};
// A node of a graph: counts the nodes before it that are not done.
struct visit {
  std::array<std::size_t, 3> before;
  std::size_t mine;
  int* done;
  int* early;
  SYCL_EXTERNAL void operator()() const {
    for (int k = 0; k < 3; ++k) {
      *early += done[before[static_cast<std::size_t>(k)]] == 0;
    }
    done[mine] = 1;
  }
};

using event_status = sycl::info::event_command_status;
event_status status_of(const sycl::event& e) {
  return e.get_info<sycl::info::event::command_execution_status>();
}

}  // namespace

class device_events : public beside_others {};

TEST_P(device_events, chains_of_copies_and_kernels_cross_queues_and_devices) {
  sycl::queue here(device()), also_here(device()), there(neighbour());
  number* a = sycl::malloc_device<number>(size, here);
  number* b = sycl::malloc_device<number>(size, there);
  std::vector<number> values(size, 5);
  sycl::event last;
  constexpr int rounds = 20;
  for (int round = 0; round < rounds; ++round) {
    last = here.copy(values.data(), a, size, last);
    last = also_here.parallel_for(size, last, step{a, 1});
    last = here.copy(a, values.data(), size, last);
    last = there.copy(values.data(), b, size, last);
    last = there.parallel_for(size, last, step{b, 1});
    last = there.copy(b, values.data(), size, last);
  }
  last.wait();
  EXPECT_EQ(values, std::vector<number>(size, stepped(5, 2 * rounds)));
  sycl::free(a, here);
  sycl::free(b, there);
}

TEST_P(device_events, an_in_order_queue_keeps_all_kinds_of_work_in_order) {
  sycl::queue q = in_order();
  number* a = sycl::malloc_device<number>(size, q);
  const shared_array<number> b(size, q);
  number* shared = b.data();
  q.memset(a, 0, size * sizeof(number));
  for (int round = 0; round < 20; ++round) {
    q.parallel_for(size, step{a, 20});
    q.copy(a, shared, size);
    q.submit([&](sycl::handler& h) { h.host_task([=] { shared[1] += 1; }); });
    q.copy(shared, a, size);
    q.fill(shared, 77U, size);
  }
  q.copy(a, shared, size).wait();
  number x = 0, second = 0;
  for (int round = 0; round < 20; ++round) {
    x = stepped(x, 20);
    second = stepped(second, 20) + 1;
  }
  std::vector<number> expected(size, x);
  expected[1] = second;
  EXPECT_EQ(b.values(), expected);
  sycl::free(a, q);
}

TEST_P(device_events, two_branches_join) {
  sycl::queue q(device()), other(device());
  const shared_array<number> x(size, q, 1), y(size, q, 2), sum(size, q);
  const sycl::event left = q.parallel_for(size, step{x.data(), 300});
  const sycl::event right = other.parallel_for(size, step{y.data(), 100});
  q.parallel_for(size, std::vector<sycl::event>{left, right}, add{x.data(), y.data(), sum.data()})
      .wait();
  EXPECT_EQ(sum.values(), std::vector<number>(size, stepped(1, 300) + stepped(2, 100)));
}

TEST_P(device_events, random_graphs_of_kernels_and_host_tasks_keep_their_edges) {
  std::mt19937 random(20241121);
  sycl::queue queues[] = {sycl::queue(device()), sycl::queue(device()), in_order()};
  constexpr std::size_t count = 300;
  const shared_array<int> done(count, queues[0]);
  const shared_array<int> early(count, queues[0]);  // one a node, as nodes run side by side
  done[0] = 1;
  std::vector<sycl::event> events(1);
  for (std::size_t i = 1; i < count; ++i) {
    const visit node{{random() % i, random() % i, random() % i}, i, done.data(), &early[i]};
    events.push_back(queues[random() % 3].submit([&](sycl::handler& h) {
      for (std::size_t before : node.before) {
        h.depends_on(events[before]);
      }
      if (random() % 3 == 0) {
        h.host_task([=] { node(); });
      } else {
        h.single_task(node);
      }
    }));
  }
  sycl::event::wait(events);
  EXPECT_EQ(done.values(), std::vector<int>(count, 1));
  EXPECT_EQ(early.values(), std::vector<int>(count, 0));
}

TEST_P(device_events, status_and_wait_list_show_what_is_left_to_do) {
  sycl::queue q(device());
  const shared_array<number> a(size, q);
  std::atomic<bool> gate{false};
  sycl::event first = q.submit([&](sycl::handler& h) {
    h.host_task([&] {
      while (!gate) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
      }
    });
  });
  sycl::event second = q.parallel_for(size, first, step{a.data(), 1});
  sycl::event third = q.parallel_for(size, second, step{a.data(), 1});
  EXPECT_EQ(second.get_wait_list(), std::vector<sycl::event>{first});
  EXPECT_EQ(third.get_wait_list(), std::vector<sycl::event>{second});
  EXPECT_EQ(status_of(second), event_status::submitted);
  EXPECT_EQ(status_of(third), event_status::submitted);
  gate = true;
  third.wait();
  for (sycl::event& e : std::array<sycl::event, 3>{first, second, third}) {
    EXPECT_EQ(status_of(e), event_status::complete);
    EXPECT_TRUE(e.get_wait_list().empty());
  }
  EXPECT_EQ(a[0], stepped(0, 2));
}

TEST_P(device_events, status_becomes_complete_without_a_wait) {
  sycl::queue q(device());
  const shared_array<number> a(size, q);
  const sycl::event e = q.parallel_for(size, step{a.data(), 10});
  for (int i = 0; i < 10000 && status_of(e) != event_status::complete; ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  EXPECT_EQ(status_of(e), event_status::complete);
  EXPECT_EQ(a[size - 1], stepped(0, 10));
}

TEST_P(device_events, profiling_times_are_in_the_order_of_the_work) {
  namespace times = sycl::info::event_profiling;
  sycl::queue q(device(), sycl::property::queue::enable_profiling());
  const shared_array<number> a(size, q);
  std::vector<number> out(size);
  std::uint64_t last_end = 1;  // a clock that has not been read shows 0
  const auto check = [&](const sycl::event& e) {
    const std::uint64_t submit = e.get_profiling_info<times::command_submit>();
    const std::uint64_t start = e.get_profiling_info<times::command_start>();
    const std::uint64_t end = e.get_profiling_info<times::command_end>();
    EXPECT_GE(submit, 1U);
    EXPECT_LE(submit, start);
    EXPECT_LE(start, end);
    EXPECT_LE(last_end, start);
    last_end = end;
  };
  std::vector<sycl::event> events;
  events.push_back(q.parallel_for(size, step{a.data(), 1000}));
  events.push_back(q.parallel_for(size, events.back(), step{a.data(), 1000}));
  events.push_back(q.copy(a.data(), out.data(), size, events.back()));
  events.push_back(q.fill(a.data(), 1U, size, events.back()));
  sycl::event::wait(events);
  for (const sycl::event& e : events) {
    check(e);
  }
  // The clocks of a device and of the host are not compared: they are set by each other only.
  last_end = 1;
  sycl::event on_host = q.submit([](sycl::handler& h) { h.host_task([] {}); });
  on_host.wait();
  check(on_host);
  const sycl::event without = sycl::queue(device()).parallel_for(size, step{a.data(), 1});
  EXPECT_EQ(code_of([&] { without.get_profiling_info<times::command_end>(); }),
            sycl::errc::invalid);
  sycl::event(without).wait();
}

TEST_P(device_events, several_threads_may_wait_for_one_event) {
  sycl::queue q(device());
  for (int round = 0; round < 20; ++round) {
    const shared_array<number> a(size, q, 3);
    sycl::event e = q.parallel_for(size, step{a.data(), 200});
    std::array<number, 4> seen{};
    std::vector<std::thread> threads;
    for (number& mine : seen) {
      threads.emplace_back([&a, &mine, e]() mutable {
        e.wait();
        mine = a[size / 2];
      });
    }
    for (std::thread& t : threads) {
      t.join();
    }
    const number expected = stepped(3, 200);
    EXPECT_EQ(seen, (std::array<number, 4>{expected, expected, expected, expected}));
  }
}

TEST_P(device_events, host_tasks_may_submit_kernels_and_wait_for_them) {
  sycl::queue q(device());
  const shared_array<number> a(size, q, 1);
  std::vector<sycl::event> events;
  std::atomic<int> right{0};
  constexpr int tasks = 12;  // more than there are workers
  for (int i = 0; i < tasks; ++i) {
    events.push_back(q.submit([&](sycl::handler& h) {
      h.host_task([&right, q]() mutable {
        const shared_array<number> b(size, q, 1);
        q.parallel_for(size, step{b.data(), 5}).wait();
        right += b[7] == stepped(1, 5);
      });
    }));
  }
  q.parallel_for(size, events, step{a.data(), 1}).wait();
  EXPECT_EQ(right, tasks);
}

TEST_P(device_events, many_threads_submit_to_the_same_queues) {
  sycl::queue here(device()), there(neighbour());
  constexpr int rounds = 100;
  std::array<std::vector<number>, 4> data;
  std::vector<std::thread> threads;
  for (std::vector<number>& mine : data) {
    mine.assign(1, 0);
    threads.emplace_back([&] {
      sycl::buffer<number> b(mine);
      for (int i = 0; i < rounds; ++i) {
        (i % 3 == 0 ? there : here).submit([&](sycl::handler& h) {
          h.single_task(step_buffer{{b, h}});
        });
        if (i % 10 == 9) {
          b.get_host_access()[0] += 1;
        }
      }
    });
  }
  for (std::thread& t : threads) {
    t.join();
  }
  number expected = 0;
  for (int i = 0; i < rounds; ++i) {
    expected = stepped(expected) + (i % 10 == 9 ? 1 : 0);
  }
  for (const std::vector<number>& each : data) {
    EXPECT_EQ(each[0], expected);
  }
}

TEST_P(device_events, work_outlives_its_queue) {
  const sycl::queue keeper(device());
  const shared_array<number> a(size, keeper, 9);
  sycl::event last;
  {
    sycl::queue q(keeper.get_context(), device());
    for (int i = 0; i < 20; ++i) {
      last = q.parallel_for(size, last, step{a.data(), 50});
    }
  }
  last.wait();
  EXPECT_EQ(a.values(), std::vector<number>(size, stepped(9, 1000)));
}

TEST_P(device_events, a_queue_waits_for_all_of_its_work) {
  sycl::queue q(device());
  const shared_array<number> a(40 * size, q, 2);
  for (std::size_t i = 0; i < 40; ++i) {
    q.parallel_for(size, step{a.data() + i * size, 30});
  }
  q.wait();
  EXPECT_EQ(a.values(), std::vector<number>(40 * size, stepped(2, 30)));
}
LUMEN_ON_EVERY_DEVICE(device_events);
LUMEN_REPORTS_CUDA(own_memory_events)

class device_work_at_exit_deathtest : public on_every_device {};

TEST_P(device_work_at_exit_deathtest, is_finished_first) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [this] {
    static sycl::queue q(device());
    static sycl::buffer<number> b{sycl::range<1>(1)};
    b.get_host_access()[0] = 1;
    for (int i = 0; i < 100; ++i) {
      q.submit([&](sycl::handler& h) { h.single_task(step_buffer{{b, h}}); });
    }
    q.submit([&](sycl::handler& h) {
      const sycl::accessor a(b, h, sycl::read_only_host_task);
      h.host_task([a] { std::fprintf(stderr, "the last value is %u", a[0]); });
    });
    std::exit(0);
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(0),
              "the last value is " + std::to_string(stepped(1, 100)));
}

TEST_P(device_work_at_exit_deathtest, is_finished_though_nobody_asks) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [this] {
    static sycl::queue q = in_order();
    static number* const a = sycl::malloc_shared<number>(size, q);
    std::fill_n(a, size, 4U);
    for (int i = 0; i < 50; ++i) {
      q.parallel_for(size, step{a, 100});
    }
    std::exit(0);
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(0), "");
}
LUMEN_ON_EVERY_DEVICE(device_work_at_exit_deathtest);
