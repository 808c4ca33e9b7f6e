// SPDX-License-Identifier: Apache-2.0
// Launches on SYCL queues, in both families: what kernels get, in which order they run, and what
// fails.
#include "sycl_kernels.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

template <typename Family>
using sycl_launch = family_launches<Family>;
TYPED_TEST_SUITE(sycl_launch, families, family_names);

TYPED_TEST(sycl_launch, gives_a_kernel_its_memory_and_scalar) {
  const auto place = this->filled(std::vector<int>{1, 2, 3, 4, 5, 6});
  sycl::kernel add = this->kernel("add");
  this->finish(this->launch(add, {this->of_memory(place), of_scalar(10)}, 6, 3));
  EXPECT_EQ(this->template contents<int>(place, 6), (std::vector<int>{11, 12, 13, 14, 15, 16}));
}

TYPED_TEST(sycl_launch, of_a_kernel_without_arguments_reads_none) {
  sycl::kernel nothing = this->kernel("nothing");
  this->finish(
      TypeParam::launch_1D(&this->status, &*this->queue, &nothing, nullptr, 4, 2, nullptr));
}

TYPED_TEST(sycl_launch, gives_scalars_of_every_size) {
  const auto out = this->filled(std::vector<std::uint64_t>(6, 77));
  tarn_gpu_argument_t two_words = of_scalar(std::uint64_t{0xfedcba9876543210});
  two_words.size = 16;  // the words of the record behind the value are the second one
  sycl::kernel scalars = this->kernel("scalars");
  this->finish(
      this->launch(scalars, {this->of_memory(out), of_scalar(std::uint8_t{0x12}),
                             of_scalar(std::uint16_t{0x3456}), of_scalar(std::uint32_t{0x789abcde}),
                             of_scalar(std::uint64_t{0x0123456789abcdef}), two_words}));
  EXPECT_EQ(this->template contents<std::uint64_t>(out, 6),
            (std::vector<std::uint64_t>{0x12, 0x3456, 0x789abcde, 0x0123456789abcdef,
                                        0xfedcba9876543210, std::uint64_t{16} << 32}));
}

TYPED_TEST(sycl_launch, leaves_a_scalar_of_another_size_as_it_was) {
  const auto place = this->filled(std::vector<int>{0});
  sycl::kernel add = this->kernel("add");
  arguments args{this->of_memory(place), of_scalar(10)};
  this->finish(this->launch(add, args));
  const int other = 1000;
  for (const std::uint32_t size : {0u, 3u, 5u, 6u, 7u, 12u, 17u, 0xffffffffu}) {
    std::memcpy(args[1].value, &other, sizeof other);
    args[1].size = size;
    this->finish(this->launch(add, args));
  }
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{90});
}

TYPED_TEST(sycl_launch, leaves_an_argument_of_an_unknown_kind_as_it_was) {
  const auto place = this->filled(std::vector<int>{0});
  sycl::kernel add = this->kernel("add");
  arguments args{this->of_memory(place), of_scalar(10)};
  this->finish(this->launch(add, args));
  args[1] = of_scalar(1000);
  for (const std::uint32_t kind : {4u, 99u, 0xffffffffu}) {
    args[1].kind = kind;
    this->finish(this->launch(add, args));
  }
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{40});
}

// The arguments behind one that is left out keep their places.
TYPED_TEST(sycl_launch, never_sets_what_it_leaves_out) {
  const auto place = this->filled(std::vector<int>{0});
  sycl::kernel add = this->kernel("add");
  arguments args{this->of_memory(place), of_scalar(10)};
  args[0].kind = 4;
  this->finish(this->launch(add, args));
  this->queue->wait_and_throw();
  EXPECT_EQ(this->errors.take(),
            std::vector<std::string>{
                "clEnqueueNDRangeKernel: OpenCL error -52 (CL_INVALID_KERNEL_ARGS)"});
  args[0] = this->of_memory(place);
  args[1].size = 3;
  this->finish(this->launch(add, args));  // the scalar is that of the launch before
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{10});
}

TYPED_TEST(sycl_launch, gives_groups_local_memory) {
  std::vector<int> values(80);
  std::vector<int> expected(80);
  for (std::size_t i = 0; i < values.size(); ++i) {
    values[i] = static_cast<int>(i);
    expected[i] = static_cast<int>(i / 16 * 16 + 15 - i % 16);
  }
  const auto place = this->filled(values);
  sycl::kernel reverse = this->kernel("reverse_groups");
  this->finish(this->launch(reverse, {this->of_memory(place), of_local(16 * sizeof(int))}, 80, 16));
  EXPECT_EQ(this->template contents<int>(place, 80), expected);
}

TYPED_TEST(sycl_launch, has_one_two_or_three_dimensions_in_the_order_of_opencl) {
  const std::vector<std::size_t> global{12, 6, 10};
  const std::vector<std::size_t> local{4, 3, 5};
  sycl::kernel positions = this->kernel("positions");
  for (std::ptrdiff_t dimensions = 1; dimensions <= 3; ++dimensions) {
    const std::vector<std::size_t> sizes(global.begin(), global.begin() + dimensions);
    const std::vector<std::size_t> groups(local.begin(), local.begin() + dimensions);
    const std::vector<std::uint64_t> expected = expected_positions(sizes, groups);
    const auto out = this->filled(std::vector<std::uint64_t>(expected.size(), 77));
    const arguments args{this->of_memory(out)};
    if (dimensions == 1) {
      this->finish(this->launch(positions, args, sizes[0], groups[0]));
    } else {
      const auto launch = dimensions == 2 ? TypeParam::launch_2D : TypeParam::launch_3D;
      this->finish(launch(&this->status, &*this->queue, &positions, args.data(), sizes.data(),
                          groups.data(), nullptr));
    }
    EXPECT_EQ(this->template contents<std::uint64_t>(out, expected.size()), expected) << dimensions;
  }
}

// Events

TYPED_TEST(sycl_launch, waits_for_the_events_of_its_list) {
  const auto place = this->filled(std::vector<int>{1});
  sycl::kernel add = this->kernel("add");
  gate first(*this->queue);
  gate second(*this->queue);
  sycl::event* events[] = {first.event(), second.event()};
  const tarn_gpu_event_list_t list{events, 2, 0};
  sycl::event* const launched =
      this->launch(add, {this->of_memory(place), of_scalar(10)}, 1, 1, &list);
  first.open();
  give_it_a_chance();
  EXPECT_FALSE(this->is_complete(*launched));
  second.open();
  this->finish(launched);
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{11});
  for (sycl::event* event : events) {  // still the caller's
    TypeParam::release(&this->status, event);
  }
}

TYPED_TEST(sycl_launch, takes_an_empty_list_as_none) {
  const auto place = this->filled(std::vector<int>{1});
  sycl::kernel add = this->kernel("add");
  gate never(*this->queue);
  sycl::event* event = never.event();
  for (const std::int32_t count : {0, -1}) {
    const tarn_gpu_event_list_t list{&event, count, 0};
    this->finish(this->launch(add, {this->of_memory(place), of_scalar(10)}, 1, 1, &list));
  }
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{21});
  TypeParam::release(&this->status, event);
}

// Failures

TYPED_TEST(sycl_launch, throws_what_the_submission_throws) {
  const auto place = this->filled(std::vector<int>{1});
  sycl::kernel add = this->kernel("add");
  const arguments args{this->of_memory(place), of_scalar(10)};
  expect_error(sycl::errc::nd_range,
               "the global range 7 is not a multiple of the local range 2 in dimension 0",
               [&] { this->launch(add, args, 7, 2); });
  opencl_layer::fail("clGetKernelInfo", 0, CL_OUT_OF_RESOURCES);
  expect_error(sycl::errc::runtime, "clGetKernelInfo: OpenCL error -5 (CL_OUT_OF_RESOURCES)",
               [&] { this->launch(add, args); });
  EXPECT_EQ(this->template contents<int>(place, 1), std::vector<int>{1});
}

// The differences of the two families

using in_buffers = family_launches<buffer_family>;
using in_shared_memory = family_launches<shared_family>;

TEST_F(in_buffers, a_list_to_be_skipped_is_not_waited_for) {
  const auto place = filled(std::vector<int>{1});
  sycl::kernel add = kernel("add");
  gate never(*queue);
  sycl::event* event = never.event();
  const tarn_gpu_event_list_t list{&event, 1, 1};
  finish(launch(add, {of_memory(place), of_scalar(10)}, 1, 1, &list));
  EXPECT_FALSE(is_complete(*event));
  EXPECT_EQ(contents<int>(place, 1), std::vector<int>{11});
  gpu::release_event(&status, event);
}

TEST_F(in_shared_memory, a_list_to_be_skipped_is_waited_for) {
  const auto place = filled(std::vector<int>{1});
  sycl::kernel add = kernel("add");
  gate held(*queue);
  sycl::event* event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 1};
  sycl::event* const launched = launch(add, {of_memory(place), of_scalar(10)}, 1, 1, &list);
  give_it_a_chance();
  EXPECT_FALSE(is_complete(*launched));
  held.open();
  finish(launched);
  gpu::release_event_usm(&status, event);
}

// The record names no buffer, and is not looked at.
TEST_F(in_shared_memory, a_buffer_is_left_out) {
  const auto place = filled(std::vector<int>{1, 1, 1, 1});
  sycl::kernel add = kernel("add");
  arguments args{of_memory(place), of_scalar(10)};
  const std::size_t global[] = {4, 1};
  const std::size_t local[] = {2, 1};
  finish(gpu::launch_kernel_2D_usm(&status, &*queue, &add, args.data(), global, local, nullptr));
  gpu::set_buffer_arg(&args[0], reinterpret_cast<sycl::buffer<char, 1>*>(8),
                      TARN_GPU_ACCESS_READ_WRITE);
  finish(gpu::launch_kernel_2D_usm(&status, &*queue, &add, args.data(), global, local, nullptr));
  EXPECT_EQ(contents<int>(place, 4), std::vector<int>(4, 21));
}

TEST_F(in_buffers, an_access_that_is_none_leaves_the_buffer_out) {
  const auto place = filled(std::vector<int>{1});
  const auto other = filled(std::vector<int>{1});
  sycl::kernel add = kernel("add");
  arguments args{of_memory(place), of_scalar(10)};
  finish(launch(add, args));
  args[0] = of_memory(other);
  for (const std::int32_t access : {3, -1, 77}) {
    args[0].access = access;
    finish(launch(add, args));
  }
  EXPECT_EQ(contents<int>(other, 1), std::vector<int>{1});
}

TEST_F(in_buffers, launches_are_ordered_by_what_they_do_to_buffers) {
  const auto first = filled(std::vector<int>(64, 3));
  const auto second = filled(std::vector<int>(64, 77));
  sycl::kernel twice = kernel("twice");
  sycl::kernel copy = kernel("copy");
  arguments args(2);
  gate held(*queue);
  sycl::event* event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 0};
  sycl::event* const doubled = launch(twice, {of_memory(first)}, 64, 16, &list);
  gpu::set_buffer_arg(&args[0], first, TARN_GPU_ACCESS_READ);
  gpu::set_buffer_arg(&args[1], second, TARN_GPU_ACCESS_WRITE);
  sycl::event* const copied = launch(copy, args, 64, 16);
  sycl::event* const again = launch(twice, {of_memory(first)}, 64, 16);
  give_it_a_chance();
  EXPECT_FALSE(is_complete(*copied));
  held.open();
  finish(copied);
  finish(doubled);
  finish(again);
  EXPECT_EQ(contents<int>(second, 64), std::vector<int>(64, 6));
  EXPECT_EQ(contents<int>(first, 64), std::vector<int>(64, 12));
  gpu::release_event(&status, event);
}

TEST_F(in_buffers, takes_pointers_too) {
  int* const place = sycl::malloc_shared<int>(1, *queue);
  *place = 1;
  sycl::kernel add = kernel("add");
  arguments args{tarn_gpu_argument_t(), of_scalar(10)};
  gpu::tarn_gpu_set_usm_arg(&args[0], place);
  finish(launch(add, args));
  EXPECT_EQ(*place, 11);
  sycl::free(place, *queue);
}

}  // namespace
