// SPDX-License-Identifier: Apache-2.0
// Handles of the runtime's own devices, by which another part of a program can name them; barriers
// in queues; and the choice of backends.
#include <atomic>
#include <thread>

#include "every_device.hpp"
#include "settings.hpp"

namespace {

using sycl::detail::native_of;

class native_handles : public on_every_device {
 protected:
  sycl::backend kind() const { return device().get_backend(); }
};

TEST_P(native_handles, of_a_device_lead_back_to_it) {
  void* const handle = native_of(device());
  ASSERT_NE(handle, nullptr);
  EXPECT_EQ(sycl::detail::make_device(handle, kind()), device());
  for (const sycl::device& other : sycl::device::get_devices()) {
    EXPECT_EQ(native_of(other) == handle, other == device());
  }
}

TEST_P(native_handles, of_contexts_and_queues_lead_back_to_them) {
  const sycl::context context(device());
  EXPECT_EQ(sycl::detail::make_context(native_of(context), {}, kind(), true), context);
  EXPECT_EQ(sycl::detail::make_context(native_of(context), {}, kind(), true, {device()}), context);
  sycl::queue queue(context, device());
  const sycl::queue same =
      sycl::detail::make_queue(native_of(queue), context, nullptr, true, {}, {}, kind());
  EXPECT_EQ(same, queue);
}

TEST_P(native_handles, that_are_null_or_of_nothing_are_refused) {
  const sycl::context context(device());
  const auto refused = [](auto call) { return code_of(call) == sycl::errc::invalid; };
  EXPECT_TRUE(refused([&] { sycl::detail::make_device(nullptr, kind()); }));
  int nothing = 0;
  EXPECT_TRUE(refused([&] { sycl::detail::make_device(&nothing, kind()); }));
  EXPECT_TRUE(refused([&] { sycl::detail::make_context(nullptr, {}, kind(), true); }));
  EXPECT_TRUE(
      refused([&] { sycl::detail::make_queue(nullptr, context, nullptr, true, {}, {}, kind()); }));
}

TEST_P(native_handles, of_another_backend_are_refused) {
  sycl::queue queue(device());
  const auto mismatched = [](auto call) { return code_of(call) == sycl::errc::backend_mismatch; };
  EXPECT_TRUE(mismatched([&] { sycl::get_native<sycl::backend::opencl>(device()); }));
  EXPECT_TRUE(mismatched([&] {
    sycl::detail::make_queue(&queue, queue.get_context(), nullptr, true, {}, {},
                             sycl::backend::opencl);
  }));
}

TEST_P(native_handles, of_a_queue_do_not_keep_it) {
  std::weak_ptr<const void> state;
  {
    sycl::queue queue(device());
    const sycl::queue copy = queue;
    state = sycl::detail::state_of(queue);
    EXPECT_EQ(sycl::detail::state_of(copy), state.lock());
  }
  EXPECT_TRUE(state.expired());
}

LUMEN_ON_EVERY_DEVICE(native_handles);

TEST(native_handles, of_platforms_without_drivers_are_refused) {
  int nothing = 0;
  for (const sycl::backend kind : {sycl::backend::opencl, sycl::backend::ext_kestrel_level_zero}) {
    EXPECT_EQ(code_of([&] { sycl::detail::make_device(&nothing, kind); }), sycl::errc::platform);
  }
}

TEST(native_handles, numbers_of_backends_are_those_of_other_languages) {
  EXPECT_EQ(static_cast<int>(sycl::backend::opencl), 1);
  EXPECT_EQ(static_cast<int>(sycl::backend::ext_kestrel_level_zero), 2);
}

/// Host tasks in an out-of-order queue, held back until they are let go.
class barriers : public on_every_device {
 protected:
  sycl::event held(std::atomic<bool>& go, std::atomic<int>& done) {
    return queue_.submit([&](sycl::handler& group) {
      group.host_task([&] {
        while (!go) {
          std::this_thread::yield();
        }
        ++done;
      });
    });
  }
  sycl::event noting(const std::atomic<int>& done, std::atomic<int>& seen) {
    return queue_.submit(
        [&](sycl::handler& group) { group.host_task([&] { seen = done.load(); }); });
  }
  static bool complete(const sycl::event& event) {
    return event.get_info<sycl::info::event::command_execution_status>() ==
           sycl::info::event_command_status::complete;
  }

  sycl::queue queue_{device()};
};

TEST_P(barriers, come_after_all_earlier_commands_and_before_all_later_ones) {
  std::atomic<bool> go{false};
  std::atomic<int> done{0};
  std::atomic<int> seen{-1};
  held(go, done);
  const sycl::event barrier = queue_.ext_kestrel_submit_barrier();
  const sycl::event after = noting(done, seen);
  EXPECT_FALSE(complete(barrier));
  EXPECT_FALSE(complete(after));
  EXPECT_EQ(seen, -1);
  go = true;
  sycl::event last = after;
  last.wait();
  EXPECT_EQ(seen, 1);
  EXPECT_TRUE(complete(barrier));
}

TEST_P(barriers, with_events_come_after_these_alone) {
  std::atomic<bool> go{false};
  std::atomic<bool> go_other{true};
  std::atomic<int> done{0};
  std::atomic<int> seen{-1};
  sycl::event slow = held(go, done);
  const sycl::event quick = held(go_other, done);
  sycl::event barrier = queue_.ext_kestrel_submit_barrier({quick});
  barrier.wait();
  EXPECT_FALSE(complete(slow));
  sycl::event after = noting(done, seen);
  after.wait();
  EXPECT_EQ(seen, 1);
  EXPECT_FALSE(complete(slow));
  go = true;
  slow.wait();
}

TEST_P(barriers, follow_each_other) {
  std::atomic<bool> go{false};
  std::atomic<int> done{0};
  std::atomic<int> seen{-1};
  const sycl::event first = held(go, done);
  queue_.ext_kestrel_submit_barrier({first});
  const sycl::event second = queue_.ext_kestrel_submit_barrier(std::vector<sycl::event>{});
  const sycl::event after = noting(done, seen);
  EXPECT_FALSE(complete(second));
  go = true;
  sycl::event last = after;
  last.wait();
  EXPECT_EQ(seen, 1);
}

TEST_P(barriers, with_accessors_take_their_turn_among_the_users_of_the_buffer) {
  std::atomic<bool> go{false};
  int content = 1;
  sycl::event barrier;
  {
    sycl::buffer<int, 1> buffer(&content, sycl::range<1>(1));
    queue_.submit([&](sycl::handler& group) {
      sycl::accessor<int, 1, sycl::access_mode::read_write, sycl::target::host_task> element(buffer,
                                                                                             group);
      group.host_task([&go, element] {
        while (!go) {
          std::this_thread::yield();
        }
        element[0] = 2;
      });
    });
    barrier = queue_.submit([&](sycl::handler& group) {
      sycl::accessor<int, 1, sycl::access_mode::read_write> element(buffer, group);
      group.ext_kestrel_barrier({});
    });
    EXPECT_FALSE(complete(barrier));
    go = true;
  }
  EXPECT_EQ(content, 2);
  EXPECT_TRUE(complete(barrier));
}

TEST_P(barriers, that_come_last_do_not_keep_their_queue) {
  std::weak_ptr<const void> state;
  sycl::event barrier;
  {
    sycl::queue queue(device());
    state = sycl::detail::state_of(queue);
    barrier = queue.ext_kestrel_submit_barrier();
    barrier.wait();
    queue.wait();
  }
  EXPECT_TRUE(state.expired());
}

LUMEN_ON_EVERY_DEVICE(barriers);

TEST(choice_of_backends, is_read_from_the_list) {
  using sycl::detail::parse_backends;
  const auto names = [](const std::string& text) {
    const sycl::detail::backend_choice choice = parse_backends(text).choice;
    return std::string(choice.virtual_devices ? "v" : "") + (choice.cuda ? "c" : "") +
           (choice.opencl ? "o" : "") + (choice.level_zero ? "l" : "");
  };
  EXPECT_EQ(names(""), "");
  EXPECT_EQ(names("virtual"), "v");
  EXPECT_EQ(names("level_zero;opencl"), "ol");
  EXPECT_EQ(names("cuda;virtual;opencl;level_zero"), "vcol");
}

TEST(choice_of_backends, names_what_it_does_not_know) {
  const sycl::detail::backend_parse wrong = sycl::detail::parse_backends("cuda;Opencl;x");
  EXPECT_EQ(wrong.error, "unknown backend 'Opencl'");
  EXPECT_EQ(wrong.column, 6u);
  EXPECT_EQ(sycl::detail::parse_backends("cuda;").error, "unknown backend ''");
  EXPECT_FALSE(wrong.choice.cuda);
}

}  // namespace
