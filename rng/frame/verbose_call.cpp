// SPDX-License-Identifier: Apache-2.0
// The steps around a reported call, and its description.
#include "frame/verbose_call.hpp"

#include <cstdlib>
#include <cxxabi.h>
#include <memory>
#include <sstream>
#include <string>
#include <tarn_serv.h>

#include "verbose.hpp"

namespace kestrel::tarn::rng::detail {
namespace {

constexpr int unbound = -1;
constexpr int timed_level = 2;

/// The class name with its template arguments, as a person writes it.
std::string readable(const std::type_info& type) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> name(
      abi::__cxa_demangle(type.name(), nullptr, nullptr, &status), std::free);
  return status == 0 ? name.get() : type.name();
}

std::ostringstream description_of(const char* form, const reported_call& call) {
  std::ostringstream text;
  text << "kestrel::tarn::rng::generate " << form
       << " call with parameters distribution = " << readable(call.distribution)
       << ", engine = " << readable(call.engine) << ", n = " << call.n;
  return text;
}

/// Leaves one level of nesting when an exception passes.
class nesting_guard {
 public:
  nesting_guard() = default;
  nesting_guard(const nesting_guard&) = delete;
  nesting_guard& operator=(const nesting_guard&) = delete;
  ~nesting_guard() {
    if (armed_) {
      gpu::verbose_depth_dec();
    }
  }
  void disarm() { armed_ = false; }

 private:
  bool armed_ = true;
};

void report(sycl::queue queue, const std::string& description, const sycl::event& event,
            double seconds) {
  gpu::verbose_register_event(event);
  gpu::print_verbose_gpu_info(&queue, description.c_str(), seconds);
}

}  // namespace

std::atomic<const int*> verbose_level{&unbound};

bool is_verbose_slow() {
  const int* level = tarn_serv_verbose_mode();
  verbose_level.store(level, std::memory_order_relaxed);
  return *level != 0;
}

sycl::event run_reported(const reported_call& call, const void* r,
                         const std::vector<sycl::event>& dependencies) {
  std::ostringstream description = description_of("USM", call);
  description << ", r = " << r;
  const bool timed = *tarn_serv_verbose_mode() == timed_level;
  double seconds = 0.0;
  if (timed) {
    for (sycl::event dependency : dependencies) {
      dependency.wait();
    }
    seconds = -tarn_serv_dsecnd();
  }
  gpu::verbose_depth_inc();
  nesting_guard guard;
  sycl::event event = call.run(call.frame);
  if (timed) {
    event.wait();
    seconds += tarn_serv_dsecnd();
  }
  guard.disarm();
  gpu::verbose_depth_dec();
  report(call.queue, description.str(), event, seconds);
  return event;
}

template <typename T>
void run_reported(const reported_call& call, sycl::buffer<T, 1>& r) {
  const std::string description = description_of("Buffer", call).str();
  const bool timed = *tarn_serv_verbose_mode() == timed_level;
  double seconds = 0.0;
  if (timed) {
    gpu::verbose_buffer_start(&seconds, r);
  } else {
    gpu::verbose_depth_inc();
  }
  nesting_guard guard;
  const sycl::event event = call.run(call.frame);
  if (timed) {
    gpu::verbose_buffer_end(&seconds, r);
  } else {
    gpu::verbose_depth_dec();
  }
  guard.disarm();
  report(call.queue, description, event, seconds);
}

#define TARN_RESULT_TYPE(type) \
  template void run_reported(const reported_call&, sycl::buffer<type, 1>&);
#include "result_types.def"

}  // namespace kestrel::tarn::rng::detail
