// SPDX-License-Identifier: Apache-2.0
// Work on OpenCL devices: the order of commands, buffers in several contexts, times, commands that
// fail, and the end of the process in the middle of work.
#include <chrono>
#include <cstdlib>
#include <memory>
#include <random>

#include "native_opencl_work.hpp"

namespace {

TEST_F(opencl_work, chains_cross_queues_of_a_context_and_the_host) {
  const workshop shop = new_workshop();
  sycl::queue here = queue_of(shop), there = queue_of(shop);
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

TEST_F(opencl_work, commands_of_a_native_queue_without_order_run_one_after_the_other) {
  const workshop shop = new_workshop();
  sycl::queue queue = native_queue_of(shop, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE);
  EXPECT_FALSE(queue.is_in_order());
  number* const a = sycl::malloc_device<number>(size, queue);
  number* const b = sycl::malloc_device<number>(size, queue);
  std::vector<number> values(size, 5), result(size, 77);
  sycl::event last = queue.copy(values.data(), a, size);
  for (number round = 0; round < 100; ++round) {
    last = shop.step(queue, a, 200, {last});
    last = queue.copy(a, b, size, last);
    last = queue.fill(a, 0U, size, last);
    last = queue.copy(b, a, size, last);
  }
  queue.copy(a, result.data(), size, last).wait_and_throw();
  EXPECT_EQ(result, std::vector<number>(size, stepped(5, 20000)));
  sycl::free(a, queue);
  sycl::free(b, queue);
}

TEST_F(opencl_work, a_barrier_parts_what_was_before_from_what_comes_after) {
  const workshop shop = new_workshop();
  for (const cl_command_queue_properties wanted : {0, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE}) {
    sycl::queue queue = native_queue_of(shop, wanted), other = native_queue_of(shop, wanted);
    number* const a = sycl::malloc_shared<number>(size, queue);
    number* const b = sycl::malloc_shared<number>(size, queue);
    queue.fill(a, 1U, size).wait();
    queue.fill(b, 2U, size).wait();
    shop.step(queue, a, 5000);
    queue.ext_kestrel_submit_barrier();
    shop.step(queue, a, 7);
    const sycl::event both = other.ext_kestrel_submit_barrier(
        {queue.ext_kestrel_submit_barrier(), shop.step(queue, b, 3000)});
    shop.step(other, a, 1);
    shop.step(other, b, 1);
    other.wait_and_throw();
    EXPECT_EQ(both.get_info<sycl::info::event::command_execution_status>(),
              sycl::info::event_command_status::complete);
    EXPECT_EQ(std::vector<number>(a, a + size), std::vector<number>(size, stepped(1, 5008)));
    EXPECT_EQ(std::vector<number>(b, b + size), std::vector<number>(size, stepped(2, 3001)));
    sycl::free(a, queue);
    sycl::free(b, queue);
  }
}

TEST_F(opencl_work, a_buffer_has_a_copy_in_each_of_two_contexts_over_one_device) {
  const workshop first = new_workshop(), second = new_workshop();
  sycl::queue here = queue_of(first), there = queue_of(second);
  std::vector<number> values(size, 5);
  const int blocks = opencl_layer::objects(opencl_layer::object::svm_block);
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
    EXPECT_EQ(opencl_layer::objects(opencl_layer::object::svm_block), blocks + 2);
  }
  std::vector<number> expected(size, stepped(5, 140));
  expected[1] = stepped(99, 4 * 14);
  EXPECT_EQ(values, expected);
}

TEST_F(opencl_work, a_buffer_goes_from_device_to_device_of_a_context) {
  const std::vector<sycl::device> devices = opencl_devices();
  const workshop shop = new_workshop(sycl::context(devices));
  std::vector<number> values(size, 5);
  {
    sycl::buffer<number> buffer(values.data(), size);
    for (int round = 0; round < 20; ++round) {
      sycl::queue queue(shop.context, devices[static_cast<std::size_t>(round) % devices.size()]);
      shop.step(queue, buffer, 10);
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

TEST_F(opencl_work, times_are_those_of_the_steady_clock_and_in_order) {
  using namespace sycl::info::event_profiling;
  const workshop shop = new_workshop();
  const std::uint64_t begin = now();
  sycl::queue queues[] = {queue_of(shop, {sycl::property::queue::enable_profiling(),
                                          sycl::property::queue::in_order()}),
                          native_queue_of(shop, CL_QUEUE_PROFILING_ENABLE)};
  number* const a = sycl::malloc_shared<number>(size, queues[0]);
  for (sycl::queue& queue : queues) {
    queue.fill(a, 1U, size).wait();
    std::uint64_t before = begin;
    for (int round = 0; round < 5; ++round) {
      const sycl::event event = shop.step(queue, a, 3000);
      const auto submitted = event.get_profiling_info<command_submit>();
      const auto started = event.get_profiling_info<command_start>();
      const auto ended = event.get_profiling_info<command_end>();
      EXPECT_LE(before, started);
      EXPECT_LE(submitted, started);
      EXPECT_LT(started, ended);
      EXPECT_LE(ended, now());
      before = ended;
    }
  }
  sycl::free(a, queues[0]);
}

// The clocks are compared when the queue is made; an hour is more than they ever run apart.
TEST_F(opencl_work, times_follow_a_device_whose_clock_runs_away) {
  using namespace sycl::info::event_profiling;
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop, sycl::property::queue::enable_profiling());
  number* const a = sycl::malloc_shared<number>(size, queue);
  queue.fill(a, 1U, size).wait();
  constexpr std::int64_t hour = 3'600'000'000'000;
  std::uint64_t before = now();
  for (const std::int64_t ahead : {hour, -hour, std::int64_t{0}}) {
    opencl_layer::shift_clock(ahead);
    for (int round = 0; round < 3; ++round) {
      sycl::event event = shop.step(queue, a, 3000);
      event.wait();
      EXPECT_LE(before, event.get_profiling_info<command_start>());
      EXPECT_LE(event.get_profiling_info<command_start>(), event.get_profiling_info<command_end>());
      EXPECT_LE(event.get_profiling_info<command_end>(), now());
      // Once the difference is mended, what passes is told.
      if (round > 0) {
        EXPECT_LT(event.get_profiling_info<command_start>(),
                  event.get_profiling_info<command_end>());
      }
      before = event.get_profiling_info<command_end>();
    }
  }
  sycl::free(a, queue);
}

TEST_F(opencl_work, a_command_that_fails_on_the_device_is_told_of) {
  const workshop shop = new_workshop();
  std::vector<std::string> texts;
  sycl::queue queue(shop.context, device(), appends_to(texts));
  number* const a = sycl::malloc_shared<number>(size, queue);
  opencl_layer::fail_commands(CL_OUT_OF_RESOURCES);
  queue.fill(a, 1U, size);
  queue.wait_and_throw();
  opencl_layer::reset();
  EXPECT_EQ(texts,
            std::vector<std::string>{"clWaitForEvents: OpenCL error -5 (CL_OUT_OF_RESOURCES)"});
  queue.fill(a, 2U, size).wait_and_throw();
  EXPECT_EQ(a[0], 2U);
  EXPECT_EQ(texts.size(), 1U);
  sycl::free(a, queue);
}

// What the native queue holds back is under way, and its event is there.
TEST_F(opencl_work, a_command_behind_one_that_is_held_back_is_running) {
  const workshop shop = new_workshop();
  const native<cl_context> context = native_context(shop.context);
  const native<cl_command_queue> its = new_queue(context.get(), id_of(device()));
  cl_int code = -1;
  const native<cl_event> user(cl().clCreateUserEvent(context.get(), &code), cl().clReleaseEvent);
  sycl::queue queue = sycl::make_queue<opencl>(its.get(), shop.context);
  number* const a = sycl::malloc_shared<number>(size, queue);
  cl_event held = user.get();
  ASSERT_EQ(cl().clEnqueueBarrierWithWaitList(its.get(), 1, &held, nullptr), CL_SUCCESS);
  const sycl::event filled = queue.fill(a, 1U, size);
  EXPECT_EQ(filled.get_info<sycl::info::event::command_execution_status>(),
            sycl::info::event_command_status::running);
  for (cl_event each : sycl::get_native<opencl>(filled)) {
    EXPECT_EQ(cl().clReleaseEvent(each), CL_SUCCESS);
  }
  ASSERT_EQ(cl().clSetUserEventStatus(user.get(), CL_COMPLETE), CL_SUCCESS);
  queue.wait_and_throw();
  EXPECT_EQ(a[size - 1], 1U);
  sycl::free(a, queue);
}

TEST_F(opencl_work, random_graphs_keep_their_edges) {
  const workshop shop = new_workshop();
  using sycl::property::queue::in_order;
  sycl::queue queues[] = {queue_of(shop), queue_of(shop, in_order()),
                          native_queue_of(shop, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE),
                          native_queue_of(shop, 0)};
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
    const std::size_t to = random() % lanes, from = random() % lanes;
    sycl::queue& queue = queues[random() % 4];
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

// The handles of a process that ends are not given back, and what is under way ends or not. That is
// no leak, and the driver's threads are still at work when the sanitizer would look for such.
class opencl_end : public opencl_work {
 protected:
  void SetUp() override {
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    if (opencl_loader::first_gpu() == nullptr) {
      GTEST_SKIP() << "no OpenCL loader, or no PoCL";
    }
    setenv("ASAN_OPTIONS", "detect_leaks=0", 1);  // for the process that ends
  }
  void TearDown() override { unsetenv("ASAN_OPTIONS"); }

  [[noreturn]] static void end_in_the_middle_of_work(bool with_handles) {
    auto* const shop = new workshop(new_workshop());
    auto queue = std::make_unique<sycl::queue>(queue_of(*shop));
    number* const a = sycl::malloc_device<number>(size, *queue);
    queue->fill(a, 1U, size).wait();
    for (int i = 0; i < 50; ++i) {
      shop->step(*queue, a, 20000);
      queue->submit([](sycl::handler& h) { h.host_task([] {}); });
    }
    if (with_handles) {
      static_cast<void>(queue.release());
    }
    std::exit(0);
  }
};

TEST_F(opencl_end, of_the_process_in_the_middle_of_work) {
  EXPECT_EXIT(end_in_the_middle_of_work(true), testing::ExitedWithCode(0), "");
}
TEST_F(opencl_end, of_the_queue_and_the_process_in_the_middle_of_work) {
  EXPECT_EXIT(end_in_the_middle_of_work(false), testing::ExitedWithCode(0), "");
}

}  // namespace
