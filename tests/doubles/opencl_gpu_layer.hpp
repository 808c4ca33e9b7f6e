// SPDX-License-Identifier: Apache-2.0
// The controls of an OpenCL layer for tests. A loader puts the layer between the program and the
// drivers when OPENCL_LAYERS names it: it makes a driver's CPU a GPU, so that the roads of GPUs can
// be walked on any machine, counts calls and living objects, and lets calls fail on demand.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <dlfcn.h>
#include <stdexcept>
#include <string>

namespace opencl_layer {

/// What a program owns references to. A sub-device counts, a device that has no parent does not.
enum class object { context, queue, buffer, svm_block, program, kernel, event, sub_device };

/// What the layer exports, as "opencl_layer_controls".
struct controls {
  bool (*fail)(const char* function, int after, int code, bool always);
  bool (*calls)(const char* function, int* number);
  int (*objects)(object kind);
  void (*answer)(unsigned info, const void* bytes, std::size_t size);
  void (*answer_fails)(unsigned info, int code);
  void (*take_source_as_il)(bool on);
  void (*fail_commands)(int code);
  void (*shift_clock)(std::int64_t nanoseconds);
  void (*reset)();
};

/// The layer that OPENCL_LAYERS names; null when there is none.
inline const controls* find() {
  static const auto* const found = [] {
    const char* const path = std::getenv("OPENCL_LAYERS");
    void* const layer = path == nullptr ? nullptr : dlopen(path, RTLD_NOW);
    return static_cast<const controls*>(layer == nullptr ? nullptr
                                                         : dlsym(layer, "opencl_layer_controls"));
  }();
  return found;
}

inline const controls& get() {
  if (find() == nullptr) {
    throw std::runtime_error("OPENCL_LAYERS names no layer for tests");
  }
  return *find();
}

inline void require(bool known, const char* function) {
  if (!known) {
    throw std::invalid_argument(std::string("the layer does not know ") + function);
  }
}

/// The call that comes after `after` others from now on fails once with `code`, and the driver does
/// not hear of it. A function that makes something gives null and the code.
inline void fail(const char* function, int after, int code) {
  require(get().fail(function, after, code, false), function);
}
/// All calls from now on fail.
inline void fail_always(const char* function, int code) {
  require(get().fail(function, 0, code, true), function);
}

/// How often the program has called a function, in vain or not.
inline int calls(const char* function) {
  int number = 0;
  require(get().calls(function, &number), function);
  return number;
}

/// References that the program owns: what was made and retained, less what was released.
inline int objects(object kind) {
  return get().objects(kind);
}

/// What clGetDeviceInfo says from now on, of every device.
template <typename T>
void answer(unsigned info, const T& value) {
  get().answer(info, &value, sizeof value);
}
inline void answer_fails(unsigned info, int code) {
  get().answer_fails(info, code);
}

/// clCreateProgramWithIL takes OpenCL C, for drivers that know no intermediate language.
inline void take_source_as_il(bool on) {
  get().take_source_as_il(on);
}

/// Commands end with a code, which is negative, as the program is told: they do their work all the
/// same, and no command that comes after them fails for it.
inline void fail_commands(int code) {
  get().fail_commands(code);
}

/// The clocks of the devices go ahead by so much, of times that are told from now on.
inline void shift_clock(std::int64_t nanoseconds) {
  get().shift_clock(nanoseconds);
}

/// Forgets failures and answers; numbers stay.
inline void reset() {
  get().reset();
}

}  // namespace opencl_layer
