// SPDX-License-Identifier: Apache-2.0
// Descriptions of reported calls and the steps around them.
#include "frame/verbose_call.hpp"

#include <cstdlib>
#include <cxxabi.h>
#include <memory>
#include <sstream>
#include <tarn_serv.h>

#include "verbose.hpp"

namespace kestrel::tarn::rng::detail {
namespace {

constexpr int unbound = -1;

/// The class name with its template arguments, as a person writes it.
std::string readable(const std::type_info& type) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> name(
      abi::__cxa_demangle(type.name(), nullptr, nullptr, &status), std::free);
  return status == 0 ? name.get() : type.name();
}

std::string describe(const char* form, const std::type_info& distribution,
                     const std::type_info& engine, std::int64_t n) {
  std::ostringstream text;
  text << "kestrel::tarn::rng::generate " << form
       << " call with parameters distribution = " << readable(distribution)
       << ", engine = " << readable(engine) << ", n = " << n;
  return text.str();
}

std::string with_pointer(std::string description, const void* r) {
  std::ostringstream text;
  text << description << ", r = " << r;
  return text.str();
}

}  // namespace

std::atomic<const int*> verbose_level{&unbound};

bool is_verbose_slow() {
  const int* level = tarn_serv_verbose_mode();
  verbose_level.store(level, std::memory_order_relaxed);
  return *level != 0;
}

verbose_call::verbose_call(const std::type_info& distribution, const std::type_info& engine,
                           std::int64_t n, const void* r, const sycl::queue& queue)
    : description_(with_pointer(describe("USM", distribution, engine, n), r)),
      queue_(queue),
      timed_(*tarn_serv_verbose_mode() == 2) {}

verbose_call::verbose_call(const std::type_info& distribution, const std::type_info& engine,
                           std::int64_t n, const sycl::queue& queue)
    : description_(describe("Buffer", distribution, engine, n)),
      queue_(queue),
      timed_(*tarn_serv_verbose_mode() == 2) {}

verbose_call::~verbose_call() {
  if (entered_) {
    gpu::verbose_depth_dec();
  }
}

void verbose_call::start(const std::vector<sycl::event>& dependencies) {
  if (timed_) {
    for (sycl::event dependency : dependencies) {
      dependency.wait();
    }
    seconds_ = -tarn_serv_dsecnd();
  }
  gpu::verbose_depth_inc();
  entered_ = true;
}

void verbose_call::finish(const sycl::event& event) {
  if (timed_) {
    sycl::event(event).wait();
    seconds_ += tarn_serv_dsecnd();
  }
  gpu::verbose_depth_dec();
  entered_ = false;
  report(event);
}

template <typename T>
void verbose_call::start(sycl::buffer<T, 1>& r) {
  if (timed_) {
    gpu::verbose_buffer_start(&seconds_, r);
  } else {
    gpu::verbose_depth_inc();
  }
  entered_ = true;
}

template <typename T>
void verbose_call::finish(const sycl::event& event, sycl::buffer<T, 1>& r) {
  if (timed_) {
    gpu::verbose_buffer_end(&seconds_, r);
  } else {
    gpu::verbose_depth_dec();
  }
  entered_ = false;
  report(event);
}

void verbose_call::report(const sycl::event& event) {
  gpu::verbose_register_event(event);
  gpu::print_verbose_gpu_info(&queue_, description_.c_str(), seconds_);
}

#define TARN_VERBOSE_CALL(type)                              \
  template void verbose_call::start(sycl::buffer<type, 1>&); \
  template void verbose_call::finish(const sycl::event&, sycl::buffer<type, 1>&);
TARN_VERBOSE_CALL(float)
TARN_VERBOSE_CALL(double)
TARN_VERBOSE_CALL(std::int32_t)
TARN_VERBOSE_CALL(std::uint32_t)
TARN_VERBOSE_CALL(std::uint64_t)

}  // namespace kestrel::tarn::rng::detail
