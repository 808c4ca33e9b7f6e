// SPDX-License-Identifier: Apache-2.0
// Kernels over ranges: every item once with the right ids, all forms of the kernel's argument,
// the range limit, reductions, memory commands.
#include <numeric>

#include "every_device.hpp"

class kernels : public on_every_device {};

TEST_P(kernels, every_item_of_a_range_runs_once_with_its_ids) {
  sycl::queue q(device());
  const sycl::range<3> sizes(5, 7, 11);
  std::vector<int> visits(sizes.size());
  int* seen = visits.data();
  q.parallel_for(sizes, [=](sycl::item<3> i) {
     const std::size_t linear = (i[0] * 7 + i[1]) * 11 + i[2];
     seen[linear] += i.get_linear_id() == linear && i.get_range() == sizes ? 1 : 100;
   }).wait();
  EXPECT_EQ(visits, std::vector<int>(sizes.size(), 1));
  std::vector<int> flat(100003);
  int* out = flat.data();
  q.parallel_for(sycl::range<1>(flat.size()), [=](sycl::id<1> i) {
     out[i] += static_cast<int>(i);
   }).wait();
  std::vector<int> expected(flat.size());
  std::iota(expected.begin(), expected.end(), 0);
  EXPECT_EQ(flat, expected);
}

struct functor {
  int* out;
  void operator()(sycl::item<1> i) const { out[i] = static_cast<int>(i.get_id(0)) + 1; }
};

TEST_P(kernels, all_forms_of_the_argument_are_taken) {
  sycl::queue q = in_order();
  int values[5] = {};
  int* out = values;
  q.parallel_for(1, functor{out});
  q.parallel_for(sycl::range<1>(1), [=](int i) { out[1] = i + 2; });
  q.parallel_for<class named>(sycl::range<1>(1),
                              [=](auto i) { out[2] = static_cast<int>(i[0]) + 3; });
  q.parallel_for(sycl::range<1>(1), [=](std::size_t i) { out[3] = static_cast<int>(i) + 4; });
  q.single_task<class alone>([=] { out[4] = 5; });
  q.wait();
  for (int i = 0; i < 5; ++i) {
    EXPECT_EQ(values[i], i + 1);
  }
}

TEST_P(kernels, empty_ranges_run_nothing) {
  sycl::queue q(device());
  int runs = 0;
  int* count = &runs;
  q.parallel_for(sycl::range<1>(0), [=](sycl::id<1>) { ++*count; }).wait();
  q.parallel_for(sycl::range<2>(4, 0), [=](sycl::id<2>) { ++*count; }).wait();
  q.parallel_for(sycl::nd_range<1>(0, 8), [=](sycl::nd_item<1>) { ++*count; }).wait();
  EXPECT_EQ(runs, 0);
}

TEST_P(kernels, ranges_past_32_bit_integers_are_refused_with_the_text) {
  sycl::queue q(device());
  const auto refused = [&](auto... sizes) {
    try {
      q.submit([&](sycl::handler& h) { h.parallel_for(sizes..., [](auto) {}); });
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

TEST_P(kernels, the_largest_legal_range_is_accepted) {
  sycl::queue q(device());
  // The kernel stops itself by an error at the first item: only acceptance is at stake.
  bool told = false;
  sycl::queue quiet(device(), [&](sycl::exception_list) { told = true; });
  quiet.parallel_for(sycl::range<1>((std::size_t{1} << 31) - 1), [](sycl::id<1>) { throw 1; })
      .wait_and_throw();
  EXPECT_TRUE(told);
}

TEST_P(kernels, offsets_shift_ids) {
  sycl::queue q(device());
  std::vector<std::size_t> ids(4);
  std::size_t* out = ids.data();
  q.submit([&](sycl::handler& h) {
     h.parallel_for(sycl::range<1>(4), sycl::id<1>(10), [=](sycl::item<1> i) {
       out[i.get_linear_id()] = i.get_id(0) + i.get_offset()[0];
     });
   }).wait();
  EXPECT_EQ(ids, (std::vector<std::size_t>{20, 21, 22, 23}));
}

TEST_P(kernels, reductions_combine_all_items) {
  sycl::queue q(device());
  long* sum = sycl::malloc_shared<long>(1, q);
  int* most = sycl::malloc_shared<int>(1, q);
  *sum = 1000;
  *most = -1;
  q.parallel_for(sycl::range<1>(10000), sycl::reduction(sum, sycl::plus<>()),
                 sycl::reduction(most, sycl::maximum<int>()),
                 [=](sycl::id<1> i, auto& s, auto& m) {
                   s += static_cast<long>(i[0]);
                   m.combine(static_cast<int>(i[0] * 7919 % 10007));
                 })
      .wait();
  int expected = -1;
  for (int i = 0; i < 10000; ++i) {
    expected = std::max(expected, i * 7919 % 10007);
  }
  EXPECT_EQ(*sum, 1000 + 10000L * 9999 / 2);
  EXPECT_EQ(*most, expected);
  q.parallel_for(sycl::nd_range<1>(1024, 64),
                 sycl::reduction(sum, sycl::plus<long>(),
                                 sycl::property::reduction::initialize_to_identity()),
                 [=](sycl::nd_item<1> i, auto& s) {
                   sycl::group_barrier(i.get_group());
                   s += static_cast<long>(i.get_global_id(0));
                 })
      .wait();
  EXPECT_EQ(*sum, 1024L * 1023 / 2);
  sycl::free(sum, q);
  sycl::free(most, q);
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
LUMEN_ON_EVERY_DEVICE(kernels);

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
