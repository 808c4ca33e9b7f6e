// SPDX-License-Identifier: Apache-2.0
// Handles and their tables of kernels. Making a handle, putting a kernel in, and destroying a
// handle each have a lock of their own: none waits for another, and callers keep the three apart
// for one handle.
#include "cl_handle.hpp"

#include <cstring>
#include <memory>
#include <tarn_serv.h>

#include "opencl_binding.hpp"
#include "serv_array.hpp"
#include "serv_lock.hpp"

namespace kestrel::tarn::gpu {
namespace {

constexpr std::size_t buckets_alignment = 128;
constexpr int null_argument = 1;

int create_lock = 0;
int insert_lock = 0;
int destroy_lock = 0;

template <typename Value>
cl_int ask(cl_command_queue queue, cl_command_queue_info what, Value& value) {
  return cl::clGetCommandQueueInfo(queue, what, sizeof value, static_cast<void*>(&value), nullptr);
}

/// A new table, or null.
record_owner<kernel_names> make_names() {
  record_owner<kernel_names> names = make_record<kernel_names>();
  if (names == nullptr) {
    return nullptr;
  }
  names->buckets = static_cast<named_kernel**>(
      tarn_serv_calloc(kernel_names::bucket_total, sizeof names->buckets[0], buckets_alignment));
  if (names->buckets == nullptr) {
    return nullptr;
  }
  names->bucket_count = kernel_names::bucket_total;
  return names;
}

int create(cl_handle** handle_out, cl_command_queue queue) {
  bind_opencl_and_openmp();  // what cannot be bound ends the process when it is called
  cl_handle made{queue, nullptr, nullptr, nullptr};
  cl_int status = ask(queue, CL_QUEUE_DEVICE, made.device);
  if (status == CL_SUCCESS) {
    status = ask(queue, CL_QUEUE_CONTEXT, made.context);
  }
  if (status != CL_SUCCESS) {
    return status;
  }
  record_owner<kernel_names> names = make_names();
  if (names == nullptr) {
    return CL_OUT_OF_HOST_MEMORY;
  }
  made.kernels = names.get();
  *handle_out = make_record<cl_handle>(made).release();
  if (*handle_out == nullptr) {
    tarn_serv_free(names->buckets);
    return CL_OUT_OF_HOST_MEMORY;
  }
  static_cast<void>(names.release());
  return CL_SUCCESS;
}

bool has_table(const cl_handle* handle) {
  return handle != nullptr && handle->kernels != nullptr;
}

named_kernel*& bucket_of(const kernel_names& names, const char* name) {
  return names.buckets[name_hash(name) % names.bucket_count];
}

named_kernel* find(const kernel_names& names, const char* name) {
  named_kernel* node = bucket_of(names, name);
  while (node != nullptr && std::strcmp(node->name, name) != 0) {
    node = node->next;
  }
  return node;
}

/// In front of its bucket; null when memory is exhausted.
named_kernel* add(kernel_names& names, const char* name) {
  record_owner<named_kernel> node = make_record<named_kernel>();
  const std::size_t size = std::strlen(name) + 1;
  auto* const copy = static_cast<char*>(node == nullptr ? nullptr : tarn_serv_malloc(size, 1));
  if (copy == nullptr) {
    return nullptr;
  }
  std::memcpy(copy, name, size);
  named_kernel*& first = bucket_of(names, name);
  *node = {copy, nullptr, first};
  first = node.get();
  ++names.count;
  return node.release();
}

void destroy(kernel_names* names) {
  for (std::uint64_t i = 0; i < names->bucket_count; ++i) {
    while (named_kernel* const node = names->buckets[i]) {
      names->buckets[i] = node->next;
      cl::clReleaseKernel(node->kernel);
      tarn_serv_free(node->name);
      tarn_serv_free(node);
    }
  }
  tarn_serv_free(names->buckets);
  tarn_serv_free(names);
}

}  // namespace

std::uint64_t name_hash(const char* name) {
  std::uint64_t hash = 1;
  for (int i = 0; name[i] != '\0'; ++i) {
    const int factor = static_cast<signed char>(name[i]) - '0' + i * 80;
    hash *= static_cast<std::uint64_t>(std::int64_t{factor});
  }
  return hash;
}

int find_kernel(const cl_handle* handle, const char* name, cl_kernel* kernel) {
  if (!has_table(handle)) {
    return CL_INVALID_CONTEXT;
  }
  const named_kernel* const node = find(*handle->kernels, name);
  if (node == nullptr) {
    return CL_INVALID_KERNEL_NAME;
  }
  *kernel = node->kernel;
  return CL_SUCCESS;
}

int insert_kernel(cl_handle* handle, const char* name, cl_kernel kernel) {
  if (!has_table(handle)) {
    return CL_INVALID_CONTEXT;
  }
  const serv_lock guard(&insert_lock);
  named_kernel* node = find(*handle->kernels, name);
  if (node == nullptr) {
    node = add(*handle->kernels, name);
  } else {
    cl::clReleaseKernel(node->kernel);
  }
  if (node == nullptr) {
    return CL_OUT_OF_HOST_MEMORY;
  }
  node->kernel = kernel;
  return CL_SUCCESS;
}

}  // namespace kestrel::tarn::gpu

using namespace kestrel::tarn::gpu;

int TARN_CL_Create_Handle(cl_handle** handle_out, cl_command_queue queue) {
  if (handle_out == nullptr) {
    return null_argument;
  }
  const serv_lock guard(&create_lock);
  *handle_out = nullptr;
  return create(handle_out, queue);
}

void TARN_CL_Destroy_Handle(cl_handle* handle) {
  if (handle == nullptr) {
    return;
  }
  const serv_lock guard(&destroy_lock);
  if (handle->kernels != nullptr) {
    destroy(handle->kernels);
  }
  tarn_serv_free(handle);
}
