// SPDX-License-Identifier: Apache-2.0
// The search for libraries of the system.
#include "native_library.hpp"

#include <cstdio>
#include <cstring>
#include <dlfcn.h>
#include <tarn_serv.h>

namespace kestrel::tarn::gpu {
namespace {

using text = char[native_text_size];

int texts_lock = 0;
text first_folder = "";
text second_folder = "";
text kept_message = "";

bool is_plain_name(const char* name) {
  if (name == nullptr) {
    return false;
  }
  // The dynamic loader takes an empty name for the program itself.
  const std::size_t length = ::strnlen(name, native_text_size);
  return length > 0 && length < native_text_size && std::strpbrk(name, "/\\") == nullptr;
}

void* load(const char* folder, const char* name) {
  char path[2 * native_text_size];
  std::snprintf(path, sizeof path, "%s%s", folder, name);
  return ::dlopen(path, RTLD_NOW | RTLD_LOCAL);
}

void keep_message(const char* name) {
  const char* const reason = ::dlerror();  // of this thread
  tarn_serv_lock(&texts_lock);
  std::snprintf(kept_message, sizeof kept_message, "%s %s", reason != nullptr ? reason : "", name);
  tarn_serv_unlock(&texts_lock);
}

}  // namespace

void* load_native_library(const char* name) {
  if (!is_plain_name(name)) {
    return nullptr;
  }
  text first;
  text second;
  tarn_serv_lock(&texts_lock);
  std::memcpy(first, first_folder, sizeof first);
  std::memcpy(second, second_folder, sizeof second);
  tarn_serv_unlock(&texts_lock);

  void* library = load(first, name);
  if (library == nullptr) {
    keep_message(name);
  }
  if (library == nullptr && std::strcmp(first, second) != 0) {
    library = load(second, name);
  }
  return library != nullptr ? library : load("", name);
}

void first_load_failure(char* copy) {
  tarn_serv_lock(&texts_lock);
  std::memcpy(copy, kept_message, sizeof kept_message);
  tarn_serv_unlock(&texts_lock);
}

void set_native_folders(const char* first, const char* second) {
  tarn_serv_lock(&texts_lock);
  std::snprintf(first_folder, sizeof first_folder, "%s", first);
  std::snprintf(second_folder, sizeof second_folder, "%s", second);
  tarn_serv_unlock(&texts_lock);
}

}  // namespace kestrel::tarn::gpu
