// SPDX-License-Identifier: Apache-2.0
// The helper program: does the one thing named by its first argument, so that the tests can look
// at a whole process from outside.
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <string>
#include <thread>
#include <vector>

#include "tarn_serv.h"

namespace {

struct order_of_end {
  ~order_of_end() { std::puts("static object ends"); }
};

void first_function() {
  std::puts("first function");
}
void second_function() {
  std::puts("second function");
}

void register_functions() {
  tarn_serv_core_register_sycl_destructor(first_function);
  tarn_serv_core_register_sycl_destructor(nullptr);
  tarn_serv_core_register_sycl_destructor(second_function);
}

void print_values() {
  std::printf("mode %d\n", *tarn_serv_verbose_mode());
  std::printf("mode %d\n", *tarn_serv_verbose_mode());
  std::printf("file '%s'\n", tarn_serv_verbose_output_file_mode());
  std::printf("dynamic %d\n", tarn_serv_get_dynamic());
  std::printf("threads %d\n", tarn_serv_get_max_threads());
}

void print_lines() {
  tarn_serv_print_verbose_header(2);
  tarn_serv_print_verbose_info(0.5, "first(1)");
  tarn_serv_print_verbose_info(0.0, "second(2)");
  tarn_serv_print_verbose_header(1);
}

void print_from_threads() {
  std::vector<std::thread> threads;
  for (int t = 0; t < 8; ++t) {
    threads.emplace_back([] {
      for (int i = 0; i < 50; ++i) {
        tarn_serv_print_verbose_info(1e-3 / 2, "line of a thread");
      }
    });
  }
  for (auto& thread : threads) {
    thread.join();
  }
}

// Loads the core given as a path, registers a function with it, and unloads it.
void unload(const char* path) {
  void* const core = ::dlopen(path, RTLD_NOW);
  if (core == nullptr) {
    std::printf("%s\n", ::dlerror());
    return;
  }
  using registrar = void (*)(void (*)());
  reinterpret_cast<registrar>(::dlsym(core, "tarn_serv_core_register_sycl_destructor"))(
      first_function);
  std::puts("before unloading");
  ::dlclose(core);
  std::puts("after unloading");
}

// Loads the statistics library through the core, and says which one it was.
void load_statistics(void* module) {
  using teller = const char* (*)();
  const auto tell = reinterpret_cast<teller>(tarn_serv_find_symbol(module, "fake_vlx_place"));
  std::puts(module == nullptr ? "no library" : tell == nullptr ? "no entry" : tell());
}

}  // namespace

int main(int count, char** arguments) {
  const std::string task = count > 1 ? arguments[1] : "";
  if (task == "values") {
    print_values();
  } else if (task == "lines") {
    print_lines();
  } else if (task == "threads") {
    print_from_threads();
  } else if (task == "messages") {
    tarn_serv_print(std::atoi(arguments[2]), 772, 1, "'name'");
  } else if (task == "exit") {
    static order_of_end not_reached;
    register_functions();
    std::printf("no newline yet");
    tarn_serv_exit(7);
  } else if (task == "hook") {
    tarn_serv_set_exit_hook([](int code) { std::printf("hook %d\n", code); });
    tarn_serv_exit(7);
    std::puts("returned");
  } else if (task == "end") {
    static order_of_end earlier;
    register_functions();
  } else if (task == "unload") {
    unload(arguments[2]);
  } else if (task == "statistics") {
    load_statistics(tarn_serv_load_vlx());
  } else {
    return 99;
  }
  return 0;
}
