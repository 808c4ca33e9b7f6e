// SPDX-License-Identifier: Apache-2.0
// Suites on SYCL queues over the GPU of the OpenCL layer: native kernels as SYCL kernels, and the
// two families of functions under common names.
#pragma once

#include <chrono>
#include <cstring>
#include <future>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "../devices/sycl_queues.hpp"
#include "kestrel/tarn/gpu/launch.hpp"
#include "native_kernels.hpp"

/// What the queue's handler was told.
class error_log {
 public:
  void add(const sycl::exception_list& errors) {
    const std::lock_guard<std::mutex> lock(mutex_);
    for (const std::exception_ptr& error : errors) {
      try {
        std::rethrow_exception(error);
      } catch (const sycl::exception& known) {
        texts_.push_back(known.what());
      }
    }
  }
  /// Forgets them.
  std::vector<std::string> take() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return std::move(texts_);
  }

 private:
  std::mutex mutex_;
  std::vector<std::string> texts_;
};

/// The functions for memory in buffers.
struct buffer_family {
  using memory = sycl::buffer<char, 1>*;
  static constexpr auto allocate = kestrel::tarn::gpu::alloc_temp_buffer;
  static constexpr auto allocate_zeros = kestrel::tarn::gpu::calloc_temp_buffer;
  static constexpr auto launch_1D = kestrel::tarn::gpu::launch_kernel_1D;
  static constexpr auto launch_2D = kestrel::tarn::gpu::launch_kernel_2D;
  static constexpr auto launch_3D = kestrel::tarn::gpu::launch_kernel_3D;
  static constexpr auto set_memory = kestrel::tarn::gpu::set_buffer_arg;
  static constexpr auto coalesce = kestrel::tarn::gpu::coalesce_events;
  static constexpr auto release = kestrel::tarn::gpu::release_event;
  static constexpr auto host_wait = kestrel::tarn::gpu::host_wait;

  static void free(int* status, memory place, sycl::queue&) {
    kestrel::tarn::gpu::free_buffer(status, place);
  }
  static void write(sycl::queue&, memory place, const void* from, std::size_t bytes) {
    const sycl::host_accessor<char, 1, sycl::access_mode::write> to(*place);
    std::memcpy(&to[0], from, bytes);
  }
  static void read(sycl::queue&, memory place, void* to, std::size_t bytes) {
    const sycl::host_accessor<char, 1, sycl::access_mode::read> from(*place);
    std::memcpy(to, &from[0], bytes);
  }
};

/// The functions for unified shared memory.
struct shared_family {
  using memory = void*;
  static constexpr auto allocate = kestrel::tarn::gpu::alloc_temp_buffer_usm;
  static constexpr auto allocate_zeros = kestrel::tarn::gpu::calloc_temp_buffer_usm;
  static constexpr auto launch_1D = kestrel::tarn::gpu::launch_kernel_1D_usm;
  static constexpr auto launch_2D = kestrel::tarn::gpu::launch_kernel_2D_usm;
  static constexpr auto launch_3D = kestrel::tarn::gpu::launch_kernel_3D_usm;
  static constexpr auto set_memory = kestrel::tarn::gpu::set_buffer_arg_usm;
  static constexpr auto coalesce = kestrel::tarn::gpu::coalesce_events_usm;
  static constexpr auto release = kestrel::tarn::gpu::release_event_usm;
  static constexpr auto host_wait = kestrel::tarn::gpu::host_wait_usm;

  static void free(int* status, memory place, sycl::queue& queue) {
    kestrel::tarn::gpu::free_buffer_usm(status, place, &queue);
  }
  static void write(sycl::queue& queue, memory place, const void* from, std::size_t bytes) {
    queue.memcpy(place, from, bytes).wait();
  }
  static void read(sycl::queue& queue, memory place, void* to, std::size_t bytes) {
    queue.memcpy(to, place, bytes).wait();
  }
};

using families = testing::Types<buffer_family, shared_family>;
struct family_names {
  template <typename Family>
  static std::string GetName(int) {
    return std::is_same_v<Family, buffer_family> ? "in_buffers" : "in_shared_memory";
  }
};

template <typename T>
tarn_gpu_argument_t of_scalar(T value) {
  tarn_gpu_argument_t arg;
  kestrel::tarn::gpu::set_scalar_arg_internal(&arg, &value, sizeof value);
  return arg;
}
inline tarn_gpu_argument_t of_local(std::size_t bytes) {
  tarn_gpu_argument_t arg;
  kestrel::tarn::gpu::set_SLM_arg(&arg, bytes);
  return arg;
}
using arguments = std::vector<tarn_gpu_argument_t>;

/// A queue and its kernels. Every case ends with all native objects given back, no status stored,
/// and no error told that it did not take.
class sycl_launches : public OpenCLGpu {
 protected:
  void SetUp() override {
    OpenCLGpu::SetUp();
    if (IsSkipped()) {
      return;
    }
    const sycl::device gpu = gpu_of(kestrel::tarn::service::backend_code::opencl).value();
    context.emplace(gpu);
    queue.emplace(
        *context, gpu, [this](sycl::exception_list all) { errors.add(all); },
        sycl::property::queue::enable_profiling());
    native_context_ = sycl::get_native<sycl::backend::opencl>(*context);
    program.emplace(native_context_, device);
  }
  void TearDown() override {
    opencl_layer::reset();
    EXPECT_EQ(status, 77) << "these layers do not touch it";
    EXPECT_EQ(errors.take(), std::vector<std::string>());
    if (queue) {
      queue->wait();
      program.reset();
      EXPECT_EQ(opencl_loader::get().clReleaseContext(native_context_), CL_SUCCESS);
    }
    queue.reset();
    context.reset();
    settle(before);
    OpenCLGpu::TearDown();
  }

  /// Another thread of the runtime may hold a finished command for a moment.
  static void settle(const std::vector<int>& expected) {
    for (int round = 0; round < 5000 && living() != expected; ++round) {
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
  }

  sycl::kernel kernel(const char* name) const {
    cl_kernel native = program->kernel(name);
    sycl::kernel made = sycl::make_kernel<sycl::backend::opencl>(native, *context);
    EXPECT_EQ(opencl_loader::get().clReleaseKernel(native), CL_SUCCESS);
    return made;
  }

  int status = 77;
  error_log errors;
  std::optional<sycl::context> context;
  std::optional<sycl::queue> queue;
  std::optional<native_program> program;

 private:
  cl_context native_context_ = nullptr;
};

/// The same with memory of a family, which is given back at the end of a case.
template <typename Family>
class family_launches : public sycl_launches {
 protected:
  using memory = typename Family::memory;

  void TearDown() override {
    for (const memory place : places_) {
      Family::free(&status, place, *queue);
    }
    sycl_launches::TearDown();
  }

  template <typename T>
  memory filled(const std::vector<T>& values) {
    const memory place = Family::allocate(&status, &*queue, values.size() * sizeof(T));
    Family::write(*queue, place, values.data(), values.size() * sizeof(T));
    places_.push_back(place);
    return place;
  }
  template <typename T>
  std::vector<T> contents(memory place, std::size_t count) {
    std::vector<T> values(count, T(77));
    Family::read(*queue, place, values.data(), count * sizeof(T));
    return values;
  }
  static tarn_gpu_argument_t of_memory(memory place) {
    tarn_gpu_argument_t arg;
    Family::set_memory(&arg, place, TARN_GPU_ACCESS_READ_WRITE);
    return arg;
  }

  sycl::event* launch(sycl::kernel& native, const arguments& args, std::size_t global = 1,
                      std::size_t local = 1, const tarn_gpu_event_list_t* events = nullptr) {
    return Family::launch_1D(&status, &*queue, &native, args.data(), global, local, events);
  }
  void finish(sycl::event* launched) {
    ASSERT_NE(launched, nullptr);
    Family::host_wait(&status, launched);
    EXPECT_TRUE(is_complete(*launched));
    Family::release(&status, launched);
  }
  static bool is_complete(const sycl::event& event) {
    return event.get_info<sycl::info::event::command_execution_status>() ==
           sycl::info::event_command_status::complete;
  }

 private:
  std::vector<memory> places_;
};

/// An event that is complete some time after it was opened.
class gate {
 public:
  explicit gate(sycl::queue& queue)
      : event_(queue.submit([this](sycl::handler& group) {
          group.host_task([wait_for = opened_.get_future().share()] { wait_for.wait(); });
        })) {}
  gate(const gate&) = delete;
  gate& operator=(const gate&) = delete;
  ~gate() { open(); }

  void open() {
    if (!open_) {
      opened_.set_value();
      event_.wait();
    }
    open_ = true;
  }
  /// On the heap, for a list of events.
  sycl::event* event() const { return new sycl::event(event_); }

 private:
  std::promise<void> opened_;
  bool open_ = false;
  sycl::event event_;
};

/// Long enough for work that nothing holds back to be seen; nothing depends on it if all is well.
inline void give_it_a_chance() {
  std::this_thread::sleep_for(std::chrono::milliseconds(30));
}
