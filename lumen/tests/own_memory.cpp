// SPDX-License-Identifier: Apache-2.0
// Buffers that move: kernels of several devices, some with memory of their own, host tasks, host
// accessors and commands take turns, and each finds what the one before left.
#include "own_memory.hpp"

#include <cstddef>
#include <memory>
#include <numeric>

namespace {

using reader = sycl::accessor<number, 1, sycl::access_mode::read>;
using writer = sycl::accessor<number, 1, sycl::access_mode::write>;
using changer = sycl::accessor<number>;
using buffer = sycl::buffer<number>;

// Steps every element `rounds` times: as long a kernel as one likes.
struct step {
  changer a;
  int rounds;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { a[i] = stepped(a[i], rounds); }
};

struct add_reversed {
  reader from;
  changer to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] += from[from.size() - 1 - i[0]]; }
};

struct store_ids {
  writer to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] = static_cast<number>(i[0]); }
};

struct copy_elements {
  reader from;
  writer to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] = from[i]; }
};

struct add_in_plane {
  sycl::accessor<number, 2> a;
  number value;
  SYCL_EXTERNAL void operator()(sycl::id<2> i) const { a[i] += value; }
};

void submit_steps(sycl::queue q, buffer& b, int rounds = 1) {
  q.submit([&](sycl::handler& h) { h.parallel_for(b.get_range(), step{{b, h}, rounds}); });
}

std::vector<number> counting(std::size_t size) {
  std::vector<number> values(size);
  std::iota(values.begin(), values.end(), 0U);
  return values;
}

std::vector<number> contents(buffer& b) {
  const sycl::host_accessor a(b, sycl::read_only);
  return std::vector<number>(a.begin(), a.end());
}

void step_all(std::vector<number>& values, int rounds = 1) {
  for (number& value : values) {
    value = stepped(value, rounds);
  }
}

}  // namespace

TEST(own_memory, three_devices_have_it) {
  const std::vector<sycl::device> devices = sycl::device::get_devices();
  EXPECT_GE(std::count_if(devices.begin(), devices.end(), has_own_memory), 3);
  EXPECT_FALSE(has_own_memory(devices.front()));
}

class moving_buffers : public beside_others {
 protected:
  sycl::queue here{device()};
  sycl::queue there{neighbour()};
};

TEST_P(moving_buffers, chains_on_four_queues_give_the_serial_result) {
  sycl::queue queues[] = {here, there, sycl::queue(device()), sycl::queue(neighbour())};
  std::vector<number> x = counting(1000), y(1000, 7);
  buffer on_x(x), on_y(y);
  std::vector<number> serial_x = x, serial_y = y;
  for (std::size_t round = 0; round < 60; ++round) {
    queues[round % 4].submit([&](sycl::handler& h) {
      h.parallel_for(on_x.get_range(), add_reversed{{on_y, h}, {on_x, h}});
    });
    submit_steps(queues[round * 7 % 4], on_y);
    for (std::size_t i = 0; i < x.size(); ++i) {
      serial_x[i] += serial_y[x.size() - 1 - i];
    }
    step_all(serial_y);
  }
  EXPECT_EQ(contents(on_x), serial_x);
  EXPECT_EQ(contents(on_y), serial_y);
}

TEST_P(moving_buffers, large_contents_arrive_whole) {
  constexpr std::size_t size = std::size_t{3} << 20;
  std::vector<number> serial = counting(size);
  buffer b{sycl::range<1>(size)};
  here.submit([&](sycl::handler& h) { h.parallel_for(b.get_range(), store_ids{{b, h}}); });
  submit_steps(there, b);
  submit_steps(here, b);
  step_all(serial, 2);
  EXPECT_TRUE(contents(b) == serial);
}

TEST_P(moving_buffers, host_tasks_between_kernels_read_and_change) {
  std::vector<number> serial = counting(100);
  buffer b(serial.begin(), serial.end());
  std::vector<number> seen;
  for (int round = 0; round < 5; ++round) {
    submit_steps(here, b);
    there.submit([&](sycl::handler& h) {
      sycl::accessor a(b, h, sycl::read_write_host_task);
      h.host_task([a] { std::reverse(a.begin(), a.end()); });
    });
    submit_steps(there, b);
    here.submit([&](sycl::handler& h) {
      sycl::accessor a(b, h, sycl::read_only_host_task);
      h.host_task([a, &seen] { seen.assign(a.begin(), a.end()); });
    });
    step_all(serial);
    std::reverse(serial.begin(), serial.end());
    step_all(serial);
  }
  here.wait();
  EXPECT_EQ(seen, serial);
  EXPECT_EQ(contents(b), serial);
}

TEST_P(moving_buffers, host_accessors_between_kernels_read_and_write) {
  std::vector<number> serial(100, 1);
  buffer b(serial.begin(), serial.end());
  for (std::size_t round = 0; round < 10; ++round) {
    submit_steps(round % 2 == 0 ? here : there, b);
    step_all(serial);
    EXPECT_EQ(contents(b), serial);
    const sycl::host_accessor a(b, sycl::range<1>(20), sycl::id<1>(round * 8));
    a[3] += 5;
    serial[round * 8 + 3] += 5;
  }
  EXPECT_EQ(contents(b), serial);
}

TEST_P(moving_buffers, the_last_writer_decides_what_is_written_back) {
  std::vector<number> data = counting(50), elsewhere(50);
  std::vector<number> serial = data;
  {
    buffer b(data);
    submit_steps(here, b);
    submit_steps(there, b);
    submit_steps(here, b);
  }
  step_all(serial, 3);
  EXPECT_EQ(data, serial);
  {
    buffer b(data);
    submit_steps(there, b);
    b.set_final_data(elsewhere.begin());
  }
  EXPECT_EQ(data, serial);
  step_all(serial);
  EXPECT_EQ(elsewhere, serial);
}

TEST_P(moving_buffers, a_part_that_outlives_the_whole_brings_it_home) {
  std::vector<number> data = counting(50), serial = data;
  {
    auto whole = std::make_unique<buffer>(data);
    submit_steps(here, *whole);
    buffer part(*whole, 10, 5);
    whole.reset();
    submit_steps(there, part);
    EXPECT_EQ(data, counting(50));
  }
  step_all(serial);
  for (std::size_t i = 10; i < 15; ++i) {
    serial[i] = stepped(serial[i]);
  }
  EXPECT_EQ(data, serial);
}

TEST_P(moving_buffers, what_is_only_read_on_a_device_stays_as_it_was) {
  std::vector<number> data = counting(50), sum(50);
  {
    buffer from(data.data(), 50, sycl::property::buffer::use_host_ptr()), to(sum);
    for (sycl::queue q : {here, there, here}) {
      q.submit([&](sycl::handler& h) {
        h.parallel_for(to.get_range(), add_reversed{{from, h}, {to, h}});
      });
    }
  }
  EXPECT_EQ(data, counting(50));
  for (std::size_t i = 0; i < 50; ++i) {
    EXPECT_EQ(sum[i], 3 * (49 - i));
  }
}

// One queue is kept busy, so that what it is to read comes late. Whoever then finds contents on its
// device comes after those contents, not only after whoever wrote them.
TEST_P(moving_buffers, contents_that_are_still_on_their_way_are_waited_for) {
  std::vector<number> serial = counting(1000);
  sycl::queue readers[] = {here, sycl::queue(device()), sycl::queue(neighbour(2))};
  for (int round = 0; round < 5; ++round) {
    buffer b(serial.begin(), serial.end()), unrelated(serial.begin(), serial.end());
    std::vector<buffer> copies;
    submit_steps(here, b);
    submit_steps(there, b);
    submit_steps(here, unrelated, 5000);
    for (std::size_t i = 0; i < 3; ++i) {
      copies.emplace_back(sycl::range<1>(serial.size()));
      readers[i].submit([&](sycl::handler& h) {
        h.parallel_for(serial.size(), copy_elements{{b, h}, {copies[i], h}});
      });
    }
    const std::vector<number> seen = contents(b);
    step_all(serial, 2);
    EXPECT_EQ(seen, serial);
    for (buffer& each : copies) {
      EXPECT_EQ(contents(each), serial);
    }
  }
}

TEST_P(moving_buffers, use_host_ptr_is_where_the_host_sees_the_contents) {
  std::vector<number> data = counting(100), serial = data;
  {
    buffer b(data.data(), 100, sycl::property::buffer::use_host_ptr());
    submit_steps(here, b);
    step_all(serial);
    {
      const sycl::host_accessor a(b, sycl::read_only);
      EXPECT_EQ(&a[0], data.data());
      EXPECT_EQ(data, serial);
    }
    submit_steps(there, b);
    step_all(serial);
    there.update_host(sycl::accessor(b, sycl::read_only)).wait();
    EXPECT_EQ(data, serial);
    submit_steps(here, b);
    step_all(serial);
  }
  EXPECT_EQ(data, serial);
}

TEST_P(moving_buffers, commands_on_accessors_take_their_turn) {
  std::vector<number> serial = counting(60);
  buffer b(serial.begin(), serial.end());
  submit_steps(here, b);
  step_all(serial);
  there.submit([&](sycl::handler& h) {
    const sycl::accessor part(b, h, sycl::range<1>(7), sycl::id<1>(20), sycl::write_only);
    h.fill(part, 9U);
  });
  std::fill_n(serial.begin() + 20, 7, 9U);
  submit_steps(there, b);
  step_all(serial);
  std::vector<number> out(10);
  here.submit([&](sycl::handler& h) {
    h.copy(sycl::accessor(b, h, sycl::range<1>(10), sycl::id<1>(18), sycl::read_only), out.data());
  });
  const std::vector<number> in = counting(5);
  here.submit([&](sycl::handler& h) {
    h.copy(in.data(), sycl::accessor(b, h, sycl::range<1>(5), sycl::id<1>(50), sycl::write_only));
  });
  std::copy(in.begin(), in.end(), serial.begin() + 50);
  std::vector<number> serial_other = counting(60);
  buffer other(serial_other.begin(), serial_other.end());
  submit_steps(here, other);
  there.submit([&](sycl::handler& h) {
    h.copy(sycl::accessor(b, h, sycl::range<1>(30), sycl::id<1>(30), sycl::read_only),
           sycl::accessor(other, h, sycl::range<1>(40), sycl::id<1>(5), sycl::write_only));
  });
  submit_steps(there, other);
  step_all(serial_other);
  std::copy(serial.begin() + 30, serial.end(), serial_other.begin() + 5);
  step_all(serial_other);
  EXPECT_EQ(contents(b), serial);
  EXPECT_EQ(contents(other), serial_other);
  EXPECT_EQ(out, std::vector<number>(serial.begin() + 18, serial.begin() + 28));
}

// What one accessor of a group gives up another may read, in whatever order they are made.
TEST_P(moving_buffers, two_accessors_of_one_group_share_the_contents) {
  const sycl::range<1> all(90), some(30);
  std::vector<number> serial = counting(90);
  buffer b(serial.begin(), serial.end());
  for (sycl::queue q : {here, there}) {
    submit_steps(q, b);
    step_all(serial);
    q.submit([&](sycl::handler& h) {
      const writer to(b, h, some, sycl::id<1>(0), sycl::no_init);
      h.parallel_for(some, copy_elements{{b, h, some, sycl::id<1>(40)}, to});
    });
    std::copy_n(serial.begin() + 40, 30, serial.begin());
    q.submit([&](sycl::handler& h) {
      const reader from(b, h);
      h.parallel_for(all, copy_elements{from, {b, h, sycl::no_init}});
    });
    EXPECT_EQ(contents(b), serial);
    submit_steps(here, b);
    submit_steps(there, b);
    step_all(serial, 2);
    q.submit([&](sycl::handler& h) {
      const writer to(b, h, sycl::no_init);
      h.parallel_for(all, copy_elements{{b, h}, to});
    });
    EXPECT_EQ(contents(b), serial);
    submit_steps(q, b);
    step_all(serial);
    q.submit([&](sycl::handler& h) {
      const sycl::accessor to(b, h, sycl::write_only_host_task, sycl::no_init);
      const sycl::accessor from(b, h, sycl::read_only_host_task);
      h.host_task([from, to] { std::copy(from.begin(), from.end(), to.begin()); });
    });
    EXPECT_EQ(contents(b), serial);
  }
}

TEST_P(moving_buffers, planes_and_their_windows_move_too) {
  sycl::buffer<number, 2> b(sycl::range<2>(6, 8));
  here.submit(
      [&](sycl::handler& h) { h.fill(sycl::accessor(b, h, sycl::write_only, sycl::no_init), 1U); });
  const auto add = [&](sycl::queue& q, sycl::range<2> size, sycl::id<2> at, number value) {
    q.submit([&](sycl::handler& h) {
      h.parallel_for(size, add_in_plane{{b, h, size, at}, value});
    });
  };
  add(here, {6, 8}, {0, 0}, 10);
  add(there, {2, 3}, {4, 5}, 100);
  sycl::buffer<number, 2> rows(b, {2, 0}, {2, 8});
  here.submit([&](sycl::handler& h) {
    h.parallel_for(rows.get_range(), add_in_plane{{rows, h}, 1000});
  });
  const sycl::host_accessor a(b, sycl::read_only);
  for (std::size_t y = 0; y < 6; ++y) {
    for (std::size_t x = 0; x < 8; ++x) {
      const number expected = 11 + (y >= 4 && x >= 5 ? 100U : 0U) + (y / 2 == 1 ? 1000U : 0U);
      EXPECT_EQ(a[y][x], expected) << y << ' ' << x;
    }
  }
}

TEST_P(moving_buffers, a_buffer_that_goes_while_kernels_run_waits_for_them) {
  std::vector<number> data = counting(2000), serial = data;
  {
    buffer b(data);
    for (int i = 0; i < 10; ++i) {
      submit_steps(i % 2 == 0 ? here : there, b, 200);
    }
  }
  step_all(serial, 2000);
  EXPECT_EQ(data, serial);
}

TEST_P(moving_buffers, a_refused_kernel_leaves_the_contents_where_they_were) {
  std::vector<number> serial = counting(40);
  buffer b(serial.begin(), serial.end());
  submit_steps(here, b);
  step_all(serial);
  const auto refused = [&] {
    there.submit([&](sycl::handler& h) {
      const sycl::accessor a(b, h, sycl::write_only, sycl::no_init);
      h.parallel_for(sycl::nd_range<1>(40, 7), nothing());
    });
  };
  EXPECT_EQ(code_of(refused), sycl::errc::nd_range);
  EXPECT_EQ(contents(b), serial);
}
LUMEN_ON_EVERY_DEVICE(moving_buffers);
LUMEN_REPORTS_CUDA(own_memory)
