// SPDX-License-Identifier: Apache-2.0
// Buffers, accessors and unified shared memory.
#include <cstdint>
#include <numeric>
#include <thread>

#include "every_device.hpp"

namespace {
std::vector<int> counting(std::size_t size) {
  std::vector<int> values(size);
  std::iota(values.begin(), values.end(), 0);
  return values;
}

template <typename Accessor>
struct add_hundred_to {
  Accessor a;
  template <typename Item>
  SYCL_EXTERNAL void operator()(Item i) const {
    a[i.get_id()] += 100;
  }
};
// Adds 100 to every element by a kernel.
template <typename Buffer>
void add_hundred(sycl::queue q, Buffer& buffer) {
  q.submit([&](sycl::handler& h) {
    h.parallel_for(buffer.get_range(),
                   add_hundred_to<sycl::accessor<typename Buffer::value_type>>{{buffer, h}});
  });
}

using writer = sycl::accessor<int, 1, sycl::access_mode::write>;

template <int Dimensions>
struct store {
  sycl::accessor<int, Dimensions, sycl::access_mode::write> to;
  int value;
  SYCL_EXTERNAL void operator()(sycl::id<Dimensions> i) const { to[i] = value; }
};
struct store_in_first {
  writer to;
  int value;
  SYCL_EXTERNAL void operator()(sycl::id<1>) const { to[0] = value; }
};
template <typename Accessor>
struct store_own_id {
  Accessor to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] = static_cast<int>(i); }
};
struct times_ten {
  sycl::accessor<int> a;
  SYCL_EXTERNAL void operator()() const { a[0] = a[0] * 10; }
};
struct add_own_id {
  int* to;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { to[i] += static_cast<int>(i); }
};
}  // namespace

static_assert(sycl::is_device_copyable_v<sycl::accessor<int, 2>>);
static_assert(sycl::is_device_copyable_v<sycl::local_accessor<int, 2>>);
static_assert(sycl::is_device_copyable_v<sycl::nd_range<3>>);

class buffers : public on_every_device {};

TEST_P(buffers, write_back_to_the_host_pointer_at_destruction_only) {
  std::vector<int> data = counting(1000);
  {
    sycl::buffer<int> b(data.data(), data.size());
    add_hundred(sycl::queue(device()), b);
    sycl::host_accessor seen(b, sycl::read_only);
    EXPECT_EQ(seen[7], 107);
    EXPECT_EQ(data[7], 7);
  }
  EXPECT_EQ(data[7], 107);
  EXPECT_EQ(data[999], 1099);
}

TEST_P(buffers, each_constructor_writes_back_as_promised) {
  sycl::queue q(device());
  const std::vector<int> original = counting(10);
  std::vector<int> changed = original;
  changed[3] += 100;
  const auto after = [&](auto make, std::vector<int>& data) {
    {
      auto b = make(data);
      add_hundred(q, b);
    }
    return data[3] - 3;
  };
  std::vector<int> data = original;
  EXPECT_EQ(after([](auto& v) { return sycl::buffer<int>(v); }, data), 100);
  data = original;
  EXPECT_EQ(after([](auto& v) { return sycl::buffer<int>(v.begin(), v.end()); }, data), 0);
  EXPECT_EQ(after(
                [](auto& v) {
                  return sycl::buffer<int>(static_cast<const int*>(v.data()),
                                           sycl::range<1>(v.size()));
                },
                data),
            0);
  EXPECT_EQ(after(
                [](auto& v) {
                  sycl::buffer<int> b(v.data(), sycl::range<1>(v.size()));
                  b.set_write_back(false);
                  return b;
                },
                data),
            0);
  EXPECT_EQ(after(
                [](auto& v) {
                  sycl::buffer<int> b(v.data(), sycl::range<1>(v.size()));
                  b.set_final_data();
                  return b;
                },
                data),
            0);
  EXPECT_EQ(after(
                [](auto& v) {
                  sycl::buffer<int> b(v.begin(), v.end());
                  b.set_final_data(v.data());
                  return b;
                },
                data),
            100);
  data = original;
  EXPECT_EQ(after(
                [](auto& v) {
                  return sycl::buffer<int>(v.data(), sycl::range<1>(v.size()),
                                           sycl::property::buffer::use_host_ptr());
                },
                data),
            100);
  auto shared = std::make_shared<int>(5);
  {
    sycl::buffer<int> b(shared, sycl::range<1>(1));
    add_hundred(q, b);
  }
  EXPECT_EQ(*shared, 105);
  std::shared_ptr<int[]> array(new int[2]{1, 2});
  {
    sycl::buffer<int> b(array, sycl::range<1>(2));
    add_hundred(q, b);
  }
  EXPECT_EQ(array[1], 102);
}

TEST_P(buffers, size_zero_works) {
  sycl::queue q(device());
  std::vector<int> none;
  sycl::buffer<int> b(none.data(), sycl::range<1>(0));
  add_hundred(q, b);
  sycl::host_accessor a(b);
  EXPECT_TRUE(a.empty());
  EXPECT_EQ(b.byte_size(), 0U);
}

TEST_P(buffers, sub_buffers_share_memory_and_order) {
  sycl::queue q(device());
  std::vector<int> data = counting(64);
  {
    sycl::buffer<int> whole(data.data(), 64);
    sycl::buffer<int> part(whole, 16, 32);
    EXPECT_TRUE(part.is_sub_buffer());
    add_hundred(q, whole);
    add_hundred(q, part);
    sycl::host_accessor a(part, sycl::read_only);
    EXPECT_EQ(a[0], 216);
    EXPECT_EQ(a.get_range()[0], 32U);
    EXPECT_EQ(code_of([&] { sycl::buffer<int> bad(whole, 40, 32); }), sycl::errc::invalid);
    EXPECT_EQ(code_of([&] { sycl::buffer<int> bad(part, 1, 2); }), sycl::errc::invalid);
  }
  EXPECT_EQ(data[15], 115);
  EXPECT_EQ(data[47], 247);
  EXPECT_EQ(data[48], 148);
  sycl::buffer<int, 2> plane(sycl::range<2>(8, 8));
  EXPECT_EQ(code_of([&] {
              sycl::buffer<int, 2> rows(plane, {2, 0}, {3, 8});
            }),
            sycl::errc::success);
  EXPECT_EQ(code_of([&] {
              sycl::buffer<int, 2> piece(plane, {2, 3}, {1, 4});
            }),
            sycl::errc::success);
  EXPECT_EQ(code_of([&] {
              sycl::buffer<int, 2> column(plane, {0, 0}, {8, 4});
            }),
            sycl::errc::invalid);
}

TEST_P(buffers, reinterpret_shows_the_same_bytes) {
  sycl::queue q(device());
  std::vector<std::uint64_t> data = {0x0000000200000001, 0x0000000400000003};
  {
    sycl::buffer<std::uint64_t> wide(data.data(), 2);
    auto narrow = wide.reinterpret<std::uint32_t>();
    EXPECT_EQ(narrow.get_range()[0], 4U);
    add_hundred(q, narrow);
    auto square = wide.reinterpret<std::uint32_t>(sycl::range<2>(2, 2));
    sycl::host_accessor a(square, sycl::read_only);
    EXPECT_EQ(a[1][0], 103U);
    EXPECT_EQ(code_of([&] { wide.reinterpret<int>(sycl::range<1>(3)); }), sycl::errc::invalid);
  }
  EXPECT_EQ(data[1], 0x0000006800000067U);
}

TEST_P(buffers, ranged_accessors_count_from_their_offset) {
  sycl::queue q(device());
  sycl::buffer<int, 2> b(sycl::range<2>(6, 8));
  q.submit([&](sycl::handler& h) {
    sycl::accessor all(b, h, sycl::write_only, sycl::no_init);
    h.fill(all, 1);
  });
  q.submit([&](sycl::handler& h) {
    sycl::accessor part(b, h, sycl::range<2>(2, 3), sycl::id<2>(4, 5), sycl::write_only);
    h.parallel_for(part.get_range(), store<2>{part, 7});
  });
  const sycl::host_accessor a(b, sycl::read_only);
  int sum = 0;
  for (int x : a) {
    sum += x;
  }
  EXPECT_EQ(sum, 42 + 6 * 7);
  EXPECT_EQ(a[4][5], 7);
  EXPECT_EQ(a[sycl::id<2>(5, 7)], 7);
  EXPECT_EQ(a[3][5], 1);
  EXPECT_EQ(code_of([&] { sycl::accessor out(b, sycl::range<2>(3, 3), sycl::id<2>(4, 5)); }),
            sycl::errc::invalid);
}

// A device with memory of its own would have to look into the kernel for the accessor's place.
TEST_P(buffers, placeholders_wait_for_require_in_kernels_on_shared_memory) {
  sycl::queue q(device());
  sycl::buffer<int> b(sycl::range<1>(100));
  const sycl::accessor a(b, sycl::write_only);
  EXPECT_TRUE(a.is_placeholder());
  const bool own = has_own_memory(device());
  EXPECT_EQ(code_of([&] {
              q.submit([&](sycl::handler& h) {
                h.require(a);
                h.parallel_for(b.get_range(), store_own_id<decltype(a)>{a});
              });
            }),
            own ? sycl::errc::feature_not_supported : sycl::errc::success);
  if (own) {
    q.submit([&](sycl::handler& h) {
      h.parallel_for(b.get_range(), store_own_id<writer>{{b, h}});
    });
  }
  EXPECT_EQ(b.get_host_access(sycl::read_only)[99], 99);
}

TEST_P(buffers, commands_take_placeholders) {
  sycl::queue q(device());
  sycl::buffer<int> b(sycl::range<1>(100));
  q.submit([&](sycl::handler& h) { h.parallel_for(b.get_range(), store_own_id<writer>{{b, h}}); });
  std::vector<int> copy(100);
  q.copy(sycl::accessor(b, sycl::read_only), copy.data()).wait();
  EXPECT_EQ(copy, counting(100));
  q.fill(sycl::accessor(b, sycl::write_only), 3);
  EXPECT_EQ(b.get_host_access(sycl::read_only)[50], 3);
}

TEST_P(buffers, host_tasks_see_what_kernels_wrote) {
  sycl::queue q(device());
  sycl::buffer<int> b(sycl::range<1>(1000));
  int sum = 0;
  q.submit([&](sycl::handler& h) { h.parallel_for(b.get_range(), store_in_first{{b, h}, 0}); });
  q.submit([&](sycl::handler& h) { h.parallel_for(b.get_range(), store<1>{{b, h}, 2}); });
  q.submit([&](sycl::handler& h) {
     sycl::accessor a(b, h, sycl::read_only_host_task);
     h.host_task([&sum, &q, a](const sycl::interop_handle& interop) {
       EXPECT_EQ(interop.get_backend(), q.get_backend());
       sum = std::accumulate(a.begin(), a.end(), 0);
     });
   }).wait();
  EXPECT_EQ(sum, 2000);
}

TEST_P(buffers, a_host_accessor_keeps_kernels_out) {
  sycl::queue q(device());
  sycl::buffer<int> b(sycl::range<1>(1));
  sycl::event e;
  {
    sycl::host_accessor held(b);
    held[0] = 1;
    e = q.submit([&](sycl::handler& h) { h.single_task(times_ten{{b, h}}); });
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    EXPECT_EQ(e.get_info<sycl::info::event::command_execution_status>(),
              sycl::info::event_command_status::submitted);
    held[0] += 1;
  }
  e.wait();
  EXPECT_EQ(b.get_host_access()[0], 20);
}

TEST_P(buffers, the_last_copy_may_die_inside_its_own_task) {
  std::vector<int> data(1, 1);
  sycl::queue q(device());
  sycl::event e;
  {
    sycl::buffer<int> b(data.data(), 1);
    e = q.submit([&](sycl::handler& h) {
      sycl::accessor a(b, h, sycl::write_only_host_task);
      h.host_task([a, b] { a[0] = 9; });
    });
  }
  e.wait();
  EXPECT_EQ(data[0], 9);
}
LUMEN_ON_EVERY_DEVICE(buffers);

class shared_memory : public on_every_device {};

TEST_P(shared_memory, the_table_knows_every_kind_of_pointer) {
  sycl::queue q(device());
  const sycl::context c = q.get_context();
  char* on_device = sycl::malloc_device<char>(1000, q);
  char* on_host = sycl::malloc_host<char>(1000, q);
  void* shared = sycl::malloc_shared(1000, q);
  using kind = sycl::usm::alloc;
  EXPECT_EQ(sycl::get_pointer_type(on_device, c), kind::device);
  EXPECT_EQ(sycl::get_pointer_type(on_device + 999, c), kind::device);
  EXPECT_EQ(sycl::get_pointer_type(on_device + 1000, c), kind::unknown);
  EXPECT_EQ(sycl::get_pointer_type(on_device - 1, c), kind::unknown);
  EXPECT_EQ(sycl::get_pointer_type(on_host + 500, c), kind::host);
  EXPECT_EQ(sycl::get_pointer_type(shared, c), kind::shared);
  int local = 0;
  const std::vector<int> heap(10);
  EXPECT_EQ(sycl::get_pointer_type(&local, c), kind::unknown);
  EXPECT_EQ(sycl::get_pointer_type(heap.data(), c), kind::unknown);
  EXPECT_EQ(sycl::get_pointer_type(nullptr, c), kind::unknown);
  EXPECT_EQ(sycl::get_pointer_device(on_device + 3, c), device());
  EXPECT_EQ(code_of([&] { sycl::get_pointer_device(&local, c); }), sycl::errc::invalid);
  const sycl::context other(device());
  EXPECT_EQ(sycl::get_pointer_type(on_device, other), kind::unknown);
  EXPECT_EQ(code_of([&] { sycl::free(on_device, other); }), sycl::errc::invalid);
  EXPECT_EQ(code_of([&] { sycl::free(on_device + 1, q); }), sycl::errc::invalid);
  EXPECT_EQ(code_of([&] { sycl::free(&local, q); }), sycl::errc::invalid);
  sycl::free(nullptr, q);
  sycl::free(on_device, q);
  EXPECT_EQ(sycl::get_pointer_type(on_device, c), kind::unknown);
  sycl::free(on_host, c);
  sycl::free(shared, q);
}

TEST_P(shared_memory, alignment_is_real_and_impossible_requests_give_null) {
  sycl::queue q(device());
  const auto address = [](const void* p) { return reinterpret_cast<std::uintptr_t>(p); };
  for (std::size_t alignment : {1, 64, 256, 4096, 65536}) {
    void* p = sycl::aligned_alloc_shared(alignment, 100, q);
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(address(p) % alignment, 0U);
    sycl::free(p, q);
    double* d = sycl::aligned_alloc_device<double>(alignment, 3, q);
    EXPECT_EQ(address(d) % alignment, 0U);
    sycl::free(d, q);
  }
  EXPECT_EQ(sycl::malloc_device(std::size_t{1} << 60, q), nullptr);
  EXPECT_EQ(sycl::malloc_shared<double>(~std::size_t{0}, q), nullptr);
  EXPECT_EQ(sycl::malloc_host(0, q), nullptr);
  EXPECT_EQ(sycl::aligned_alloc_shared(48, 100, q), nullptr);
  EXPECT_EQ(sycl::malloc(100, q, sycl::usm::alloc::unknown), nullptr);
  int* generic = sycl::malloc<int>(5, q, sycl::usm::alloc::host);
  EXPECT_EQ(sycl::get_pointer_type(generic, q.get_context()), sycl::usm::alloc::host);
  sycl::free(generic, q);
}

TEST_P(shared_memory, the_allocator_serves_containers) {
  sycl::queue q(device());
  using allocator = sycl::usm_allocator<int, sycl::usm::alloc::shared>;
  std::vector<int, allocator> values(100, 5, allocator(q));
  int* p = values.data();
  q.parallel_for(100, add_own_id{p}).wait();
  EXPECT_EQ(values[99], 104);
  EXPECT_EQ(sycl::get_pointer_type(p, q.get_context()), sycl::usm::alloc::shared);
  EXPECT_EQ(allocator(q), allocator(q));
}
LUMEN_ON_EVERY_DEVICE(shared_memory);
LUMEN_REPORTS_CUDA(memory)

TEST(multi_ptr, converts_and_counts) {
  int values[4] = {1, 2, 3, 4};
  auto p = sycl::address_space_cast<sycl::access::address_space::global_space,
                                    sycl::access::decorated::yes>(&values[0]);
  sycl::decorated_global_ptr<const int> constant = p;
  sycl::raw_global_ptr<int> raw(p);
  EXPECT_EQ(constant.get_raw(), &values[0]);
  EXPECT_EQ(*(raw + 2), 3);
  EXPECT_EQ((p + 3)[-1], 3);
  EXPECT_EQ((p + 3) - p, 3);
  EXPECT_TRUE(p < p + 1);
  EXPECT_TRUE(sycl::raw_global_ptr<int>() == nullptr);
}
