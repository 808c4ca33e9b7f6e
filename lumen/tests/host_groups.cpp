// SPDX-License-Identifier: Apache-2.0
// What only work-groups on host threads can do: report divergent barriers, throw, and wait while
// they handle an exception.
#include <atomic>
#include <stdexcept>
#include <string>

#include "every_device.hpp"

class host_groups : public on_every_device {};

TEST_P(host_groups, divergent_barriers_are_reported) {
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

TEST_P(host_groups, parked_items_are_unwound_when_one_throws) {
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

// The C++ runtime stacks caught exceptions by thread, but items leave in the middle of a handler.
TEST_P(host_groups, items_may_wait_while_they_handle_an_exception) {
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
LUMEN_ON_HOST_RUN_DEVICES(host_groups);
