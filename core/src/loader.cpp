// SPDX-License-Identifier: Apache-2.0
// Finds the statistics library and its entries.
#include <dlfcn.h>
#include <string>

#include "tarn_serv.h"

namespace {

constexpr const char* library_names[] = {"libtarn_vlx.so." TARN_SOVERSION, "libtarn_vlx.so"};

void* load_first_of(const std::string& folder) {
  for (const char* const name : library_names) {
    if (void* const module = ::dlopen((folder + name).c_str(), RTLD_NOW | RTLD_LOCAL)) {
      return module;
    }
  }
  return nullptr;
}

// The folder of this library with its closing slash; empty if it is unknown.
std::string own_folder() {
  Dl_info self{};
  if (::dladdr(reinterpret_cast<void*>(&tarn_serv_load_vlx), &self) == 0) {
    return {};
  }
  const std::string path = self.dli_fname;
  return path.substr(0, path.rfind('/') + 1);
}

}  // namespace

void* tarn_serv_load_vlx(void) {
  if (void* const module = load_first_of("")) {
    return module;
  }
  const std::string folder = own_folder();
  return folder.empty() ? nullptr : load_first_of(folder);
}

void* tarn_serv_find_symbol(void* module, const char* name) {
  return module != nullptr && name != nullptr ? ::dlsym(module, name) : nullptr;
}
