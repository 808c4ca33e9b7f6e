// SPDX-License-Identifier: Apache-2.0
// A program that binds one runtime, since a process binds it once:
//   binding_child <runtime> <action>
// The runtimes are opencl, level_zero and openmp; the actions are functions below.
#include <algorithm>
#include <atomic>
#include <cstdint>
#include <cstdio>
#include <dlfcn.h>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <tarn_level_zero.h>
#include <tarn_serv.h>
#include <thread>
#include <type_traits>
#include <vector>

#include "level_zero_binding.hpp"
#include "opencl_binding.hpp"
#include "openmp_binding.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

using result = std::optional<std::intptr_t>;  // nothing: the function gives nothing back

template <class Result, class... Argument>
result call_with_nothing(Result (*function)(Argument...)) {
  if constexpr (std::is_void_v<Result>) {
    function(Argument{}...);
    return {};
  } else if constexpr (std::is_pointer_v<Result>) {
    return reinterpret_cast<std::intptr_t>(function(Argument{}...));
  } else {
    return static_cast<std::intptr_t>(function(Argument{}...));
  }
}

struct entry {
  const char* name;
  std::function<result()> call;
};

/// An entry of the name of a function, which may differ from that of the one that is called.
template <class Function>
entry make(const char* name, Function* function) {
  return {name, [function] { return call_with_nothing(function); }};
}

struct runtime {
  gpu::binding_record& record;
  int (*bind)();
  std::vector<entry> entries;
};

runtime runtime_of(const std::string& name) {
  if (name == "opencl") {
    return {gpu::opencl_runtime::record,
            gpu::bind_opencl,
            {
#define TARN_NAME(function) make(#function, gpu::cl::function),
#include "opencl_names.def"
            }};
  }
  if (name == "level_zero") {
    return {
        gpu::level_zero_runtime::record,
        gpu::bind_level_zero,
        {make("zeDeviceGetProperties", tarn_zeDeviceGetProperties),
         make("zeDeviceGetSubDevices", tarn_zeDeviceGetSubDevices),
         make("zeModuleCreate", tarn_zeModuleCreate), make("zeKernelCreate", tarn_zeKernelCreate),
         make("zeModuleDestroy", tarn_zeModuleDestroy),
         make("zeModuleGetNativeBinary", tarn_zeModuleGetNativeBinary)}};
  }
  return {gpu::openmp_runtime::record,
          gpu::bind_openmp,
          {
#define TARN_NAME(function) make(#function, gpu::omp_interop::function),
#include "openmp_names.def"
          }};
}

std::string text_of(const result& got) {
  return got ? std::to_string(*got) : "nothing";
}

void keep_alive(int code) {
  std::printf("kept alive, not ended with %d\n", code);
}

// What binding gives, twice; then a 1 for each pointer that is there.
void bind(const runtime& tested) {
  const int first = tested.bind();
  const int second = tested.bind();
  std::string found;
  for (std::size_t i = 0; i < tested.record.size; ++i) {
    found += tested.record.functions[i].load() != nullptr ? '1' : '0';
  }
  std::printf("%d %d state %d\n%s\n", first, second, static_cast<int>(tested.record.state.load()),
              found.c_str());
}

void bind_both(const runtime&) {
  std::printf("%d\n", gpu::bind_opencl_and_openmp());
}

void call_first(const runtime& tested) {
  tested.entries.front().call();
  std::puts("the process goes on");
}

void call_all(const runtime& tested) {
  tarn_serv_set_exit_hook(keep_alive);
  for (const entry& one : tested.entries) {
    const std::string got = text_of(one.call());
    std::printf("%s %s\n", one.name, got.c_str());
  }
}

// How often each function of a stub was called, and with which first argument.
void call_all_and_count(const runtime& tested) {
  call_all(tested);
  void* const stub = dlopen(tested.record.library, RTLD_NOW | RTLD_NOLOAD);
  const auto* const calls = static_cast<const int*>(dlsym(stub, "stub_calls"));
  const auto* const arguments = static_cast<const unsigned*>(dlsym(stub, "stub_arguments"));
  for (std::size_t i = 0; i < tested.record.size; ++i) {
    std::printf("%s called %d with %u\n", tested.record.names[i], calls[i], arguments[i]);
  }
}

// All functions from 16 threads that start together; how many threads had the same results, and the
// results.
void call_from_threads(const runtime& tested) {
  constexpr std::size_t count = 16;
  tarn_serv_set_exit_hook([](int) {});
  std::atomic<std::size_t> waiting{count};
  std::vector<std::vector<result>> results(count);
  std::vector<std::thread> threads;
  for (std::size_t t = 0; t < count; ++t) {
    threads.emplace_back([&, t] {
      --waiting;
      while (waiting.load() != 0) {
        std::this_thread::yield();
      }
      for (const entry& one : tested.entries) {
        results[t].push_back(one.call());
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  std::printf("%td threads:", std::count(results.begin(), results.end(), results.front()));
  for (const result& got : results.front()) {
    std::printf(" %s", text_of(got).c_str());
  }
  std::puts("");
}

const std::map<std::string, void (*)(const runtime&)> actions = {
    {"bind", bind},
    {"bind_both", bind_both},
    {"call_first", call_first},
    {"call_all", call_all},
    {"call_all_and_count", call_all_and_count},
    {"call_from_threads", call_from_threads}};

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3 || actions.count(argv[2]) == 0) {
    return 99;
  }
  actions.at(argv[2])(runtime_of(argv[1]));
  return 0;
}
