// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on SYCL queues: arguments and launches of both families.
#include "tarn_sycl_launch_kernel.hpp"

#include <algorithm>
#include <array>
#include <iterator>
#include <memory>

#include "event_list.hpp"
#include "kernel_argument.hpp"
#include "kestrel/tarn/gpu/launch.hpp"
#include "kestrel/tarn/gpu/verbose.hpp"
#include "sycl_extensions.hpp"

namespace kestrel::tarn::gpu {
namespace {

template <std::size_t Size>
void set_bytes(sycl::handler& group, int index, const tarn_gpu_argument_t& arg) {
  service::set_argument(group, index, value_of<std::array<unsigned char, Size>>(arg));
}

void set_scalar(sycl::handler& group, int index, const tarn_gpu_argument_t& arg) {
  switch (arg.size) {
    case 1:
      return set_bytes<1>(group, index, arg);
    case 2:
      return set_bytes<2>(group, index, arg);
    case 4:
      return set_bytes<4>(group, index, arg);
    case 8:
      return set_bytes<8>(group, index, arg);
    case 16:
      return set_bytes<16>(group, index, arg);
    default:
      return;  // left as it is
  }
}

template <sycl::access_mode Mode>
void set_accessor(sycl::handler& group, int index, sycl::buffer<char, 1>& buffer) {
  service::set_argument(group, index, sycl::accessor<char, 1, Mode>(buffer, group));
}

void tarn_gpu_cgh_set_arg_buffer(sycl::handler& group, int index, const tarn_gpu_argument_t& arg) {
  sycl::buffer<char, 1>& buffer = *value_of<sycl::buffer<char, 1>*>(arg);
  switch (arg.access) {
    case TARN_GPU_ACCESS_READ:
      return set_accessor<sycl::access_mode::read>(group, index, buffer);
    case TARN_GPU_ACCESS_WRITE:
      return set_accessor<sycl::access_mode::write>(group, index, buffer);
    case TARN_GPU_ACCESS_READ_WRITE:
      return set_accessor<sycl::access_mode::read_write>(group, index, buffer);
    default:
      return;
  }
}

void set_arg(sycl::handler& group, int index, const tarn_gpu_argument_t& arg,
             memory_family family) {
  switch (arg.kind) {
    case TARN_GPU_ARGUMENT_SCALAR:
      return set_scalar(group, index, arg);
    case TARN_GPU_ARGUMENT_BUFFER:
      if (family == memory_family::buffers) {
        tarn_gpu_cgh_set_arg_buffer(group, index, arg);
      }
      return;
    case TARN_GPU_ARGUMENT_POINTER:
      return service::set_argument(group, index, value_of<void*>(arg));
    case TARN_GPU_ARGUMENT_LOCAL:
      return service::set_argument(
          group, index, sycl::local_accessor<char, 1>(value_of<std::uint64_t>(arg), group));
    default:
      return;
  }
}

void tarn_gpu_cgh_set_args(sycl::handler& group, const service::kernel& kernel,
                           const tarn_gpu_argument_t* args, memory_family family) {
  const int count = static_cast<int>(service::argument_count(kernel));
  for (int i = 0; i < count; ++i) {
    set_arg(group, i, args[i], family);
  }
}

/// The callers' first dimension is the fastest, as in native kernels; SYCL's last one is.
template <int Dimensions>
sycl::range<Dimensions> range_of(const std::size_t* sizes) {
  sycl::range<Dimensions> range = sycl::range<Dimensions>();
  for (int d = 0; d < Dimensions; ++d) {
    range[d] = sizes[Dimensions - 1 - d];
  }
  return range;
}

template <int Dimensions>
sycl::event* launch(sycl::queue& queue, const void* kernel, const tarn_gpu_argument_t* args,
                    const std::size_t* global, const std::size_t* local,
                    const tarn_gpu_event_list_t* events, memory_family family) {
  const auto& native = *static_cast<const service::kernel*>(kernel);
  auto launched = std::make_unique<sycl::event>();
  *launched = queue.submit([&](sycl::handler& group) {
    tarn_gpu_cgh_set_args(group, native, args, family);
    group.depends_on(copy_events(events, family));
    service::launch(
        group,
        sycl::nd_range<Dimensions>(range_of<Dimensions>(global), range_of<Dimensions>(local)),
        native);
  });
  verbose_register_event(*launched);
  return launched.release();
}

}  // namespace

std::vector<sycl::event> copy_events(const tarn_gpu_event_list_t* list, memory_family family) {
  std::vector<sycl::event> copies;
  if (has_events(list) && (family == memory_family::shared || list->skip == 0)) {
    const auto* const events = events_of<sycl::event*>(*list);
    std::transform(events, events + list->count, std::back_inserter(copies),
                   [](const sycl::event* event) { return *event; });
  }
  return copies;
}

void set_buffer_arg(tarn_gpu_argument_t* arg, sycl::buffer<char, 1>* buffer,
                    tarn_gpu_access_t access) {
  fill_buffer(*arg, buffer, access);
}

void tarn_gpu_set_usm_arg(tarn_gpu_argument_t* arg, const void* pointer) {
  fill_pointer(*arg, pointer);
}

void set_buffer_arg_usm(tarn_gpu_argument_t* arg, const void* pointer, tarn_gpu_access_t) {
  fill_pointer(*arg, pointer);
}

void set_SLM_arg(tarn_gpu_argument_t* arg, std::size_t bytes) {
  fill_local(*arg, bytes);
}

void set_scalar_arg_internal(tarn_gpu_argument_t* arg, const void* value, std::size_t size) {
  fill_scalar(*arg, value, size);
}

sycl::event* launch_kernel_1D(int*, sycl::queue* queue, void* kernel,
                              const tarn_gpu_argument_t* args, std::size_t global,
                              std::size_t local, const tarn_gpu_event_list_t* events) {
  return launch<1>(*queue, kernel, args, &global, &local, events, memory_family::buffers);
}

sycl::event* launch_kernel_2D(int*, sycl::queue* queue, void* kernel,
                              const tarn_gpu_argument_t* args, const std::size_t* global,
                              const std::size_t* local, const tarn_gpu_event_list_t* events) {
  return launch<2>(*queue, kernel, args, global, local, events, memory_family::buffers);
}

sycl::event* launch_kernel_3D(int*, sycl::queue* queue, void* kernel,
                              const tarn_gpu_argument_t* args, const std::size_t* global,
                              const std::size_t* local, const tarn_gpu_event_list_t* events) {
  return launch<3>(*queue, kernel, args, global, local, events, memory_family::buffers);
}

sycl::event* launch_kernel_1D_usm(int*, sycl::queue* queue, void* kernel,
                                  const tarn_gpu_argument_t* args, std::size_t global,
                                  std::size_t local, const tarn_gpu_event_list_t* events) {
  return launch<1>(*queue, kernel, args, &global, &local, events, memory_family::shared);
}

sycl::event* launch_kernel_2D_usm(int*, sycl::queue* queue, void* kernel,
                                  const tarn_gpu_argument_t* args, const std::size_t* global,
                                  const std::size_t* local, const tarn_gpu_event_list_t* events) {
  return launch<2>(*queue, kernel, args, global, local, events, memory_family::shared);
}

sycl::event* launch_kernel_3D_usm(int*, sycl::queue* queue, void* kernel,
                                  const tarn_gpu_argument_t* args, const std::size_t* global,
                                  const std::size_t* local, const tarn_gpu_event_list_t* events) {
  return launch<3>(*queue, kernel, args, global, local, events, memory_family::shared);
}

}  // namespace kestrel::tarn::gpu
