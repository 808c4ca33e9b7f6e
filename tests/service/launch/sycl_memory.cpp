// SPDX-License-Identifier: Apache-2.0
// Temporary memory on SYCL queues, in both families.
#include <atomic>
#include <iterator>
#include <limits>
#include <stdexcept>

#include "../devices/serv_memory.hpp"
#include "sycl_kernels.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

template <typename Family>
using sycl_memory = family_launches<Family>;
TYPED_TEST_SUITE(sycl_memory, families, family_names);

// The memory is that of an allocation that was full of marks, if it is given out again.
TYPED_TEST(sycl_memory, of_zeros_has_them_on_return) {
  constexpr std::size_t size = 12345;
  const std::vector<unsigned char> marks(size, 0xa5);
  for (int round = 0; round < 10; ++round) {
    const auto marked = TypeParam::allocate(&this->status, &*this->queue, size);
    TypeParam::write(*this->queue, marked, marks.data(), size);
    TypeParam::free(&this->status, marked, *this->queue);
    const auto zeros = TypeParam::allocate_zeros(&this->status, &*this->queue, size);
    ASSERT_NE(zeros, nullptr);
    EXPECT_EQ(this->template contents<unsigned char>(zeros, size),
              std::vector<unsigned char>(size, 0));
    TypeParam::free(&this->status, zeros, *this->queue);
  }
}

// In a queue that is held up the zeros come late, and so does the return.
TYPED_TEST(sycl_memory, of_zeros_is_waited_for) {
  sycl::queue ordered(*this->context, this->queue->get_device(), sycl::property::queue::in_order());
  gate held(ordered);
  std::atomic<bool> opening{false};
  std::thread opener([&] {
    give_it_a_chance();
    opening = true;
    held.open();
  });
  const auto zeros = TypeParam::allocate_zeros(&this->status, &ordered, 64);
  EXPECT_TRUE(opening);
  opener.join();
  TypeParam::free(&this->status, zeros, ordered);
}

TYPED_TEST(sycl_memory, that_is_null_is_freed) {
  TypeParam::free(&this->status, nullptr, *this->queue);
}

TYPED_TEST(sycl_memory, of_no_bytes_is_given_back_as_well) {
  TypeParam::free(&this->status, TypeParam::allocate(&this->status, &*this->queue, 0),
                  *this->queue);
  TypeParam::free(&this->status, TypeParam::allocate_zeros(&this->status, &*this->queue, 0),
                  *this->queue);
}

using in_buffers = family_launches<buffer_family>;
using in_shared_memory = family_launches<shared_family>;

TEST_F(in_buffers, a_buffer_has_its_size_and_aligned_memory_of_the_core) {
  const std::int64_t blocks = serv_memory::live_blocks();
  sycl::buffer<char, 1>* const made = gpu::alloc_temp_buffer(&status, &*queue, 1001);
  EXPECT_EQ(made->size(), 1001u);
  EXPECT_EQ(serv_memory::last_malloc().size, 1001u);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 128u);
  EXPECT_EQ(serv_memory::live_blocks(), blocks + 1);
  {
    const sycl::host_accessor<char, 1, sycl::access_mode::write> all(*made);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(&all[0]) % 128, 0u);
  }
  gpu::free_buffer(&status, made);
  EXPECT_EQ(serv_memory::live_blocks(), blocks);
}

TEST_F(in_buffers, too_little_memory_is_told) {
  const serv_memory::failure failure(0);
  expect_error(sycl::errc::memory_allocation, "a temporary buffer does not fit in memory",
               [&] { gpu::calloc_temp_buffer(&status, &*queue, 8); });
  EXPECT_TRUE(failure.happened());
}

TEST_F(in_buffers, more_bytes_than_there_can_be_are_told) {
  expect_error(sycl::errc::memory_allocation, "a temporary buffer does not fit in memory", [&] {
    gpu::alloc_temp_buffer(&status, &*queue, std::numeric_limits<std::size_t>::max() - 1);
  });
}

TEST_F(in_buffers, freeing_waits_for_the_users) {
  gate held(*queue);
  sycl::event* event = held.event();
  const tarn_gpu_event_list_t list{&event, 1, 0};
  sycl::kernel add = kernel("add");
  sycl::buffer<char, 1>* const place = gpu::calloc_temp_buffer(&status, &*queue, sizeof(int));
  sycl::event* const launched = launch(add, {of_memory(place), of_scalar(10)}, 1, 1, &list);
  std::thread opener([&held] {
    give_it_a_chance();
    held.open();
  });
  gpu::free_buffer(&status, place);
  EXPECT_TRUE(is_complete(*launched));
  opener.join();
  gpu::release_event(&status, launched);
  gpu::release_event(&status, event);
}

// Where the contents of a buffer go at its end, if one could write there.
struct throwing_place {
  using iterator_category = std::output_iterator_tag;
  using value_type = void;
  using difference_type = void;
  using pointer = void;
  using reference = void;

  throwing_place& operator*() { throw std::runtime_error("no room"); }
  throwing_place& operator++() { return *this; }
  throwing_place operator++(int) { return *this; }
  throwing_place& operator=(char) { return *this; }
};

TEST_F(in_buffers, what_fails_when_a_buffer_goes_is_told_and_not_thrown) {
  auto* const doomed = new sycl::buffer<char, 1>(sycl::range<1>(4));
  doomed->set_final_data(throwing_place());
  testing::internal::CaptureStderr();
  gpu::free_buffer(&status, doomed);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "exception in ~buffer: no room\n");
}

TEST_F(in_shared_memory, it_is_the_devices) {
  void* const made = gpu::alloc_temp_buffer_usm(&status, &*queue, 64);
  EXPECT_EQ(sycl::get_pointer_type(made, *context), sycl::usm::alloc::device);
  EXPECT_EQ(sycl::get_pointer_device(made, *context), queue->get_device());
  gpu::free_buffer_usm(&status, made, &*queue);
}

TEST_F(in_shared_memory, without_memory_the_result_is_null_and_nothing_is_filled) {
  const int filled_before = opencl_layer::calls("clEnqueueSVMMemFill");
  for (const auto allocate : {gpu::alloc_temp_buffer_usm, gpu::calloc_temp_buffer_usm}) {
    opencl_layer::fail("clSVMAlloc", 0, CL_OUT_OF_RESOURCES);
    EXPECT_EQ(allocate(&status, &*queue, 64), nullptr);
  }
  EXPECT_EQ(opencl_layer::calls("clEnqueueSVMMemFill"), filled_before);
}

TEST_F(in_shared_memory, what_cannot_be_filled_is_given_back_when_the_handler_throws) {
  sycl::queue strict(*context, queue->get_device(), [](sycl::exception_list all) {
    for (const std::exception_ptr& error : all) {
      std::rethrow_exception(error);
    }
  });
  opencl_layer::fail("clEnqueueSVMMemFill", 0, CL_OUT_OF_RESOURCES);
  expect_error(sycl::errc::runtime, "clEnqueueSVMMemFill: OpenCL error -5 (CL_OUT_OF_RESOURCES)",
               [&] { gpu::calloc_temp_buffer_usm(&status, &strict, 64); });
}

}  // namespace
