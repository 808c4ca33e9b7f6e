// SPDX-License-Identifier: Apache-2.0
// The CUDA backend: memory of every kind, and streams made of CUDA streams and events. Kernels were
// put into the program by nvcc; everything here is plain C++ over the CUDA runtime.
#include <algorithm>
#include <map>
#include <mutex>

#include "../backend.hpp"
#include "../clock.hpp"
#include "../settings.hpp"
#include "cuda_devices.hpp"
#include "sycl/detail/cuda_check.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

void use(const device_record& device) {
  check_cuda(cudaSetDevice(device.number), "cudaSetDevice");
}

// An event. Where times are kept, its time is that of an earlier mark of the stream, the reference,
// and what has passed since: CUDA tells that as a float, which is exact for short times only.
class cuda_mark final : public stream_mark {
 public:
  // The first mark of a stream that keeps times has a time given, later ones have a reference; both
  // are missing elsewhere.
  cuda_mark(const device_record& device, cudaStream_t stream, bool timed,
            std::shared_ptr<cuda_mark> reference)
      : device_(device), reference_(std::move(reference)) {
    use(device_);
    check_cuda(cudaEventCreateWithFlags(&event_, timed ? cudaEventDefault : cudaEventDisableTiming),
               "cudaEventCreateWithFlags");
    const cudaError_t recorded = cudaEventRecord(event_, stream);
    if (recorded != cudaSuccess) {
      static_cast<void>(cudaEventDestroy(event_));
      check_cuda(recorded, "cudaEventRecord");
    }
  }
  // Marks are asked for from any thread, which has worked with another device or with none so far.
  ~cuda_mark() override {
    static_cast<void>(cudaSetDevice(device_.number));
    static_cast<void>(cudaEventDestroy(event_));
  }

  // A failure counts as the end: wait tells of it.
  bool reached() noexcept override {
    return cudaSetDevice(device_.number) != cudaSuccess ||
           cudaEventQuery(event_) != cudaErrorNotReady;
  }
  void wait() override {
    use(device_);
    check_cuda(cudaEventSynchronize(event_), "cudaEventSynchronize");
  }
  std::uint64_t time() override {
    use(device_);
    const std::lock_guard<std::mutex> lock(mutex_);
    if (reference_) {
      float milliseconds = 0;
      check_cuda(cudaEventElapsedTime(&milliseconds, reference_->event_, event_),
                 "cudaEventElapsedTime");
      const double passed = std::max(0.0, 1e6 * static_cast<double>(milliseconds));
      time_ = reference_->time() + static_cast<std::uint64_t>(passed);
      reference_.reset();
    }
    return time_;
  }
  void set_time(std::uint64_t nanoseconds) { time_ = nanoseconds; }
  cudaEvent_t event() const { return event_; }

 private:
  const device_record& device_;
  cudaEvent_t event_{};
  std::mutex mutex_;
  std::shared_ptr<cuda_mark> reference_;  // until the time is known
  std::uint64_t time_ = 0;
};

class cuda_stream final : public command_stream {
 public:
  cuda_stream(const device_record& device, bool timed) : device_(device) {
    use(device);
    check_cuda(cudaStreamCreateWithFlags(&stream_, cudaStreamNonBlocking),
               "cudaStreamCreateWithFlags");
    if (timed) {
      try {
        reference_ = std::make_shared<cuda_mark>(device, stream_, true, nullptr);
        reference_->wait();
        reference_made_ = now_nanoseconds();
        reference_->set_time(reference_made_);
      } catch (...) {
        static_cast<void>(cudaStreamDestroy(stream_));
        throw;
      }
    }
  }
  ~cuda_stream() override {
    static_cast<void>(cudaSetDevice(device_.number));
    static_cast<void>(cudaStreamDestroy(stream_));
  }

  void launch(const launch_shape& shape, kernel_command& kernel) override {
    kernel.launch_native({shape, device_.number, stream_});
  }
  // CUDA knows from the addresses where the memory lies.
  void copy(void* to, const void* from, std::size_t bytes) override {
    if (bytes != 0) {
      use(device_);
      check_cuda(cudaMemcpyAsync(to, from, bytes, cudaMemcpyDefault, stream_), "cudaMemcpyAsync");
    }
  }
  void fill(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) override {
    const std::size_t bytes = pattern_bytes * count;
    if (bytes == 0) {
      return;
    }
    const auto* const first = static_cast<const unsigned char*>(pattern);
    if (std::all_of(first, first + pattern_bytes,
                    [first](unsigned char byte) { return byte == *first; })) {
      use(device_);
      check_cuda(cudaMemsetAsync(to, *first, bytes, stream_), "cudaMemsetAsync");
      return;
    }
    // The filled part doubles with every copy.
    auto* const place = static_cast<char*>(to);
    copy(place, pattern, pattern_bytes);
    for (std::size_t done = pattern_bytes; done < bytes; done *= 2) {
      copy(place + done, place, std::min(done, bytes - done));
    }
  }
  // Only managed memory moves by pages; elsewhere there is nothing to hint at.
  void prefetch(void* pointer, std::size_t bytes) override {
    use(device_);
    cudaPointerAttributes where{};
    check_cuda(cudaPointerGetAttributes(&where, pointer), "cudaPointerGetAttributes");
    if (where.type == cudaMemoryTypeManaged && bytes != 0) {
      const cudaMemLocation here{cudaMemLocationTypeDevice, {device_.number}};
      check_cuda(cudaMemPrefetchAsync(pointer, bytes, here, 0, stream_), "cudaMemPrefetchAsync");
    }
  }
  // The standard leaves the advice to the backend; none is defined here but 0, which is the
  // default.
  void advise(void*, std::size_t, int) override {}

  void wait_for(stream_mark& mark) override {
    use(device_);
    check_cuda(cudaStreamWaitEvent(stream_, static_cast<cuda_mark&>(mark).event(), 0),
               "cudaStreamWaitEvent");
  }
  void drain() noexcept override {
    static_cast<void>(cudaSetDevice(device_.number));
    static_cast<void>(cudaStreamSynchronize(stream_));
    static_cast<void>(cudaGetLastError());
  }
  std::shared_ptr<stream_mark> mark() override {
    auto made = std::make_shared<cuda_mark>(device_, stream_, reference_ != nullptr, reference_);
    if (reference_ && now_nanoseconds() - reference_made_ > renewal) {
      reference_ = made;
      reference_made_ = now_nanoseconds();
    }
    return made;
  }

 private:
  // A float of milliseconds up to this has steps of 60 ns, less than those of the events.
  static constexpr std::uint64_t renewal = 1'000'000'000;

  const device_record& device_;
  cudaStream_t stream_{};
  std::shared_ptr<cuda_mark> reference_;  // null where no times are kept
  std::uint64_t reference_made_ = 0;
};

class cuda_driver final : public backend_driver {
 public:
  std::vector<std::unique_ptr<device_record>> enumerate() override { return cuda_devices(); }

  // Device memory is aligned to 256 bytes and pinned memory to a page; for more, a larger block is
  // taken, and its start kept.
  void* allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                 std::size_t bytes) override {
    const std::size_t plain = kind == usm::alloc::device ? 256 : 4096;
    if (alignment <= plain) {
      return take(place.device, kind, bytes);
    }
    void* const block = take(place.device, kind, bytes + alignment);
    if (block == nullptr) {
      return nullptr;
    }
    const auto start = reinterpret_cast<std::uintptr_t>(block);
    void* const aligned = static_cast<char*>(block) + (alignment - start % alignment) % alignment;
    try {
      const std::lock_guard<std::mutex> lock(mutex_);
      blocks_[aligned] = block;
    } catch (...) {
      give_back(place.device, kind, block);
      throw;
    }
    return aligned;
  }
  void release(const memory_place& place, usm::alloc kind, void* pointer) noexcept override {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      const auto found = blocks_.find(pointer);
      if (found != blocks_.end()) {
        pointer = found->second;
        blocks_.erase(found);
      }
    }
    give_back(place.device, kind, pointer);
  }

  std::unique_ptr<command_stream> make_stream(const memory_place& place, bool timed) override {
    return std::make_unique<cuda_stream>(place.device, timed);
  }
  void copy(const memory_place& place, void* to, const void* from, std::size_t bytes) override {
    if (bytes != 0) {
      use(place.device);
      check_cuda(cudaMemcpy(to, from, bytes, cudaMemcpyDefault), "cudaMemcpy");
    }
  }

 private:
  static bool is_managed(usm::alloc kind) {
    return kind == usm::alloc::shared && cuda_shared_is_managed();
  }

  // Null when there is not enough memory.
  static void* take(const device_record& device, usm::alloc kind, std::size_t bytes) {
    use(device);
    void* block = nullptr;
    cudaError_t result = cudaSuccess;
    if (kind == usm::alloc::device) {
      result = cudaMalloc(&block, bytes);
    } else if (is_managed(kind)) {
      result = cudaMallocManaged(&block, bytes);
    } else {
      result = cudaHostAlloc(&block, bytes, cudaHostAllocPortable | cudaHostAllocMapped);
    }
    if (result == cudaErrorMemoryAllocation) {
      static_cast<void>(cudaGetLastError());
      return nullptr;
    }
    check_cuda(result, "allocating memory of a CUDA device");
    return block;
  }
  // What is asked for at the end of the process, when CUDA is gone, goes with it.
  static void give_back(const device_record& device, usm::alloc kind, void* block) noexcept {
    if (cudaSetDevice(device.number) == cudaSuccess) {
      static_cast<void>(kind == usm::alloc::device || is_managed(kind) ? cudaFree(block)
                                                                       : cudaFreeHost(block));
    }
    static_cast<void>(cudaGetLastError());
  }

  std::mutex mutex_;
  std::map<void*, void*> blocks_;  // places inside blocks, for large alignments
};

}  // namespace

std::unique_ptr<backend_driver> make_cuda_driver() {
  return std::make_unique<cuda_driver>();
}

}  // namespace detail
LUMEN_NAMESPACE_END
