// SPDX-License-Identifier: Apache-2.0
// Native Level Zero kernels as SYCL kernels: arguments of every kind, sizes of groups, errors.
#include <algorithm>
#include <array>
#include <numeric>

#include "native_level_zero.hpp"

namespace {

class level_zero_kernels : public native_level_zero {
 protected:
  void SetUp() override {
    native_level_zero::SetUp();
    if (!IsSkipped()) {
      context_.emplace_back(device());
      queue_.emplace_back(context_[0], device(), sycl::property::queue::in_order());
    }
  }
  void TearDown() override {
    queue_.clear();
    context_.clear();
    native_level_zero::TearDown();
  }
  sycl::context& context() { return context_[0]; }
  sycl::queue& queue() { return queue_[0]; }
  sycl::kernel kernel(const char* name) { return make_kernel(context(), name); }
  template <typename T>
  T* shared(std::size_t count) {
    T* const made = sycl::malloc_shared<T>(count, queue());
    EXPECT_NE(made, nullptr);
    std::fill_n(made, count, T(77));
    return made;
  }

 private:
  std::vector<sycl::context> context_;
  std::vector<sycl::queue> queue_;
};

struct triple {
  char bytes[3];
};

TEST_F(level_zero_kernels, get_values_of_every_size) {
  static std::vector<std::vector<char>> seen;
  seen.clear();
  level_zero_driver::kernel("look", 6, [](const level_zero_driver::kernel_launch& launch) {
    for (std::uint32_t i = 0; i < launch.argument_count; ++i) {
      const auto* const first = static_cast<const char*>(launch.arguments[i]);
      seen.emplace_back(first, first + launch.argument_bytes[i]);
    }
  });
  const auto bytes = [](const auto& value) {
    const auto* const first = reinterpret_cast<const char*>(&value);
    return std::vector<char>(first, first + sizeof value);
  };
  const double large = 1e300;
  const triple three = {{1, 2, 3}};
  float* const pointer = shared<float>(1);
  queue()
      .submit([&](sycl::handler& h) {
        h.set_args(std::int8_t{-5}, std::int16_t{-300}, std::int32_t{-70000}, large, three,
                   pointer);
        h.single_task(kernel("look"));
      })
      .wait_and_throw();
  EXPECT_EQ(seen, (std::vector<std::vector<char>>{bytes(std::int8_t{-5}), bytes(std::int16_t{-300}),
                                                  bytes(std::int32_t{-70000}), bytes(large),
                                                  bytes(three), bytes(pointer)}));
  sycl::free(pointer, queue());
}

TEST_F(level_zero_kernels, take_their_arguments_when_they_are_submitted) {
  constexpr std::size_t size = 96;
  float* const x = shared<float>(size);
  float* const y = shared<float>(4 * size);
  std::iota(x, x + size, 0.0f);
  const sycl::kernel scale = kernel("scale");
  level_zero_driver::hold();
  for (int i = 0; i < 4; ++i) {
    queue().submit([&](sycl::handler& h) {
      h.set_args(x, y + static_cast<std::size_t>(i) * size, static_cast<float>(i));
      h.parallel_for(sycl::range<1>(size), scale);
    });
  }
  EXPECT_EQ(y[1], 77.0f);
  level_zero_driver::release();
  queue().wait_and_throw();
  for (std::size_t i = 0; i < 4 * size; ++i) {
    ASSERT_EQ(y[i], static_cast<float>(i / size) * static_cast<float>(i % size)) << i;
  }
  sycl::free(x, queue());
  sycl::free(y, queue());
}

TEST_F(level_zero_kernels, have_local_memory_by_groups) {
  constexpr std::size_t group = 16, size = 5 * group;
  number* const x = shared<number>(size);
  std::iota(x, x + size, 0U);
  queue()
      .submit([&](sycl::handler& h) {
        const sycl::local_accessor<number> scratch(sycl::range<1>(group), h);
        h.set_args(x, scratch);
        h.parallel_for(sycl::nd_range<1>(size, group), kernel("reverse"));
      })
      .wait_and_throw();
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_EQ(x[i], i / group * group + (group - 1 - i % group));
  }
  sycl::free(x, queue());
}

TEST_F(level_zero_kernels, work_on_buffers) {
  constexpr std::size_t size = 1000;
  std::vector<float> values(size);
  std::iota(values.begin(), values.end(), 0.0f);
  {
    sycl::buffer<float> x(values.data(), size);
    sycl::buffer<float> y{sycl::range<1>(size)};
    const sycl::kernel scale = kernel("scale");
    const auto run = [&](sycl::buffer<float>& from, sycl::buffer<float>& to, float by) {
      queue().submit([&](sycl::handler& h) {
        h.set_args(sycl::accessor<float, 1, sycl::access_mode::read>(from, h),
                   sycl::accessor<float, 1, sycl::access_mode::write>(to, h), by);
        h.parallel_for(sycl::range<1>(size), scale);
      });
    };
    run(x, y, 2.0f);
    run(y, x, 5.0f);
    const sycl::host_accessor middle(y, sycl::read_only);
    EXPECT_EQ(middle[size - 1], 2.0f * static_cast<float>(size - 1));
  }
  for (std::size_t i = 0; i < size; ++i) {
    ASSERT_EQ(values[i], 10.0f * static_cast<float>(i));
  }
}

using sizes = std::array<number, 9>;  // offset, group size, group count

// SYCL's last dimension is Level Zero's first.
TEST_F(level_zero_kernels, are_launched_in_the_sizes_and_places_asked_for) {
  number* const out = shared<number>(9);
  const sycl::kernel same = kernel("sizes");
  const auto launched = [&](auto range) {
    queue()
        .submit([&](sycl::handler& h) {
          h.set_arg(0, out);
          h.parallel_for(range, same);
        })
        .wait_and_throw();
    sizes seen{};
    std::copy_n(out, 9, seen.begin());
    std::fill_n(out, 9, 77U);
    return seen;
  };
  EXPECT_EQ(launched(sycl::nd_range<1>(12, 4)), (sizes{0, 0, 0, 4, 1, 1, 3, 1, 1}));
  EXPECT_EQ(launched(sycl::nd_range<3>({4, 6, 10}, {2, 3, 5})), (sizes{0, 0, 0, 5, 3, 2, 2, 2, 2}));
  EXPECT_EQ(launched(sycl::nd_range<2>({4, 6}, {2, 3}, {100, 7})),
            (sizes{7, 100, 0, 3, 2, 1, 2, 2, 1}));
  EXPECT_EQ(launched(sycl::nd_range<1>(4, 4)), (sizes{0, 0, 0, 4, 1, 1, 1, 1, 1}))
      << "the offset of the launch before";
  // The driver suggests the largest power of two up to 64 that divides the first dimension.
  EXPECT_EQ(launched(sycl::range<1>(96)), (sizes{0, 0, 0, 32, 1, 1, 3, 1, 1}));
  EXPECT_EQ(launched(sycl::range<1>(1009)), (sizes{0, 0, 0, 1, 1, 1, 1009, 1, 1}));
  EXPECT_EQ(launched(sycl::range<2>(6, 8)), (sizes{0, 0, 0, 8, 1, 1, 1, 6, 1}));
  const sizes untouched = {77, 77, 77, 77, 77, 77, 77, 77, 77};
  EXPECT_EQ(launched(sycl::range<1>(0)), untouched);
  sycl::free(out, queue());
}

TEST_F(level_zero_kernels, of_one_object_are_launched_by_several_threads) {
  constexpr std::size_t size = 64;
  constexpr int threads = 4, rounds = 50;
  float* const x = shared<float>(size);
  float* const y = shared<float>(threads * rounds * size);
  const sycl::kernel scale = kernel("scale");
  std::vector<std::thread> running;
  for (int t = 0; t < threads; ++t) {
    running.emplace_back([&, t] {
      sycl::queue own(context(), device());
      for (int r = 0; r < rounds; ++r) {
        const int turn = t * rounds + r;
        own.submit([&](sycl::handler& h) {
          h.set_args(x, y + static_cast<std::size_t>(turn) * size, static_cast<float>(turn));
          h.parallel_for(sycl::range<1>(size), scale);
        });
      }
      own.wait_and_throw();
    });
  }
  for (std::thread& each : running) {
    each.join();
  }
  for (std::size_t i = 0; i < threads * rounds * size; ++i) {
    ASSERT_EQ(y[i], 77.0f * static_cast<float>(i / size)) << i;
  }
  sycl::free(x, queue());
  sycl::free(y, queue());
}

TEST_F(level_zero_kernels, tell_of_themselves) {
  const sycl::kernel scale = kernel("scale");
  EXPECT_EQ(scale.get_info<sycl::info::kernel::num_args>(), 3U);
  EXPECT_EQ(scale.get_info<sycl::info::kernel::function_name>(), "scale");
  EXPECT_EQ(scale.get_info<sycl::info::kernel_device_specific::work_group_size>(device()), 512U);
}

TEST_F(level_zero_kernels, with_an_argument_never_set_are_an_asynchronous_error) {
  remembered_errors errors;
  sycl::queue failing(context(), device(), errors.handler());
  failing.submit([&](sycl::handler& h) { h.single_task(kernel("sizes")); });
  failing.wait_and_throw();
  EXPECT_EQ(errors.texts,
            std::vector<std::string>{"zeCommandListAppendLaunchKernel: Level Zero error 0x78000004 "
                                     "(ZE_RESULT_ERROR_INVALID_ARGUMENT)"});
}

TEST_F(level_zero_kernels, with_an_argument_too_many_are_an_asynchronous_error) {
  remembered_errors errors;
  sycl::queue failing(context(), device(), errors.handler());
  failing.submit([&](sycl::handler& h) {
    h.set_arg(9, 1.0);
    h.single_task(kernel("scale"));
  });
  failing.wait_and_throw();
  EXPECT_EQ(errors.texts,
            std::vector<std::string>{"zeKernelSetArgumentValue: Level Zero error 0x78000015 "
                                     "(ZE_RESULT_ERROR_INVALID_KERNEL_ARGUMENT_INDEX)"});
}

TEST_F(level_zero_kernels, of_another_context_or_in_wrong_groups_are_refused) {
  const sycl::context other(device());
  const sycl::kernel step = make_kernel(other, "step");
  const auto launch = [&](sycl::queue& to, auto range) {
    to.submit([&](sycl::handler& h) { h.parallel_for(range, step); });
  };
  EXPECT_EQ(code_of([&] { launch(queue(), sycl::range<1>(4)); }), sycl::errc::invalid);
  sycl::queue its(other, device());
  EXPECT_EQ(code_of([&] { launch(its, sycl::nd_range<1>(1024, 1024)); }), sycl::errc::nd_range);
  EXPECT_EQ(code_of([&] { launch(its, sycl::nd_range<1>(10, 3)); }), sycl::errc::nd_range);
}

TEST_F(level_zero_kernels, beyond_32_bits_are_an_asynchronous_error) {
  remembered_errors errors;
  sycl::queue failing(context(), device(), errors.handler());
  failing.submit([&](sycl::handler& h) {
    h.parallel_for(sycl::range<1>(std::size_t{1} << 32), kernel("sizes"));
  });
  failing.wait_and_throw();
  EXPECT_EQ(errors.texts, std::vector<std::string>{
                              "a Level Zero launch has sizes of 32 bits in every dimension"});
}

struct nothing {
  void operator()() const {}
};
TEST_F(level_zero_kernels, of_the_program_itself_are_refused) {
  EXPECT_EQ(code_of([&] { queue().single_task(nothing()); }), sycl::errc::kernel_not_supported);
}

}  // namespace
