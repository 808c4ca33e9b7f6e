// SPDX-License-Identifier: Apache-2.0
// The device services that the self-test runs on, in both layers.
#include "have_binary_kernels.hpp"

#include <atomic>
#include <cstring>
#include <exception>
#include <memory>
#include <optional>

#include <kestrel/tarn/gpu/kernel.hpp>
#include <kestrel/tarn/gpu/launch.hpp>

#include "detection_calls.hpp"
#include "first_status.hpp"
#include "opencl_binding.hpp"
#include "tarn_binary_kernel_test.hpp"
#include "tarn_gpu_int.hpp"
#include "tarn_sycl_device.hpp"

namespace kestrel::tarn::gpu {
namespace {

forge::self_test_record part_of(device_record& record) {
  return {&record.lock, &record.binary_checked, &record.binary_usable,
          static_cast<forge::gpu_arch>(record.arch)};
}

tarn_gpu_binary_kernel_t descriptor_of(const forge::binary_kernel& binary) {
  return {binary.code_size, binary.code, binary.dummy_source, binary.build_options};
}

tarn_gpu_access_t access_of(const forge::launch_argument& argument) {
  return static_cast<tarn_gpu_access_t>(argument.access);
}

/// Objects of the services are void pointers; a queue is a `Queue`.
template <typename Queue>
class services_on : public forge::device_services {
 public:
  const forge::opencl_calls& opencl() override { return bound_detection_calls().opencl; }

 protected:
  static Queue* queue_of(void* queue) { return static_cast<Queue*>(queue); }
};

class c_services final : public services_on<_cl_command_queue> {
 public:
  forge::self_test_record get_record(int* status, void* queue) override {
    device_record* const record = c_layer::record_with_arch(status, queue_of(queue));
    return record == nullptr ? forge::self_test_record{} : part_of(*record);
  }

  void get_cl_device_context(int* status, void* queue, cl_device_id* device,
                             cl_context* context) override {
    tarn_gpu_get_cl_device_context(status, queue_of(queue), device, context);
  }

  void* get_binary_kernel(int* status, void* queue, int domain, const forge::binary_kernel& binary,
                          const char* kernel_name) override {
    const tarn_gpu_binary_kernel_t descriptor = descriptor_of(binary);
    return tarn_serv_gpu_get_binary_kernel(status, queue_of(queue), domain, &descriptor,
                                           kernel_name);
  }

  void* calloc_temp_buffer(int* status, void* queue, std::size_t bytes) override {
    return tarn_serv_gpu_calloc_temp_buffer(status, queue_of(queue), bytes);
  }

  void write_buffer(int* status, void* queue, void* buffer, std::uint32_t value) override {
    keep_first(status,
               cl::clEnqueueWriteBuffer(queue_of(queue), static_cast<cl_mem>(buffer), CL_TRUE, 0,
                                        sizeof value, &value, 0, nullptr, nullptr));
  }

  bool is_non_zero(int* status, void* queue, void* buffer) override {
    std::uint32_t word = 0;
    keep_first(status,
               cl::clEnqueueReadBuffer(queue_of(queue), static_cast<cl_mem>(buffer), CL_TRUE, 0,
                                       sizeof word, &word, 0, nullptr, nullptr));
    return word != 0;
  }

  void* launch_kernel_3D(int* status, void* queue, void* handle,
                         const forge::launch_arguments& arguments, const std::size_t* global,
                         const std::size_t* local) override {
    tarn_gpu_argument_t records[forge::test_argument_count];
    for (std::size_t i = 0; i < arguments.size(); ++i) {
      const forge::launch_argument& argument = arguments[i];
      if (argument.buffer != nullptr) {
        tarn_serv_gpu_set_buffer_arg(&records[i], static_cast<cl_mem>(argument.buffer),
                                     access_of(argument));
      } else {
        tarn_serv_gpu_set_scalar_arg_internal(&records[i], &argument.value,
                                              static_cast<int>(argument.size));
      }
    }
    void* const kernel = static_cast<tarn_gpu_kernel_struct_t*>(handle)->kernel;
    return tarn_serv_gpu_launch_kernel_3D(status, queue_of(queue), static_cast<cl_kernel>(kernel),
                                          records, global, local, nullptr);
  }

  void host_wait(int* status, void* event) override {
    tarn_serv_gpu_host_wait(status, static_cast<cl_event>(event));
  }
  void release_event(int* status, void* event) override {
    tarn_serv_gpu_release_event(status, static_cast<cl_event>(event));
  }
  void free_buffer(int* status, void* buffer) override {
    tarn_serv_gpu_free_buffer(status, static_cast<cl_mem>(buffer));
  }
  void release_kernel(int* status, void* handle) override {
    tarn_serv_gpu_release_kernel(status, static_cast<tarn_gpu_kernel_struct_t*>(handle));
  }
};

/// What fails late belongs to the test: its work goes to a queue of its own, whose errors are
/// thrown while somebody waits for them. Those of the caller's queue are the caller's.
class sycl_services final : public services_on<sycl::queue> {
 public:
  ~sycl_services() override { *listening_ = false; }

  forge::self_test_record get_record(int*, void* queue) override {
    return part_of(record_with_arch(*queue_of(queue)));
  }

  void get_cl_device_context(int* status, void* queue, cl_device_id* device,
                             cl_context* context) override {
    tarn_gpu_get_cl_device_context(status, queue_of(queue), device, context);
  }

  void* get_binary_kernel(int* status, void* queue, int domain, const forge::binary_kernel& binary,
                          const char* kernel_name) override {
    const tarn_gpu_binary_kernel_t descriptor = descriptor_of(binary);
    return gpu::get_binary_kernel(status, queue_of(queue), domain, &descriptor, kernel_name);
  }

  void* calloc_temp_buffer(int* status, void* queue, std::size_t bytes) override {
    return gpu::calloc_temp_buffer(status, own_queue(queue), bytes);
  }

  void write_buffer(int*, void*, void* buffer, std::uint32_t value) override {
    const auto bytes = buffer_of(buffer)->get_host_access(sycl::write_only);
    std::memcpy(&bytes[0], &value, sizeof value);
  }

  bool is_non_zero(int*, void*, void* buffer) override {
    return buffer_of(buffer)->get_host_access(sycl::read_only)[0] != 0;
  }

  void* launch_kernel_3D(int* status, void* queue, void* handle,
                         const forge::launch_arguments& arguments, const std::size_t* global,
                         const std::size_t* local) override {
    tarn_gpu_argument_t records[forge::test_argument_count];
    for (std::size_t i = 0; i < arguments.size(); ++i) {
      const forge::launch_argument& argument = arguments[i];
      if (argument.buffer != nullptr) {
        set_buffer_arg(&records[i], buffer_of(argument.buffer), access_of(argument));
      } else {
        set_scalar_arg_internal(&records[i], &argument.value, argument.size);
      }
    }
    return gpu::launch_kernel_3D(status, own_queue(queue),
                                 static_cast<tarn_gpu_kernel_struct_t*>(handle)->kernel, records,
                                 global, local, nullptr);
  }

  void host_wait(int* status, void* event) override {
    gpu::host_wait(status, static_cast<sycl::event*>(event));
    own_->wait_and_throw();
  }
  void release_event(int* status, void* event) override {
    gpu::release_event(status, static_cast<sycl::event*>(event));
  }
  void free_buffer(int* status, void* buffer) override {
    gpu::free_buffer(status, buffer_of(buffer));
  }
  void release_kernel(int* status, void* handle) override {
    gpu::release_kernel(status, static_cast<tarn_gpu_kernel_struct_t*>(handle));
  }

 private:
  static sycl::buffer<char, 1>* buffer_of(void* buffer) {
    return static_cast<sycl::buffer<char, 1>*>(buffer);
  }

  sycl::queue* own_queue(void* queue) {
    if (!own_) {
      const sycl::queue& given = *queue_of(queue);
      own_.emplace(given.get_context(), given.get_device(),
                   [listening = listening_](const sycl::exception_list& errors) {
                     if (*listening && errors.size() != 0) {
                       std::rethrow_exception(*errors.begin());
                     }
                   });
    }
    return &*own_;
  }

  std::shared_ptr<std::atomic<bool>> listening_ = std::make_shared<std::atomic<bool>>(true);
  std::optional<sycl::queue> own_;
};

}  // namespace

bool test_binary_kernels(int* status, cl_command_queue queue, forge::code_source generate) {
  c_services services;
  return forge::have_binary_kernels(status, queue, services, generate);
}

bool test_binary_kernels(int* status, sycl::queue* queue, forge::code_source generate) {
  sycl_services services;
  return forge::have_binary_kernels(status, queue, services, generate);
}

int have_binary_kernels(int* status, sycl::queue* queue) {
  return test_binary_kernels(status, queue, forge::generate_code) ? 1 : 0;
}

}  // namespace kestrel::tarn::gpu

int tarn_serv_gpu_have_binary_kernels(int* status, cl_command_queue queue) {
  using namespace kestrel::tarn;
  return gpu::test_binary_kernels(status, queue, forge::generate_code) ? 1 : 0;
}
