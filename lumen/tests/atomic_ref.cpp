// SPDX-License-Identifier: Apache-2.0
// atomic_ref under contention among threads and among the items of kernels, its every operation
// alone, fences, and the function objects.
#include <cstddef>
#include <cstdint>
#include <limits>
#include <thread>
#include <type_traits>
#include <vector>

#include "every_device.hpp"

namespace {

template <typename T>
using relaxed_ref = sycl::atomic_ref<T, sycl::memory_order::relaxed, sycl::memory_scope::device,
                                     sycl::access::address_space::global_space>;

constexpr int thread_count = 4;
constexpr int rounds = 20000;

template <typename Work>
void on_threads(Work work) {
  std::vector<std::thread> threads;
  for (int t = 0; t < thread_count; ++t) {
    threads.emplace_back(work, t);
  }
  for (auto& thread : threads) {
    thread.join();
  }
}

// Every item of a kernel changes the same few elements.
template <typename T>
struct contend {
  enum { added, least, greatest, exchanged, ored, anded, xored, places };
  sycl::accessor<T> a;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const {
    relaxed_ref<T>(a[added]).fetch_add(2);
    relaxed_ref<T>(a[added]).fetch_sub(1);
    const T value = static_cast<T>(1 + i[0] * 7 % 65537);
    relaxed_ref<T>(a[least]).fetch_min(value);
    relaxed_ref<T>(a[greatest]).fetch_max(value);
    const relaxed_ref<T> counter(a[exchanged]);
    T seen = counter.load();
    while (!counter.compare_exchange_weak(seen, static_cast<T>(seen + 1))) {
    }
    if constexpr (std::is_integral_v<T>) {
      relaxed_ref<T>(a[ored]).fetch_or(static_cast<T>(1) << i[0] % 16);
      relaxed_ref<T>(a[anded]).fetch_and(~(static_cast<T>(1) << i[0] % 15));
      relaxed_ref<T>(a[xored]).fetch_xor(static_cast<T>(i[0]));
    }
  }
};

template <typename T>
struct AtomicRef : testing::Test {};
using atomic_types = testing::Types<int, unsigned, long, unsigned long, long long,
                                    unsigned long long, float, double>;
TYPED_TEST_SUITE(AtomicRef, atomic_types);

TYPED_TEST(AtomicRef, AddLosesNothingUnderContention) {
  using T = TypeParam;
  T sum = 0;
  on_threads([&sum](int) {
    const relaxed_ref<T> ref(sum);
    for (int i = 0; i < rounds; ++i) {
      ref.fetch_add(2);
      ref.fetch_sub(1);
    }
  });
  EXPECT_EQ(sum, T(thread_count * rounds));
}

TYPED_TEST(AtomicRef, MinAndMaxFindTheEndsUnderContention) {
  using T = TypeParam;
  T least = 1000000;
  T greatest = 0;
  on_threads([&](int t) {
    const relaxed_ref<T> low(least);
    const relaxed_ref<T> high(greatest);
    for (int i = 0; i < rounds; ++i) {
      const T value = static_cast<T>(1 + (i * thread_count + t) * 7 % 65537);
      low.fetch_min(value);
      high.fetch_max(value);
    }
  });
  EXPECT_EQ(least, T(1));
  T want = 0;
  for (int k = 0; k < rounds * thread_count; ++k) {
    want = sycl::max(want, static_cast<T>(1 + k * 7 % 65537));
  }
  EXPECT_EQ(greatest, want);
}

TYPED_TEST(AtomicRef, ItemsOfAKernelLoseNothing) {
  using T = TypeParam;
  using at = contend<T>;
  constexpr std::size_t items = 4094;
  for (const sycl::device& device : sycl::device::get_devices()) {
    sycl::queue q(device);
    sycl::buffer<T> places{sycl::range<1>(at::places)};
    {
      const sycl::host_accessor a(places);
      std::fill(a.begin(), a.end(), T(0));
      a[at::least] = 1000000;
      a[at::anded] = 0xFFFF;
    }
    q.submit([&](sycl::handler& h) { h.parallel_for(items, contend<T>{{places, h}}); });
    const sycl::host_accessor a(places, sycl::read_only);
    EXPECT_EQ(a[at::added], T(items));
    EXPECT_EQ(a[at::least], T(1));
    EXPECT_EQ(a[at::greatest], T(1 + (items - 1) * 7));
    EXPECT_EQ(a[at::exchanged], T(items));
    if constexpr (std::is_integral_v<T>) {
      EXPECT_EQ(a[at::ored], T(0xFFFF));
      EXPECT_EQ(a[at::anded], T(0x8000));
      EXPECT_EQ(a[at::xored], T(1));  // 0 ^ 1 ^ ... ^ n is 1 where n % 4 is 1
    }
  }
}

TYPED_TEST(AtomicRef, EachOperationAlone) {
  using T = TypeParam;
  T object = 5;
  const relaxed_ref<T> ref(object);
  EXPECT_TRUE(ref.is_lock_free());
  EXPECT_EQ(ref.load(), T(5));
  ref.store(6);
  EXPECT_EQ(static_cast<T>(ref), T(6));
  EXPECT_EQ(ref = T(7), T(7));
  EXPECT_EQ(ref.exchange(8), T(7));
  T expected = 1;
  EXPECT_FALSE(ref.compare_exchange_strong(expected, 9));
  EXPECT_EQ(expected, T(8));
  EXPECT_TRUE(ref.compare_exchange_strong(expected, 9, sycl::memory_order::acq_rel,
                                          sycl::memory_order::acquire));
  while (!ref.compare_exchange_weak(expected = 9, 10)) {
  }
  EXPECT_EQ(object, T(10));
  EXPECT_EQ(ref.fetch_add(5), T(10));
  EXPECT_EQ(ref.fetch_sub(3), T(15));
  EXPECT_EQ(ref += 2, T(14));
  EXPECT_EQ(ref -= 4, T(10));
  EXPECT_EQ(ref.fetch_min(4), T(10));
  EXPECT_EQ(ref.fetch_max(20), T(4));
  EXPECT_EQ(object, T(20));
  if constexpr (std::is_integral_v<T>) {
    EXPECT_EQ(ref.fetch_and(0x1C), T(20));
    EXPECT_EQ(ref.fetch_or(0x03), T(20));
    EXPECT_EQ(ref.fetch_xor(0x01), T(0x17));
    EXPECT_EQ(ref |= 0x08, T(0x1E));
    EXPECT_EQ(ref &= 0x0F, T(0x0E));
    EXPECT_EQ(ref ^= 0x0F, T(0x01));
    EXPECT_EQ(ref++, T(1));
    EXPECT_EQ(++ref, T(3));
    EXPECT_EQ(ref--, T(3));
    EXPECT_EQ(--ref, T(1));
  }
}

TEST(AtomicRef, PointersCountElements) {
  int values[10] = {};
  int* place = values;
  const relaxed_ref<int*> ref(place);
  EXPECT_EQ(ref.fetch_add(3), values);
  EXPECT_EQ(ref += 2, values + 5);
  EXPECT_EQ(ref--, values + 5);
  EXPECT_EQ(ref.fetch_sub(1), values + 4);
  EXPECT_EQ(ref.load(), values + 3);
  on_threads([&ref](int) {
    for (int i = 0; i < rounds; ++i) {
      ref.fetch_add(1);
      ref.fetch_sub(1);
    }
  });
  EXPECT_EQ(place, values + 3);
}

TEST(AtomicRef, ReleaseAndAcquirePassOrdinaryData) {
  int data = 0;
  int flag = 0;
  std::thread writer([&] {
    data = 42;
    sycl::atomic_ref<int, sycl::memory_order::acq_rel, sycl::memory_scope::device>(flag).store(1);
  });
  const sycl::atomic_ref<int, sycl::memory_order::acq_rel, sycl::memory_scope::device> ready(flag);
  while (ready.load() == 0) {
    std::this_thread::yield();
  }
  EXPECT_EQ(data, 42);
  writer.join();
  sycl::atomic_fence(sycl::memory_order::seq_cst, sycl::memory_scope::system);
}

TEST(AtomicRef, DefaultOrdersFollowTheStandard) {
  using ref = sycl::atomic_ref<int, sycl::memory_order::acq_rel, sycl::memory_scope::work_group>;
  static_assert(ref::default_read_order == sycl::memory_order::acquire);
  static_assert(ref::default_write_order == sycl::memory_order::release);
  static_assert(ref::default_read_modify_write_order == sycl::memory_order::acq_rel);
  static_assert(ref::default_scope == sycl::memory_scope::work_group);
  static_assert(!std::is_copy_assignable_v<ref>);
}

LUMEN_REPORTS_CUDA(AtomicRef)

TEST(FunctionObjects, TypedAndTransparent) {
  EXPECT_EQ(sycl::plus<int>()(2, 3), 5);
  EXPECT_EQ(sycl::plus<>()(2, 0.5), 2.5);
  EXPECT_EQ(sycl::multiplies<>()(sycl::int2(2, 3), 4)[1], 12);
  EXPECT_EQ(sycl::bit_and<unsigned>()(6U, 3U), 2U);
  EXPECT_EQ(sycl::bit_or<>()(6, 3), 7);
  EXPECT_EQ(sycl::bit_xor<>()(6, 3), 5);
  EXPECT_TRUE(sycl::logical_and<bool>()(true, true));
  EXPECT_FALSE(sycl::logical_or<>()(false, false));
  EXPECT_EQ(sycl::minimum<>()(2.5, 1.5), 1.5);
  EXPECT_EQ(sycl::maximum<float>()(2.5F, 1.5F), 2.5F);
  EXPECT_EQ((sycl::plus<std::int8_t>()(std::int8_t{100}, std::int8_t{27})), 127);
}

TEST(FunctionObjects, IdentitiesLeaveValuesAsTheyAre) {
  const auto keeps = [](auto operation, auto value) {
    using T = decltype(value);
    static_assert(sycl::has_known_identity_v<decltype(operation), T>);
    const T identity = sycl::known_identity_v<decltype(operation), T>;
    return operation(value, identity) == value && operation(identity, value) == value;
  };
  EXPECT_TRUE(keeps(sycl::plus<>(), 7));
  EXPECT_TRUE(keeps(sycl::multiplies<double>(), 2.5));
  EXPECT_TRUE(keeps(sycl::bit_and<std::int8_t>(), std::int8_t{-77}));
  EXPECT_TRUE(keeps(sycl::bit_or<>(), 5U));
  EXPECT_TRUE(keeps(sycl::bit_xor<>(), 5U));
  EXPECT_TRUE(keeps(sycl::minimum<>(), std::numeric_limits<float>::infinity()));
  EXPECT_TRUE(keeps(sycl::maximum<>(), std::numeric_limits<long>::min()));
  static_assert(!sycl::has_known_identity_v<sycl::bit_and<>, float>);
  static_assert(!sycl::has_known_identity_v<sycl::plus<int>, float>);
  static_assert(!sycl::has_known_identity_v<sycl::logical_and<>, int>);
}

}  // namespace
