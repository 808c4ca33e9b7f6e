// SPDX-License-Identifier: Apache-2.0
// The helper program of the suite that looks at late calls from outside: it ends while the callback
// of an OpenCL event is pending. Not every driver calls one for an event that ends in an error, so
// nothing may wait for it.
#include <cstdio>
#include <string>

#include "offload/opencl_completion.hpp"
#include "omptarget.hpp"
#include "opencl_events.hpp"

int main(int count, char** arguments) {
  const std::string way = count > 1 ? arguments[1] : "";
  static auto* const interop = new omptarget::interop;
  interop->set_completion([](void*) { std::puts("told"); });
  _cl_event* const event = opencl_events::get().make();
  const int status = kestrel::tarn::rng::detail::openmp::complete_after(event, interop->handle());
  if (way == "error") {
    opencl_events::get().end(event, -5);
  }
  std::puts("main ends");
  return status;
}
