// SPDX-License-Identifier: Apache-2.0
// One run of the kernel "binary_test".
#include "tarn_binary_kernel_test.hpp"

#include <exception>
#include <tarn_serv.h>

#include "exceptions.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr std::size_t word_bytes = 4;

/// Holds what the test has got from the services, and what has become of it.
class self_test {
 public:
  self_test(void* queue, device_services& services) : services_(services), queue_(queue) {}

  void run(gpu_arch arch, code_source generate) {
    attempt([&] { test(arch, generate); });
    release();
  }

  bool usable() const { return passed_ && !failed(); }
  bool deserves_warning() const { return failed() || (offered_ && !passed_); }

 private:
  bool failed() const { return threw_ || status_ != 0; }

  template <typename Step>
  void attempt(Step step) {
    try {
      step();
    } catch (const std::exception&) {
      threw_ = true;
    }
  }

  void require_success() const {
    if (status_ != 0) {
      throw opencl_error(status_);
    }
  }

  void* required(void* object) const {
    require_success();
    if (object == nullptr) {
      throw invalid_object_exception();
    }
    return object;
  }

  void test(gpu_arch arch, code_source generate) {
    cl_device_id device = nullptr;
    cl_context context = nullptr;
    services_.get_cl_device_context(&status_, queue_, &device, &context);
    require_success();
    if (device == nullptr || context == nullptr) {
      return;
    }
    binary_ =
        generate_binary(arch, {services_.opencl(), context, device}, generate, process_formats());
    offered_ = !binary_.empty();
    if (offered_) {
      launch();
    }
  }

  void launch() {
    const binary_kernel binary{binary_.size(), binary_.data(), nullptr, ""};
    kernel_ = services_.get_binary_kernel(&status_, queue_, 0, binary, "binary_test");
    required(kernel_);
    ok_ = services_.calloc_temp_buffer(&status_, queue_, word_bytes);
    required(ok_);
    source_ = services_.calloc_temp_buffer(&status_, queue_, word_bytes);
    required(source_);
    services_.write_buffer(&status_, queue_, source_, 0xABADFEED);
    require_success();
    const std::size_t size[] = {4, 2, 1};  // the kernel expects these, too
    event_ = services_.launch_kernel_3D(&status_, queue_, kernel_, arguments(), size, size);
    services_.host_wait(&status_, required(event_));
    require_success();
    passed_ = services_.is_non_zero(&status_, queue_, ok_);
  }

  /// In the order of the kernel's interface, with the values that it expects.
  launch_arguments arguments() const {
    const auto scalar = [](std::uint64_t value, std::uint32_t size) {
      return launch_argument{nullptr, buffer_access::read_write, value, size};
    };
    return {scalar(0xBEEFCAFE, 4),
            scalar(0x3141592653589793, 8),
            scalar(0xBEAD, 2),
            scalar(0xFACE, 2),
            scalar(0x0123456789ABCDEF, 8),
            scalar(0xFEDCBA9876543210, 8),
            launch_argument{source_, buffer_access::read, 0, 0},
            launch_argument{ok_, buffer_access::read_write, 0, 0}};
  }

  /// Each by itself: what one release throws keeps no other from taking place.
  void release() {
    if (event_ != nullptr) {
      attempt([&] { services_.release_event(&status_, event_); });
    }
    for (void* const buffer : {ok_, source_}) {
      if (buffer != nullptr) {
        attempt([&] { services_.free_buffer(&status_, buffer); });
      }
    }
    if (kernel_ != nullptr) {
      attempt([&] { services_.release_kernel(&status_, kernel_); });
    }
  }

  device_services& services_;
  void* queue_;
  byte_vector binary_;
  void* kernel_ = nullptr;
  void* ok_ = nullptr;
  void* source_ = nullptr;
  void* event_ = nullptr;
  int status_ = 0;
  bool threw_ = false;
  bool offered_ = false;  // there was a binary to be tested
  bool passed_ = false;
};

class record_guard {
 public:
  explicit record_guard(int* lock) : lock_(lock) { tarn_serv_lock(lock_); }
  ~record_guard() { tarn_serv_unlock(lock_); }
  record_guard(const record_guard&) = delete;
  record_guard& operator=(const record_guard&) = delete;

 private:
  int* lock_;
};

}  // namespace

bool have_binary_kernels(int* status, void* queue, device_services& services,
                         code_source generate) {
  const self_test_record record = services.get_record(status, queue);
  if (record.lock == nullptr) {
    return false;
  }
  if (*record.binary_checked) {
    return *record.binary_usable;
  }
  const record_guard guard(record.lock);
  if (!*record.binary_checked) {
    self_test test(queue, services);
    test.run(record.arch, generate);
    if (test.deserves_warning()) {
      tarn_serv_format_print(
          0,
          "TARN Warning: Incompatible OpenCL driver version. GPU performance may "
          "be reduced.\n",
          0);
    }
    *record.binary_usable = test.usable();
    *record.binary_checked = true;
  }
  return *record.binary_usable;
}

}  // namespace kestrel::tarn::forge
