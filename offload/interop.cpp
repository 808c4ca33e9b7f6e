// SPDX-License-Identifier: Apache-2.0
// Properties of interop objects, by the numbers of the offload runtime.
#include "interop.hpp"

#include <cstdint>
#include <cstdlib>

#include "service/interop_cache.hpp"
#include "service/openmp_binding.hpp"
#include "service/sycl_extensions.hpp"
#include "statuses.hpp"

namespace kestrel::tarn::rng::detail::openmp {
namespace {

enum interop_property : int {
  foreign_runtime = -1,  // omp_ipr_fr_id of OpenMP 5.1, section 3.12
  nowait = 2,            // a pointer to a byte
  completion = 4         // a completion_function, below
};

/// Identifiers of foreign runtimes (OpenMP Additional Definitions, 2.0); 0 is none.
enum foreign_runtime_id : std::intptr_t {
  no_runtime = 0,
  opencl = 3,
  sycl_runtime = 4,
  level_zero = 6
};

/// Null for a property that is missing.
void* property(void* interop, int number) {
  void* value = nullptr;
  return interop != nullptr &&
                 gpu::omp_interop::__tgt_get_interop_property(interop, number, &value) == 0
             ? value
             : nullptr;
}

std::intptr_t runtime_of(void* interop) {
  int failure = 0;
  const std::intptr_t id = interop == nullptr ? no_runtime
                                              : gpu::omp_interop::omp_get_interop_int(
                                                    interop, foreign_runtime, &failure);
  return failure == 0 ? id : no_runtime;
}

/// The offload runtime has been told to use shared virtual memory, which this library's road over
/// OpenCL does not take.
bool uses_svm() {
  const char* const set = std::getenv("LIBOMPTARGET_OPENCL_USE_SVM");
  return set != nullptr && set[0] == '1';
}

int judge(std::intptr_t runtime) {
  switch (runtime) {
    case no_runtime:
      return no_device;
    case opencl:
      return uses_svm() ? unserved_backend : done;
    case sycl_runtime:
    case level_zero:
      return done;
    default:
      return unserved_backend;
  }
}

using completion_function = void (*)(void* interop);

completion_function completion_of(void* interop) {
  return reinterpret_cast<completion_function>(property(interop, completion));
}

}  // namespace

void complete(void* interop) {
  if (const completion_function told = completion_of(interop)) {
    told(interop);
  }
}

bool is_nowait(void* interop) {
  const auto* const flag = static_cast<const unsigned char*>(property(interop, nowait));
  return flag != nullptr && *flag != 0 && completion_of(interop) != nullptr;
}

interop_queue queue_of(void* interop) {
  const std::intptr_t runtime = runtime_of(interop);
  const int status = judge(runtime);
  if (status != done) {
    return {status, nullptr, false};
  }
  sycl::queue* const queue = tarn::gpu::lookup_and_cache_lumen_queue_and_context(interop);
  if (queue == nullptr) {
    return {no_device, nullptr, false};
  }
  const bool is_opencl =
      service::code_of(queue->get_device().get_backend()) == service::backend_code::opencl;
  return {done, queue, runtime == opencl && is_opencl};
}

}  // namespace kestrel::tarn::rng::detail::openmp
