// SPDX-License-Identifier: Apache-2.0
// The three endings of a call.
#include "finish.hpp"

#include <memory>
#include <thread>
#include <utility>

#include "background.hpp"
#include "guard.hpp"
#include "opencl_completion.hpp"
#include "service/opencl_binding.hpp"
#include "service/sycl_extensions.hpp"
#include "statuses.hpp"

namespace kestrel::tarn::rng::detail::openmp {
namespace {

using owned_generator = std::unique_ptr<void, void (*)(void*)>;

/// What a detached thread has to do. The caller is told that the call has ended even if the wait
/// failed: a task that waits for this would never end.
struct pending_call {
  sycl::event kernels;
  owned_generator generator;
  void* interop;

  void see_to_the_end() {
    guarded([this] {
      kernels.wait();
      return done;
    });
    generator.reset();
    complete(interop);
  }
};

/// On this thread if there is no memory or no thread, or if the process has done its waiting.
void finish_by_thread(pending_call call) {
  std::shared_ptr<pending_call> pending;
  bool announced = false;
  try {
    pending = std::make_shared<pending_call>(std::move(call));
    announced = announce_background_work();
    if (announced) {
      std::thread([pending]() mutable {
        const background_work scope;
        pending->see_to_the_end();
        pending.reset();
      }).detach();
      return;
    }
  } catch (...) {
    if (announced) {
      withdraw_background_work();
    }
  }
  (pending != nullptr ? *pending : call).see_to_the_end();
}

int finish_by_callback(sycl::event& kernels, void* interop) {
  const auto event = static_cast<cl_event>(service::native_of(kernels));
  if (event == nullptr) {  // nothing was left for the device to do
    kernels.wait();
    complete(interop);
    return done;
  }
  const int status = complete_after(event, interop);
  tarn::gpu::cl::clReleaseEvent(event);
  if (status != done) {
    kernels.wait();
  }
  return status;
}

}  // namespace

int finish(sycl::event kernels, owned_generator generator, void* interop, ending how) {
  switch (how) {
    case ending::by_thread:
      finish_by_thread({std::move(kernels), std::move(generator), interop});
      return done;
    case ending::by_callback:
      generator.reset();
      return finish_by_callback(kernels, interop);
    default:
      kernels.wait();
      return done;
  }
}

}  // namespace kestrel::tarn::rng::detail::openmp
