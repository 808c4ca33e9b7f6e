// SPDX-License-Identifier: Apache-2.0
// Memory of Level Zero devices: allocations of every kind, fills and copies.
#include <algorithm>
#include <numeric>

#include "native_level_zero.hpp"

namespace {

using level_zero_memory = native_level_zero;

constexpr std::size_t size = 500;

TEST_F(level_zero_memory, memory_of_every_kind_is_aligned_and_known) {
  sycl::queue queue(sycl::context(device()), device());
  const std::pair<sycl::usm::alloc, ze_memory_type_t> kinds[] = {
      {sycl::usm::alloc::device, ZE_MEMORY_TYPE_DEVICE},
      {sycl::usm::alloc::host, ZE_MEMORY_TYPE_HOST},
      {sycl::usm::alloc::shared, ZE_MEMORY_TYPE_SHARED}};
  for (const auto& [kind, type] : kinds) {
    for (std::size_t alignment = 1; alignment <= 4096; alignment *= 2) {
      auto* const place = static_cast<char*>(sycl::aligned_alloc(alignment, 1000, queue, kind));
      ASSERT_NE(place, nullptr);
      EXPECT_EQ(reinterpret_cast<std::uintptr_t>(place) % alignment, 0U);
      EXPECT_EQ(sycl::get_pointer_type(place + 999, queue.get_context()), kind);
      ze_memory_allocation_properties_t its{};
      its.stype = ZE_STRUCTURE_TYPE_MEMORY_ALLOCATION_PROPERTIES;
      EXPECT_EQ(ze().zeMemGetAllocProperties(sycl::get_native<level_zero>(queue.get_context()),
                                             place, &its, nullptr),
                ZE_RESULT_SUCCESS);
      EXPECT_EQ(its.type, type);
      char bytes[1000];
      std::fill_n(bytes, 1000, '\x4d');
      queue.memset(place, 5, 1000).wait();
      queue.memcpy(bytes, place, 1000).wait_and_throw();
      EXPECT_EQ(std::count(bytes, bytes + 1000, 5), 1000);
      sycl::free(place, queue);
    }
  }
}

TEST_F(level_zero_memory, memory_that_does_not_fit_is_null) {
  sycl::queue queue(sycl::context(device(2)), device(2));  // with a megabyte
  EXPECT_EQ(sycl::malloc_device((std::size_t{1} << 20) + 1, queue), nullptr);
  void* const most = sycl::malloc_device(1000000, queue);
  EXPECT_NE(most, nullptr);
  EXPECT_EQ(sycl::malloc_device(500000, queue), nullptr);
  EXPECT_EQ(sycl::malloc_shared(500000, queue), nullptr);
  sycl::free(most, queue);
  sycl::buffer<char> large(sycl::range<1>(std::size_t{2} << 20));
  remembered_errors errors;
  sycl::queue failing(queue.get_context(), device(2), errors.handler());
  EXPECT_EQ(code_of([&] {
              failing.submit([&](sycl::handler& h) {
                h.fill(sycl::accessor<char, 1, sycl::access_mode::write>(large, h), 'a');
              });
              failing.wait_and_throw();
            }),
            sycl::errc::memory_allocation);
  EXPECT_EQ(errors.texts, std::vector<std::string>());
  level_zero_driver::fail("zeMemAllocHost", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  EXPECT_EQ(code_of([&] { sycl::malloc_host(10, queue); }), sycl::errc::runtime);
}

// Guard bytes stand on both sides of what is filled.
template <std::size_t Bytes>
struct pattern {
  unsigned char bytes[Bytes];
};
template <std::size_t Bytes>
void check_fill(sycl::queue& queue) {
  constexpr std::size_t count = 37, offset = 64;
  constexpr std::size_t whole = Bytes * count + 2 * offset;
  auto* const place = sycl::malloc_shared<unsigned char>(whole, queue);
  std::fill_n(place, whole, static_cast<unsigned char>(0xEE));
  pattern<Bytes> value;
  std::iota(value.bytes, value.bytes + Bytes, static_cast<unsigned char>(1));
  queue.fill(reinterpret_cast<pattern<Bytes>*>(place + offset), value, count).wait_and_throw();
  for (std::size_t i = 0; i < whole; ++i) {
    const bool inside = i >= offset && i < offset + Bytes * count;
    ASSERT_EQ(place[i], inside ? value.bytes[(i - offset) % Bytes] : 0xEE)
        << "pattern of " << Bytes << " bytes, byte " << i;
  }
  sycl::free(place, queue);
}

TEST_F(level_zero_memory, patterns_of_every_size_fill_memory) {
  sycl::queue queue(sycl::context(device()), device());
  check_fill<1>(queue);
  check_fill<2>(queue);
  check_fill<3>(queue);
  check_fill<4>(queue);
  check_fill<8>(queue);
  check_fill<12>(queue);
  check_fill<16>(queue);
  EXPECT_GT(level_zero_driver::calls("zeCommandListAppendMemoryFill"), 0);
  const int fills = level_zero_driver::calls("zeCommandListAppendMemoryFill");
  check_fill<24>(queue);
  check_fill<32>(queue);
  check_fill<200>(queue);
  EXPECT_EQ(level_zero_driver::calls("zeCommandListAppendMemoryFill"), fills)
      << "patterns that the device does not take";
}

TEST_F(level_zero_memory, copies_go_between_all_kinds_of_memory) {
  sycl::queue queue(sycl::context(device()), device(), sycl::property::queue::in_order());
  std::vector<number> values(size), result(size, 77);
  std::iota(values.begin(), values.end(), 5U);
  number* const on_device = sycl::malloc_device<number>(size, queue);
  number* const on_host = sycl::malloc_host<number>(size, queue);
  number* const shared = sycl::malloc_shared<number>(size, queue);
  queue.copy(values.data(), on_device, size);
  queue.copy(on_device, on_host, size);
  queue.copy(on_host + 10, shared + 10, size - 10);
  queue.copy(on_device, shared, 10);
  queue.prefetch(shared, size * sizeof(number));
  queue.prefetch(on_device, size * sizeof(number));
  queue.mem_advise(shared, size * sizeof(number), 0);
  queue.copy(shared, result.data(), size);
  queue.memcpy(shared, on_host, 0);
  queue.wait_and_throw();
  EXPECT_EQ(result, values);
  EXPECT_EQ(level_zero_driver::calls("zeCommandListAppendMemoryPrefetch"), 1);
  for (number* const each : {on_device, on_host, shared}) {
    sycl::free(each, queue);
  }
}

}  // namespace
