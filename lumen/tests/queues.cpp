// SPDX-License-Identifier: Apache-2.0
// Queues, events and the scheduler: order, dependencies, who runs a task, errors, times.
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <stdexcept>
#include <thread>

#include "every_device.hpp"

namespace {
// Sleeps until a flag is set or ten seconds are over; true when it was set.
bool becomes_true(const std::atomic<bool>& flag) {
  for (int i = 0; i < 10000 && !flag; ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
  }
  return flag;
}

struct triple_plus_one {
  int* value;
  SYCL_EXTERNAL void operator()() const { *value = *value * 3 + 1; }
};

using unsigned_reader = sycl::accessor<unsigned, 1, sycl::access_mode::read>;
struct combine {
  unsigned_reader x, y;
  sycl::accessor<unsigned> z;
  unsigned factor;
  SYCL_EXTERNAL void operator()() const { z[0] = z[0] * 31 + x[0] * factor + y[0]; }
};
}  // namespace

TEST(waiter, runs_a_ready_task_on_its_own_thread) {
  sycl::queue q;
  int by_waiter = 0;
  constexpr int rounds = 200;
  for (int i = 0; i < rounds; ++i) {
    std::thread::id runner;
    q.submit([&](sycl::handler& h) {
       h.host_task([&] { runner = std::this_thread::get_id(); });
     }).wait();
    by_waiter += runner == std::this_thread::get_id();
  }
  // A worker may win where this thread is stopped for a nap's length between the two calls.
  EXPECT_GT(by_waiter, rounds / 2);
}

TEST(waiter, also_runs_what_its_task_depends_on) {
  sycl::queue q;
  std::atomic<int> step{0};
  int seen[3] = {};
  sycl::event last;
  for (int i = 0; i < 3; ++i) {
    last = q.submit([&, i](sycl::handler& h) {
      h.depends_on(last);
      h.host_task([&, i] { seen[i] = ++step; });
    });
  }
  last.wait();
  EXPECT_EQ(seen[0], 1);
  EXPECT_EQ(seen[1], 2);
  EXPECT_EQ(seen[2], 3);
}

TEST(scheduler, a_task_nobody_waits_for_still_runs) {
  std::atomic<bool> ran{false};
  {
    sycl::queue q;
    q.submit([&](sycl::handler& h) { h.host_task([&] { ran = true; }); });
  }
  EXPECT_TRUE(becomes_true(ran));
  // Once more after the workers went to deep sleep.
  std::this_thread::sleep_for(std::chrono::milliseconds(100));
  std::atomic<bool> again{false};
  sycl::queue().submit([&](sycl::handler& h) { h.host_task([&] { again = true; }); });
  EXPECT_TRUE(becomes_true(again));
}

TEST(scheduler, a_waiter_does_not_run_unrelated_tasks) {
  sycl::queue q;
  std::atomic<bool> gate{false};
  sycl::event closed =
      q.submit([&](sycl::handler& h) { h.host_task([&] { EXPECT_TRUE(becomes_true(gate)); }); });
  sycl::event free = q.submit([](sycl::handler& h) { h.host_task([] {}); });
  free.wait();
  gate = true;
  closed.wait();
}

TEST(scheduler, two_hundred_tasks_in_flight_all_run) {
  sycl::queue q;
  std::atomic<int> count{0};
  std::vector<sycl::event> events;
  for (int i = 0; i < 200; ++i) {
    events.push_back(q.submit([&](sycl::handler& h) { h.host_task([&] { ++count; }); }));
  }
  sycl::event::wait(events);
  EXPECT_EQ(count, 200);
}

TEST(scheduler, many_threads_submit_and_wait) {
  sycl::queue q;
  std::atomic<int> count{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&] {
      for (int i = 0; i < 500; ++i) {
        sycl::event e = q.submit([&](sycl::handler& h) { h.host_task([&] { ++count; }); });
        if (i % 3 == 0) {
          e.wait();
        }
      }
    });
  }
  for (std::thread& t : threads) {
    t.join();
  }
  q.wait();
  EXPECT_EQ(count, 2000);
}

TEST(scheduler, host_tasks_may_submit_and_wait) {
  sycl::queue q;
  int value = 0;
  q.submit([&](sycl::handler& h) {
     h.host_task([&] {
       q.submit([&](sycl::handler& inner) { inner.host_task([&] { value = 5; }); }).wait();
       ++value;
     });
   }).wait();
  EXPECT_EQ(value, 6);
}

class queue_order : public on_every_device {};
TEST_P(queue_order, in_order_tasks_follow_each_other) {
  sycl::queue q = in_order();
  EXPECT_TRUE(q.is_in_order());
  EXPECT_TRUE(q.has_property<sycl::property::queue::in_order>());
  const shared_array<int> value(1, q, 1);
  int* place = value.data();
  for (int i = 0; i < 50; ++i) {
    q.single_task(triple_plus_one{place});
    q.submit([&](sycl::handler& h) { h.host_task([=] { *place %= 1000003; }); });
  }
  q.wait();
  int expected = 1;
  for (int i = 0; i < 50; ++i) {
    expected = (expected * 3 + 1) % 1000003;
  }
  EXPECT_EQ(value[0], expected);
}

// Tasks over a few cells, each with events it waits for or buffers it shares, against the same
// operations done one by one.
TEST_P(queue_order, random_graphs_give_the_serial_result) {
  std::mt19937 random(20240607);
  for (int round = 0; round < 30; ++round) {
    sycl::queue q(device());
    constexpr std::size_t cells = 5;
    std::vector<sycl::buffer<unsigned>> buffers;
    std::vector<unsigned> serial(cells, 1);
    for (std::size_t i = 0; i < cells; ++i) {
      buffers.emplace_back(sycl::range<1>(1));
      buffers[i].get_host_access()[0] = 1;
    }
    for (int step = 0; step < 40; ++step) {
      const std::size_t to = random() % cells, a = random() % cells, b = random() % cells;
      const unsigned factor = static_cast<unsigned>(random() % 7);
      serial[to] = serial[to] * 31 + serial[a] * factor + serial[b];
      q.submit([&](sycl::handler& h) {
        h.single_task(combine{{buffers[a], h}, {buffers[b], h}, {buffers[to], h}, factor});
      });
    }
    for (std::size_t i = 0; i < cells; ++i) {
      EXPECT_EQ(buffers[i].get_host_access(sycl::read_only)[0], serial[i]) << round;
    }
  }
}

TEST_P(queue_order, random_event_graphs_run_after_their_dependencies) {
  std::mt19937 random(7);
  sycl::queue q(device());
  constexpr std::size_t count = 300;
  std::vector<std::atomic<bool>> done(count);
  std::vector<sycl::event> events;
  std::atomic<int> early{0};
  for (std::size_t i = 0; i < count; ++i) {
    std::vector<std::size_t> before;
    std::vector<sycl::event> after;
    for (std::size_t k = 0; k < 3 && i > 0; ++k) {
      before.push_back(random() % i);
      after.push_back(events[before.back()]);
    }
    events.push_back(q.submit([&](sycl::handler& h) {
      h.depends_on(after);
      h.host_task([&done, &early, before, i] {
        for (std::size_t b : before) {
          early += !done[b];
        }
        done[i] = true;
      });
    }));
  }
  q.wait();
  EXPECT_EQ(early, 0);
  for (const auto& d : done) {
    EXPECT_TRUE(d);
  }
}

TEST_P(queue_order, errors_of_host_tasks_reach_the_handler) {
  std::vector<std::string> texts;
  sycl::queue q(device(), appends_to(texts));
  q.submit([](sycl::handler& h) { h.host_task([] { throw std::runtime_error("host"); }); }).wait();
  EXPECT_TRUE(texts.empty());
  q.wait_and_throw();
  EXPECT_EQ(texts, std::vector<std::string>{"host"});
  q.throw_asynchronous();
  EXPECT_EQ(texts.size(), 1U);
}
LUMEN_ON_EVERY_DEVICE(queue_order);
LUMEN_REPORTS_CUDA(queues)

TEST(queues, a_throwing_command_group_function_throws_from_submit) {
  sycl::queue q;
  EXPECT_THROW(q.submit([](sycl::handler&) { throw 3; }), int);
  q.wait();
}

TEST(queues, unreported_errors_reach_the_handler_when_the_queue_goes) {
  int calls = 0;
  {
    sycl::queue q([&](sycl::exception_list errors) { calls += static_cast<int>(errors.size()); });
    q.submit([](sycl::handler& h) { h.host_task([] { throw 1; }); }).wait();
    EXPECT_EQ(calls, 0);
  }
  EXPECT_EQ(calls, 1);
}

TEST(queues, one_command_a_group) {
  sycl::queue q;
  EXPECT_EQ(code_of([&] {
              q.submit([](sycl::handler& h) {
                h.host_task([] {});
                h.host_task([] {});
              });
            }),
            sycl::errc::invalid);
}

TEST(events, default_constructed_is_complete) {
  sycl::event e;
  e.wait();
  e.wait_and_throw();
  EXPECT_EQ(e.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::complete);
  EXPECT_TRUE(e.get_wait_list().empty());
}

TEST(events, wait_list_and_status_show_the_graph) {
  sycl::queue q;
  std::atomic<bool> gate{false};
  sycl::event first =
      q.submit([&](sycl::handler& h) { h.host_task([&] { EXPECT_TRUE(becomes_true(gate)); }); });
  sycl::event second = q.submit([&](sycl::handler& h) {
    h.depends_on(first);
    h.host_task([] {});
  });
  ASSERT_EQ(second.get_wait_list().size(), 1U);
  EXPECT_EQ(second.get_wait_list()[0], first);
  EXPECT_EQ(second.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::submitted);
  gate = true;
  second.wait();
  EXPECT_EQ(first.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::complete);
  EXPECT_TRUE(second.get_wait_list().empty());
}

TEST(events, profiling_times_are_ordered_and_need_the_property) {
  namespace times = sycl::info::event_profiling;
  sycl::queue q(sycl::property_list{sycl::property::queue::enable_profiling()});
  sycl::event e = q.submit([](sycl::handler& h) {
    h.host_task([] { std::this_thread::sleep_for(std::chrono::milliseconds(2)); });
  });
  e.wait();
  const auto submit = e.get_profiling_info<times::command_submit>();
  const auto start = e.get_profiling_info<times::command_start>();
  const auto end = e.get_profiling_info<times::command_end>();
  EXPECT_GT(submit, 0U);
  EXPECT_LE(submit, start);
  EXPECT_LE(start + 2000000, end);
  sycl::event without = sycl::queue().single_task(nothing());
  EXPECT_EQ(code_of([&] { without.get_profiling_info<times::command_end>(); }),
            sycl::errc::invalid);
}

TEST(process_exit_deathtest, finishes_what_was_submitted) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto leave = [] {
    static sycl::queue kept;  // destroyed while the process exits
    sycl::event first = kept.submit([](sycl::handler& h) {
      h.host_task([] { std::this_thread::sleep_for(std::chrono::milliseconds(5)); });
    });
    kept.submit([&](sycl::handler& h) {
      h.depends_on(first);
      h.host_task([] { std::fputs("the last task ran", stderr); });
    });
    std::exit(0);
  };
  EXPECT_EXIT(leave(), testing::ExitedWithCode(0), "the last task ran");
}

TEST(process_exit_deathtest, an_error_without_handler_ends_the_process) {
  testing::FLAGS_gtest_death_test_style = "threadsafe";
  const auto fail = [] {
    sycl::queue q;
    q.submit([](sycl::handler& h) {
       h.host_task([] { throw std::runtime_error("nobody cares"); });
     }).wait_and_throw();
  };
  EXPECT_DEATH(fail(), "unhandled asynchronous error: nobody cares");
}
