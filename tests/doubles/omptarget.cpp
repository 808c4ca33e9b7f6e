// SPDX-License-Identifier: Apache-2.0
// The double of the OpenMP offload runtime: what interop objects answer, by the return codes of
// OpenMP 5.1, section 3.12 (omp_interop_rc_t).
#include "omptarget.hpp"

#include <atomic>
#include <cstring>
#include <map>
#include <mutex>
#include <set>
#include <string>
#include <variant>

namespace {

constexpr int success = 0;
constexpr int no_value = 1;
constexpr int empty = -1;
constexpr int type_codes[] = {-3, -4, -5};  // the property is an integer, a pointer, a text

struct native_property {
  int status;
  void* value;
};

using omp_value = std::variant<std::intptr_t, void*, std::string>;

struct omp_property {
  int status;  // where its type is asked for
  omp_value value;
};

struct interop_object {
  std::map<int, native_property> native;
  std::map<int, omp_property> omp;
};

enum function { tgt_property, omp_int, omp_ptr, omp_str, functions };
constexpr const char* function_names[functions] = {"__tgt_get_interop_property",
                                                   "omp_get_interop_int", "omp_get_interop_ptr",
                                                   "omp_get_interop_str"};

struct runtime_state {
  std::mutex mutex;
  std::set<interop_object*> living;
  int calls[functions] = {};
  int mistakes = 0;
};

// Never destroyed: threads of the program under test may call at its end.
runtime_state& runtime() {
  static auto* const state = new runtime_state;
  return *state;
}

/// Counts the call; the object, or null if there is none.
interop_object* enter(function called, const void* handle) {
  ++runtime().calls[called];
  for (interop_object* const object : runtime().living) {
    if (object == handle) {
      return object;
    }
  }
  ++runtime().mistakes;
  return nullptr;
}

/// The property as a T, or null.
template <typename T>
const T* find(function called, const void* handle, int property, int* status) {
  int ignored = 0;
  int& code = status != nullptr ? *status : ignored;
  const interop_object* const object = enter(called, handle);
  if (object == nullptr) {
    code = empty;
    return nullptr;
  }
  const auto found = object->omp.find(property);
  if (found == object->omp.end()) {
    code = no_value;
    return nullptr;
  }
  const T* const value = std::get_if<T>(&found->second.value);
  code = value != nullptr ? found->second.status : type_codes[found->second.value.index()];
  return value;
}

interop_object* object_of(void* handle) {
  return static_cast<interop_object*>(handle);
}

template <typename T>
void set_omp(void* handle, int property, T value) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  object_of(handle)->omp[property] = {success, omp_value(value)};
}

void fail_int(void* handle, int property, int status, std::intptr_t value) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  object_of(handle)->omp[property] = {status, omp_value(value)};
}

void* make() {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  return *runtime().living.insert(new interop_object).first;
}

void end(void* handle) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  runtime().living.erase(object_of(handle));
  delete object_of(handle);
}

void set_native(void* handle, int property, int status, void* value) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  object_of(handle)->native[property] = {status, value};
}

void set_str(void* handle, int property, const char* value) {
  set_omp(handle, property, std::string(value));
}

bool calls(const char* name, int* number) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  for (int i = 0; i < functions; ++i) {
    if (std::strcmp(function_names[i], name) == 0) {
      *number = runtime().calls[i];
      return true;
    }
  }
  return false;
}

int mistakes() {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  return runtime().mistakes;
}

}  // namespace

#define TARN_SHOWN extern "C" __attribute__((visibility("default")))

TARN_SHOWN const omptarget::controls omptarget_controls;
const omptarget::controls omptarget_controls = {
    make,     end,   set_native, set_omp<std::intptr_t>, set_omp<void*>, set_str,
    fail_int, calls, mistakes};

TARN_SHOWN int __tgt_get_interop_property(void* interop, int property, void** value) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  const interop_object* const object = enter(tgt_property, interop);
  if (object == nullptr) {
    return -1;
  }
  const auto found = object->native.find(property);
  if (found == object->native.end()) {
    return -1;
  }
  if (found->second.status == success || found->second.value != nullptr) {
    *value = found->second.value;
  }
  return found->second.status;
}

TARN_SHOWN std::intptr_t omp_get_interop_int(const void* interop, int property, int* status) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  const auto* const value = find<std::intptr_t>(omp_int, interop, property, status);
  return value != nullptr ? *value : 0;
}

TARN_SHOWN void* omp_get_interop_ptr(const void* interop, int property, int* status) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  const auto* const value = find<void*>(omp_ptr, interop, property, status);
  return value != nullptr ? *value : nullptr;
}

TARN_SHOWN const char* omp_get_interop_str(const void* interop, int property, int* status) {
  const std::lock_guard<std::mutex> guard(runtime().mutex);
  const auto* const value = find<std::string>(omp_str, interop, property, status);
  return value != nullptr ? value->c_str() : nullptr;
}
