// SPDX-License-Identifier: Apache-2.0
// Queues of Level Zero devices: the order of commands, buffers in several contexts, times, and that
// nothing is made anew which could be used again.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <random>

#include "native_level_zero.hpp"

namespace {

using level_zero_driver::object;

constexpr std::size_t size = 500;

// One context with its kernel.
struct workshop {
  workshop(const sycl::context& owner, sycl::kernel its) : context(owner), kernel(std::move(its)) {}

  sycl::event step(sycl::queue& queue, number* values, number rounds,
                   const std::vector<sycl::event>& after = {}) const {
    return queue.submit([&](sycl::handler& h) {
      h.depends_on(after);
      h.set_args(values, rounds);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
  }
  void step(sycl::queue& queue, sycl::buffer<number>& values, number rounds) const {
    queue.submit([&](sycl::handler& h) {
      h.set_args(sycl::accessor<number, 1, sycl::access_mode::read_write>(values, h), rounds);
      h.parallel_for(sycl::range<1>(size), kernel);
    });
  }

  sycl::context context;
  sycl::kernel kernel;
};

class level_zero_work : public native_level_zero {
 protected:
  static workshop new_workshop(const sycl::context& context = sycl::context(device())) {
    return {context, make_kernel(context, "step", context.get_devices()[0])};
  }
  static sycl::queue queue_of(const workshop& shop, const sycl::property_list& properties = {}) {
    return {shop.context, shop.context.get_devices()[0], properties};
  }
};

TEST_F(level_zero_work, chains_cross_queues_of_a_context_and_the_host) {
  const workshop shop = new_workshop();
  const native<ze_command_queue_handle_t> native_queue = new_queue(shop.context);
  sycl::queue here = queue_of(shop);
  sycl::queue there =
      sycl::make_queue<level_zero>({native_queue.get(), ownership::keep}, shop.context);
  number* const a = sycl::malloc_device<number>(size, here);
  std::vector<number> values(size, 5);
  sycl::event last;
  constexpr number rounds = 20;
  for (number round = 0; round < rounds; ++round) {
    last = here.copy(values.data(), a, size, last);
    last = shop.step(there, a, 100, {last});
    last = shop.step(here, a, 1, {last});
    last = there.copy(a, values.data(), size, last);
    last = here.submit([&](sycl::handler& h) {
      h.depends_on(last);
      h.host_task([&values] { values[0] += 1; });
    });
  }
  last.wait();
  number first = 5;
  for (number round = 0; round < rounds; ++round) {
    first = stepped(first, 101) + 1;
  }
  std::vector<number> expected(size, stepped(5, 101 * rounds));
  expected[0] = first;
  EXPECT_EQ(values, expected);
  sycl::free(a, here);
}

TEST_F(level_zero_work, commands_are_under_way_while_the_host_goes_on) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop);
  number* const a = sycl::malloc_shared<number>(size, queue);
  std::fill_n(a, size, 1U);
  level_zero_driver::hold();
  const sycl::event event = shop.step(queue, a, 2);
  const sycl::event after = shop.step(queue, a, 3, {event});
  using status = sycl::info::event::command_execution_status;
  EXPECT_EQ(after.get_info<status>(), sycl::info::event_command_status::running);
  EXPECT_EQ(a[0], 1U);
  std::thread later([] {
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    level_zero_driver::release();
  });
  queue.wait_and_throw();
  later.join();
  EXPECT_EQ(after.get_info<status>(), sycl::info::event_command_status::complete);
  EXPECT_EQ(std::vector<number>(a, a + size), std::vector<number>(size, stepped(1, 5)));
  sycl::free(a, queue);
}

TEST_F(level_zero_work, a_command_that_cannot_begin_ends_no_earlier_than_what_it_comes_after) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop);
  std::atomic<int> told{0};
  sycl::queue other(shop.context, queue.get_device(), [&told](const sycl::exception_list& errors) {
    told += static_cast<int>(errors.size());
  });
  number* const a = sycl::malloc_shared<number>(size, queue);
  std::fill_n(a, size, 1U);
  std::atomic<bool> released{false};
  level_zero_driver::hold();
  const sycl::event before = shop.step(queue, a, 2);
  level_zero_driver::fail("zeCommandListAppendLaunchKernel", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  std::thread later([&released] {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    released = true;
    level_zero_driver::release();
  });
  sycl::event failed = shop.step(other, a, 3, {before});
  failed.wait();
  EXPECT_TRUE(released);
  later.join();
  other.wait_and_throw();
  EXPECT_EQ(told, 1);
  queue.wait();
  EXPECT_EQ(std::vector<number>(a, a + size), std::vector<number>(size, stepped(1, 2)));
  sycl::free(a, queue);
}

TEST_F(level_zero_work, a_barrier_parts_what_was_before_from_what_comes_after) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop), other = queue_of(shop);
  number* const a = sycl::malloc_shared<number>(size, queue);
  number* const b = sycl::malloc_shared<number>(size, queue);
  std::fill_n(a, size, 1U);
  std::fill_n(b, size, 2U);
  level_zero_driver::hold();
  shop.step(queue, a, 5000);
  queue.ext_kestrel_submit_barrier();
  shop.step(queue, a, 7);
  const sycl::event both = other.ext_kestrel_submit_barrier(
      {queue.ext_kestrel_submit_barrier(), shop.step(queue, b, 3000)});
  shop.step(other, a, 1);
  shop.step(other, b, 1);
  EXPECT_EQ(both.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::running);
  level_zero_driver::release();
  other.wait_and_throw();
  EXPECT_EQ(std::vector<number>(a, a + size), std::vector<number>(size, stepped(1, 5008)));
  EXPECT_EQ(std::vector<number>(b, b + size), std::vector<number>(size, stepped(2, 3001)));
  sycl::free(a, queue);
  sycl::free(b, queue);
}

TEST_F(level_zero_work, a_buffer_has_a_copy_in_each_of_two_contexts_over_one_device) {
  const workshop first = new_workshop(), second = new_workshop();
  sycl::queue here = queue_of(first), there = queue_of(second);
  std::vector<number> values(size, 5);
  const int before = level_zero_driver::objects(object::memory);
  {
    sycl::buffer<number> buffer(values.data(), size);
    for (int round = 0; round < 10; ++round) {
      first.step(here, buffer, 10);
      second.step(there, buffer, 3);
      second.step(there, buffer, 1);
      if (round == 5) {
        sycl::host_accessor host(buffer);
        host[1] = 99;
      }
    }
    here.wait();
    there.wait();
    EXPECT_EQ(level_zero_driver::objects(object::memory), before + 2);
  }
  std::vector<number> expected(size, stepped(5, 140));
  expected[1] = stepped(99, 4 * 14);
  EXPECT_EQ(values, expected);
}

TEST_F(level_zero_work, a_buffer_goes_from_device_to_device_of_a_context) {
  const sycl::context context(level_zero_devices());
  std::vector<workshop> shops;
  for (const sycl::device& each : level_zero_devices()) {
    shops.emplace_back(context, make_kernel(context, "step", each));
  }
  std::vector<number> values(size, 5);
  {
    sycl::buffer<number> buffer(values.data(), size);
    for (std::size_t round = 0; round < 20; ++round) {
      sycl::queue queue(context, device(round % 3));
      shops[round % 3].step(queue, buffer, 10);
    }
    sycl::queue host{sycl::device()};
    host.submit([&](sycl::handler& h) {
      const sycl::accessor<number, 1, sycl::access_mode::read_write> a(buffer, h);
      h.parallel_for(sycl::range<1>(size), [=](sycl::id<1> i) { a[i] += 1; });
    });
  }
  EXPECT_EQ(values, std::vector<number>(size, stepped(5, 200) + 1));
}

std::uint64_t now() {
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::nanoseconds>(
                                        std::chrono::steady_clock::now().time_since_epoch())
                                        .count());
}

// The clocks of the devices wrap around in the middle.
TEST_F(level_zero_work, times_are_those_of_the_steady_clock_and_in_order) {
  using namespace sycl::info::event_profiling;
  for (const std::size_t which : {0, 1}) {
    constexpr std::uint64_t until_wrap = 10'000'000;
    level_zero_driver::wrap_clocks_in(until_wrap);
    const std::uint64_t begin = now();
    const workshop shop = new_workshop(sycl::context(device(which)));
    sycl::queue queue = queue_of(
        shop, {sycl::property::queue::enable_profiling(), sycl::property::queue::in_order()});
    number* const a = sycl::malloc_shared<number>(size, queue);
    queue.fill(a, 1U, size).wait();
    std::uint64_t before = begin;
    while (before < begin + 2 * until_wrap) {
      const sycl::event event = shop.step(queue, a, 3000);
      const auto submitted = event.get_profiling_info<command_submit>();
      const auto started = event.get_profiling_info<command_start>();
      const auto ended = event.get_profiling_info<command_end>();
      EXPECT_LE(before, submitted);
      EXPECT_LE(submitted, started);
      EXPECT_LT(started, ended);
      EXPECT_LE(ended, now());
      before = ended;
    }
    sycl::free(a, queue);
  }
}

TEST_F(level_zero_work, lists_are_used_again) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop, sycl::property::queue::in_order());
  number* const a = sycl::malloc_shared<number>(size, queue);
  std::fill_n(a, size, 1U);
  const auto lists = [] { return level_zero_driver::calls("zeCommandListCreate"); };
  constexpr number rounds = 1000;
  for (number round = 0; round < rounds; ++round) {
    shop.step(queue, a, 1).wait();
  }
  EXPECT_LE(lists(), 3);
  // What waits needs a list each, which serves again.
  for (int round = 0; round < 3; ++round) {
    level_zero_driver::hold();
    for (number i = 0; i < 100; ++i) {
      shop.step(queue, a, 1);
    }
    level_zero_driver::release();
    queue.wait_and_throw();
    EXPECT_GE(lists(), 100);
    EXPECT_LE(lists(), 103);
  }
  EXPECT_EQ(a[0], stepped(1, rounds + 300));
  EXPECT_EQ(a[size - 1], a[0]);
  sycl::free(a, queue);
}

TEST_F(level_zero_work, events_are_used_again) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop, sycl::property::queue::in_order());
  number* const a = sycl::malloc_shared<number>(size, queue);
  std::fill_n(a, size, 1U);
  for (number round = 0; round < 1000; ++round) {
    shop.step(queue, a, 1).wait();
  }
  EXPECT_LE(level_zero_driver::calls("zeEventCreate"), 10);
  EXPECT_EQ(a[0], stepped(1, 1000));
  sycl::free(a, queue);
}

TEST_F(level_zero_work, random_graphs_keep_their_edges) {
  const workshop shop = new_workshop();
  using sycl::property::queue::in_order;
  native<ze_command_queue_handle_t> native_queue = new_queue(shop.context);
  sycl::queue queues[] = {
      queue_of(shop), queue_of(shop, in_order()),
      sycl::make_queue<level_zero>({native_queue.give(), ownership::transfer}, shop.context)};
  std::mt19937 random(20241121);
  constexpr std::size_t lanes = 6;
  number* values[lanes];
  std::vector<sycl::event> last(lanes);
  std::vector<number> expected(lanes);
  for (std::size_t lane = 0; lane < lanes; ++lane) {
    values[lane] = sycl::malloc_device<number>(size, queues[0]);
    expected[lane] = static_cast<number>(lane);
    last[lane] = queues[0].fill(values[lane], expected[lane], size);
  }
  for (int i = 0; i < 400; ++i) {
    if (i % 50 == 0) {
      level_zero_driver::hold();
    } else if (i % 50 == 20) {
      level_zero_driver::release();
    }
    const std::size_t to = random() % lanes, from = random() % lanes;
    sycl::queue& queue = queues[random() % 3];
    if (to != from && random() % 2 == 0) {
      last[to] = queue.copy(values[from], values[to], size,
                            std::vector<sycl::event>{last[to], last[from]});
      last[from] = queue.ext_kestrel_submit_barrier({last[to]});
      expected[to] = expected[from];
    } else {
      const auto rounds = static_cast<number>(1 + random() % 50);
      last[to] = shop.step(queue, values[to], rounds, {last[to]});
      expected[to] = stepped(expected[to], rounds);
    }
  }
  for (std::size_t lane = 0; lane < lanes; ++lane) {
    std::vector<number> result(size, 77);
    queues[0].copy(values[lane], result.data(), size, last[lane]).wait_and_throw();
    EXPECT_EQ(result, std::vector<number>(size, expected[lane])) << lane;
    sycl::free(values[lane], queues[0]);
  }
}

}  // namespace
