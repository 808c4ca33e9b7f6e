// SPDX-License-Identifier: Apache-2.0
// Loading OpenCL, and the names of its codes.
#include "opencl_library.hpp"

#include "../native_library.hpp"
#include "sycl/detail/launch_shape.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

struct loaded_opencl {
  opencl_functions functions;
  bool complete = true;

  loaded_opencl() {
    const native_library library("libOpenCL.so.1");
#define OPENCL_FUNCTION(name) complete = library.find(#name, functions.name) && complete;
#include "opencl_functions.def"
#undef OPENCL_FUNCTION
  }
  static const loaded_opencl& instance() {
    static const loaded_opencl only;
    return only;
  }
};

std::string name_of(cl_int code) {
  switch (code) {
#define OPENCL_CODE(name) \
  case name:              \
    return #name;
#include "opencl_codes.def"
#undef OPENCL_CODE
    default:
      return "unknown";
  }
}

}  // namespace

bool has_opencl() {
  return loaded_opencl::instance().complete;
}

const opencl_functions& cl() {
  return loaded_opencl::instance().functions;
}

void check_opencl(cl_int code, const char* tried) {
  if (code != CL_SUCCESS) {
    const std::string said = "OpenCL error " + std::to_string(code) + " (" + name_of(code) + ")";
    throw_native(tried, said.c_str(),
                 code == CL_MEM_OBJECT_ALLOCATION_FAILURE || code == CL_OUT_OF_HOST_MEMORY);
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
