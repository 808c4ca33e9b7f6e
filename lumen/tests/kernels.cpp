// SPDX-License-Identifier: Apache-2.0
// Kernels over ranges: every item once with the right ids, all forms of the kernel's argument,
// the range limit, memory commands.
#include <array>
#include <cstring>
#include <numeric>

#include "every_device.hpp"

namespace {

struct visit_with_ids {
  sycl::range<3> sizes;
  int* seen;
  SYCL_EXTERNAL void operator()(sycl::item<3> i) const {
    const std::size_t linear = (i[0] * sizes[1] + i[1]) * sizes[2] + i[2];
    seen[linear] += i.get_linear_id() == linear && i.get_range() == sizes ? 1 : 100;
  }
};

struct add_own_id {
  int* out;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const { out[i] += static_cast<int>(i); }
};

struct takes_item {
  int* out;
  SYCL_EXTERNAL void operator()(sycl::item<1> i) const {
    out[i] = static_cast<int>(i.get_id(0)) + 1;
  }
};
struct takes_int {
  int* out;
  SYCL_EXTERNAL void operator()(int i) const { out[1] = i + 2; }
};
struct takes_anything {
  int* out;
  template <typename Item>
  SYCL_EXTERNAL void operator()(Item i) const {
    out[2] = static_cast<int>(i[0]) + 3;
  }
};
struct takes_size {
  int* out;
  SYCL_EXTERNAL void operator()(std::size_t i) const { out[3] = static_cast<int>(i) + 4; }
};
struct takes_none {
  int* out;
  SYCL_EXTERNAL void operator()() const { out[4] = 5; }
};

struct count_runs {
  int* count;
  template <typename Item>
  SYCL_EXTERNAL void operator()(const Item&) const {
    ++*count;
  }
};

struct sum_id_and_offset {
  std::size_t* out;
  SYCL_EXTERNAL void operator()(sycl::item<1> i) const {
    out[i.get_linear_id()] = i.get_id(0) + i.get_offset()[0];
  }
};

struct note_the_last {
  std::size_t last;
  std::size_t* seen;
  SYCL_EXTERNAL void operator()(sycl::id<1> i) const {
    if (i[0] == last) {
      *seen = i[0];
    }
  }
};

}  // namespace

class kernels : public on_every_device {};

TEST_P(kernels, every_item_of_a_range_runs_once_with_its_ids) {
  sycl::queue q(device());
  const sycl::range<3> sizes(5, 7, 11);
  const shared_array<int> visits(sizes.size(), q);
  q.parallel_for(sizes, visit_with_ids{sizes, visits.data()}).wait();
  EXPECT_EQ(visits.values(), std::vector<int>(sizes.size(), 1));
  const shared_array<int> flat(100003, q);
  q.parallel_for(sycl::range<1>(flat.size()), add_own_id{flat.data()}).wait();
  std::vector<int> expected(flat.size());
  std::iota(expected.begin(), expected.end(), 0);
  EXPECT_EQ(flat.values(), expected);
}

TEST_P(kernels, all_forms_of_the_argument_are_taken) {
  sycl::queue q = in_order();
  const shared_array<int> values(5, q);
  int* out = values.data();
  q.parallel_for(1, takes_item{out});
  q.parallel_for(sycl::range<1>(1), takes_int{out});
  q.parallel_for<class named>(sycl::range<1>(1), takes_anything{out});
  q.parallel_for(sycl::range<1>(1), takes_size{out});
  q.single_task<class alone>(takes_none{out});
  q.wait();
  for (std::size_t i = 0; i < 5; ++i) {
    EXPECT_EQ(values[i], static_cast<int>(i) + 1);
  }
}

TEST_P(kernels, empty_ranges_run_nothing) {
  sycl::queue q(device());
  const shared_array<int> runs(1, q);
  const count_runs count{runs.data()};
  q.parallel_for(sycl::range<1>(0), count).wait();
  q.parallel_for(sycl::range<2>(4, 0), count).wait();
  q.parallel_for(sycl::nd_range<1>(0, 8), count).wait();
  EXPECT_EQ(runs[0], 0);
  q.parallel_for(sycl::range<1>(1), count).wait();
  EXPECT_EQ(runs[0], 1);
}

TEST_P(kernels, ranges_past_32_bit_integers_are_refused_with_the_text) {
  sycl::queue q(device());
  const auto refused = [&](auto... sizes) {
    try {
      q.submit([&](sycl::handler& h) { h.parallel_for(sizes..., nothing()); });
    } catch (const sycl::exception& error) {
      return std::string(error.what()) ==
             "Provided range is out of integer limits. Pass "
             "`-fno-sycl-id-queries-fit-in-int' to disable range check.";
    }
    return false;
  };
  EXPECT_TRUE(refused(sycl::range<1>(std::size_t{1} << 31)));
  EXPECT_TRUE(refused(sycl::range<1>(~std::size_t{0})));
  EXPECT_TRUE(refused(sycl::range<2>(65536, 32768)));
  EXPECT_TRUE(refused(sycl::range<3>(1 << 20, 1 << 22, 1 << 22)));
  EXPECT_TRUE(refused(sycl::range<1>(1), sycl::id<1>(std::size_t{1} << 31)));
  EXPECT_TRUE(refused(sycl::nd_range<1>(std::size_t{1} << 31, 64)));
  EXPECT_FALSE(refused(sycl::range<1>(10), sycl::id<1>(5)));
}

TEST_P(kernels, offsets_shift_ids) {
  sycl::queue q(device());
  const shared_array<std::size_t> ids(4, q);
  q.submit([&](sycl::handler& h) {
     h.parallel_for(sycl::range<1>(4), sycl::id<1>(10), sum_id_and_offset{ids.data()});
   }).wait();
  EXPECT_EQ(ids.values(), (std::vector<std::size_t>{20, 21, 22, 23}));
}

TEST_P(kernels, memory_commands_do_what_they_say) {
  sycl::queue q(device());
  int* a = sycl::malloc_device<int>(1000, q);
  int* b = sycl::malloc_shared<int>(1000, q);
  sycl::event filled = q.fill(a, 0x01020304, 1000);
  sycl::event copied = q.copy(a, b, 1000, filled);
  q.prefetch(b, 4000, copied).wait();
  EXPECT_EQ(b[0], 0x01020304);
  EXPECT_EQ(b[999], 0x01020304);
  q.memset(a, 0x7f, 2000).wait();
  q.memcpy(b, a, 4000).wait();
  EXPECT_EQ(b[499], 0x7f7f7f7f);
  EXPECT_EQ(b[500], 0x01020304);
  EXPECT_EQ(code_of([&] { q.memcpy(nullptr, a, 4); }), sycl::errc::invalid);
  sycl::free(a, q);
  sycl::free(b, q);
}

// Patterns of every size that a device may treat in its own way, at places that are aligned to the
// pattern only.
TEST_P(kernels, fill_takes_patterns_of_all_sizes) {
  sycl::queue q(device());
  struct three {
    char bytes[3];
  };
  const auto filled = [&](auto pattern) {
    using T = decltype(pattern);
    constexpr std::size_t count = 1001;
    T* place = sycl::malloc_device<T>(count, q);
    std::vector<T> copy(count);
    q.memset(place, 0x55, count * sizeof(T)).wait();
    q.fill(place + 1, pattern, count - 2).wait();
    q.copy(place, copy.data(), count).wait();
    sycl::free(place, q);
    T outside;
    std::memset(&outside, 0x55, sizeof(T));
    std::vector<T> expected(count, pattern);
    expected.front() = expected.back() = outside;
    return std::memcmp(copy.data(), expected.data(), count * sizeof(T)) == 0;
  };
  EXPECT_TRUE(filled(char{0x12}));
  EXPECT_TRUE(filled(short{0x1234}));
  EXPECT_TRUE(filled(three{{1, 2, 3}}));
  EXPECT_TRUE(filled(2.5F));
  EXPECT_TRUE(filled(-2.5));
  EXPECT_TRUE(filled(std::array<int, 4>{1, 2, 3, 4}));
}
LUMEN_ON_EVERY_DEVICE(kernels);
LUMEN_REPORTS_CUDA(kernels)

// Host threads would need seconds: theirs is in host_kernels.cpp.
TEST(kernels_on_cuda, the_largest_legal_range_runs_to_its_end) {
  constexpr std::size_t most = (std::size_t{1} << 31) - 1;
  bool found = false;
  for (const sycl::device& device : sycl::device::get_devices()) {
    if (device.get_backend() == sycl::backend::cuda) {
      found = true;
      sycl::queue q(device);
      const shared_array<std::size_t> seen(1, q);
      q.parallel_for(sycl::range<1>(most), note_the_last{most - 1, seen.data()}).wait();
      EXPECT_EQ(seen[0], most - 1);
    }
  }
  if (!found) {
    GTEST_SKIP() << "no CUDA device";
  }
}

TEST(ids, arithmetic_is_element_wise) {
  const sycl::id<2> a(3, 8);
  const sycl::range<2> r(2, 4);
  EXPECT_EQ(a + 1, sycl::id<2>(4, 9));
  EXPECT_EQ(10 - a, sycl::id<2>(7, 2));
  EXPECT_EQ(a % sycl::id<2>(r), sycl::id<2>(1, 0));
  sycl::id<1> one = 5;
  one += 2;
  EXPECT_EQ(one + 1, 8U);
  EXPECT_EQ(r * 3, sycl::range<2>(6, 12));
  EXPECT_EQ(r.size(), 8U);
}
