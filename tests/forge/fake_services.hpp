// SPDX-License-Identifier: Apache-2.0
// Device services that follow a script, for the self-test. They write down each call, see that the
// record's lock is held, and count what they have handed out.
#pragma once

#include <atomic>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "fake_drivers.hpp"
#include "tarn_binary_kernel_test.hpp"

namespace tarn_test {

using namespace kestrel::tarn::forge;

enum class failing { by_status, by_throwing, by_null };

class fake_services : public device_services {
 public:
  // The script.
  gpu_arch arch = gpu_arch::ash;
  bool has_device = true;
  bool has_context = true;
  bool test_passes = true;
  std::string failing_call;
  failing how = failing::by_status;
  int callers_to_await = 0;  // the test goes on when so many have asked for the record

  // The record of the device.
  int lock = 0;
  std::atomic<bool> checked{false};
  std::atomic<bool> usable{false};

  // What has happened.
  std::atomic<int> asked_for_record{0};
  std::vector<std::string> calls;  // but the one that gets the record
  std::vector<std::string> mistakes;
  int handed_out = 0;  // kernels, buffers and events that have not come back
  byte_vector binary;
  std::vector<launch_argument> arguments;

  // What the handles point to.
  int queue_object = 0;
  int kernel_object = 0;
  int ok_object = 0;
  int source_object = 0;
  int event_object = 0;

  self_test_record get_record(int* status, void* queue) override {
    ++asked_for_record;
    const bool fails = failing_call == "get_record";
    if (fails && how == failing::by_throwing) {
      throw std::runtime_error("get_record");
    }
    if (fails && how == failing::by_status && *status == 0) {
      *status = -6;
    }
    const bool known = queue == &queue_object && !fails;
    return {known ? &lock : nullptr, &checked, &usable, arch};
  }

  void get_cl_device_context(int* status, void* queue, cl_device_id* device,
                             cl_context* context) override {
    expect(queue == &queue_object, "queue");
    while (asked_for_record < callers_to_await) {
      std::this_thread::yield();
    }
    if (succeeds("get_cl_device_context", status)) {
      *device = has_device ? reinterpret_cast<cl_device_id>(&device_object) : nullptr;
      *context = has_context ? reinterpret_cast<cl_context>(&context_object) : nullptr;
    }
  }

  const opencl_calls& opencl() override { return fake_opencl; }

  void* get_binary_kernel(int* status, void* queue, int domain, const binary_kernel& kernel,
                          const char* kernel_name) override {
    expect(queue == &queue_object, "queue");
    expect(domain == 0, "domain");
    expect(kernel.dummy_source == nullptr, "dummy_source");
    expect(std::string(kernel.build_options).empty(), "build_options");
    expect(std::string(kernel_name) == "binary_test", "kernel_name");
    const auto* const bytes = static_cast<const std::uint8_t*>(kernel.code);
    binary.assign(bytes, bytes + kernel.code_size);
    return hand_out("get_binary_kernel", status, kernel_object);
  }

  void* calloc_temp_buffer(int* status, void* queue, std::size_t bytes) override {
    expect(queue == &queue_object, "queue");
    expect(bytes == 4, "bytes");
    const bool first = calls.empty() || calls.back() != "calloc_temp_buffer 1";
    return first ? hand_out("calloc_temp_buffer 1", status, ok_object)
                 : hand_out("calloc_temp_buffer 2", status, source_object);
  }

  void write_buffer(int* status, void* queue, void* buffer, std::uint32_t value) override {
    expect(queue == &queue_object, "queue");
    expect(buffer == &source_object, "buffer to write");
    expect(value == 0xABADFEED, "value to write");
    succeeds("write_buffer", status);
  }

  bool is_non_zero(int* status, void* queue, void* buffer) override {
    expect(queue == &queue_object, "queue");
    expect(buffer == &ok_object, "buffer to read");
    return succeeds("is_non_zero", status) && test_passes;
  }

  void* launch_kernel_3D(int* status, void* queue, void* kernel, const launch_arguments& given,
                         const std::size_t* global, const std::size_t* local) override {
    expect(queue == &queue_object, "queue");
    expect(kernel == &kernel_object, "kernel");
    for (const std::size_t* const size : {global, local}) {
      expect(size[0] == 4 && size[1] == 2 && size[2] == 1, "size");
    }
    arguments.assign(given.begin(), given.end());
    return hand_out("launch_kernel_3D", status, event_object);
  }

  void host_wait(int* status, void* event) override {
    expect(event == &event_object, "event");
    succeeds("host_wait", status);
  }
  void release_event(int* status, void* event) override {
    take_back("release_event", status, event == &event_object);
  }
  void free_buffer(int* status, void* buffer) override {
    const bool is_ok = buffer == &ok_object;
    take_back(is_ok ? "free_buffer 1" : "free_buffer 2", status, is_ok || buffer == &source_object);
  }
  void release_kernel(int* status, void* kernel) override {
    take_back("release_kernel", status, kernel == &kernel_object);
  }

 private:
  void expect(bool fact, const char* what) {
    if (!fact) {
      mistakes.emplace_back(what);
    }
  }

  // Notes a call and fails if the script says so.
  bool succeeds(const char* name, int* status) {
    expect(__atomic_load_n(&lock, __ATOMIC_RELAXED) != 0, "the record's lock is not held");
    calls.emplace_back(name);
    if (failing_call != name) {
      return true;
    }
    if (how == failing::by_throwing) {
      throw std::runtime_error(name);
    }
    if (how == failing::by_status && *status == 0) {
      *status = -2001;
    }
    return false;
  }

  void* hand_out(const char* name, int* status, int& object) {
    if (!succeeds(name, status)) {
      return nullptr;
    }
    ++handed_out;
    return &object;
  }

  // What comes back is gone even if that fails.
  void take_back(const char* name, int* status, bool known) {
    expect(known, name);
    --handed_out;
    succeeds(name, status);
  }
};

}  // namespace tarn_test
