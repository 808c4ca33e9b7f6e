// SPDX-License-Identifier: Apache-2.0
// Memory of OpenCL devices: its kinds, copies and fills.
#include <algorithm>
#include <cstring>
#include <numeric>

#include "native_opencl_work.hpp"

namespace {

using opencl_memory = opencl_work;

TEST_F(opencl_memory, memory_of_every_kind_is_aligned_and_known) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop);
  for (const auto kind :
       {sycl::usm::alloc::device, sycl::usm::alloc::host, sycl::usm::alloc::shared}) {
    for (std::size_t alignment = 1; alignment <= 4096; alignment *= 2) {
      auto* const place = static_cast<char*>(sycl::aligned_alloc(alignment, 1000, queue, kind));
      ASSERT_NE(place, nullptr);
      EXPECT_EQ(reinterpret_cast<std::uintptr_t>(place) % alignment, 0U);
      EXPECT_EQ(sycl::get_pointer_type(place + 999, shop.context), kind);
      char bytes[1000];
      std::memset(bytes, 77, sizeof bytes);
      queue.memset(place, 5, 1000).wait();
      queue.memcpy(bytes, place, 1000).wait_and_throw();
      EXPECT_EQ(std::count(bytes, bytes + 1000, 5), 1000);
      sycl::free(place, queue);
    }
  }
}

TEST_F(opencl_memory, memory_that_does_not_fit_is_null) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop);
  const auto most = device().get_info<sycl::info::device::max_mem_alloc_size>();
  EXPECT_EQ(sycl::malloc_device(most + 1, queue), nullptr);
  for (const std::size_t alignment : {64, 4096}) {
    opencl_layer::fail("clSVMAlloc", 0, CL_OUT_OF_HOST_MEMORY);
    EXPECT_EQ(sycl::aligned_alloc_device(alignment, 10, queue), nullptr);
  }
}

// Guard bytes stand on both sides of what is filled.
template <std::size_t Bytes>
struct pattern {
  unsigned char bytes[Bytes];
};
template <std::size_t Bytes>
void check_fill(sycl::queue& queue, std::size_t offset) {
  constexpr std::size_t count = 37;
  constexpr std::size_t whole = Bytes * count + 256;
  auto* const place = sycl::malloc_shared<unsigned char>(whole, queue);
  std::fill_n(place, whole, static_cast<unsigned char>(0xEE));
  pattern<Bytes> value;
  std::iota(value.bytes, value.bytes + Bytes, static_cast<unsigned char>(1));
  queue.fill(reinterpret_cast<pattern<Bytes>*>(place + offset), value, count).wait_and_throw();
  for (std::size_t i = 0; i < whole; ++i) {
    const bool inside = i >= offset && i < offset + Bytes * count;
    ASSERT_EQ(place[i], inside ? value.bytes[(i - offset) % Bytes] : 0xEE)
        << "pattern of " << Bytes << " bytes, byte " << i << " behind " << offset;
  }
  sycl::free(place, queue);
}

TEST_F(opencl_memory, patterns_of_every_size_fill_memory_of_every_alignment) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop);
  for (const std::size_t offset : {std::size_t{0}, std::size_t{1}, std::size_t{128}}) {
    check_fill<1>(queue, offset);
    check_fill<2>(queue, offset);
    check_fill<3>(queue, offset);
    check_fill<4>(queue, offset);
    check_fill<8>(queue, offset);
    check_fill<12>(queue, offset);
    check_fill<16>(queue, offset);
    check_fill<24>(queue, offset);
    check_fill<64>(queue, offset);
    check_fill<128>(queue, offset);
    check_fill<200>(queue, offset);
    check_fill<256>(queue, offset);
  }
}

TEST_F(opencl_memory, copies_go_between_all_kinds_of_memory) {
  const workshop shop = new_workshop();
  sycl::queue queue = queue_of(shop, sycl::property::queue::in_order());
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
  queue.mem_advise(shared, size * sizeof(number), 0);
  queue.copy(shared, result.data(), size);
  queue.memcpy(shared, on_host, 0);
  queue.wait_and_throw();
  EXPECT_EQ(result, values);
  for (number* const each : {on_device, on_host, shared}) {
    sycl::free(each, queue);
  }
}

}  // namespace
