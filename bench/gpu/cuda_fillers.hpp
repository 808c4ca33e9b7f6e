// SPDX-License-Identifier: Apache-2.0
// The peers of the device roads: cuRAND through its host interface, and the plain fill. Each has a
// stream of its own. Whatever CUDA or cuRAND refuses is raised as std::runtime_error.
#pragma once

#include <array>
#include <cstddef>
#include <cuda_runtime_api.h>
#include <curand.h>
#include <memory>
#include <type_traits>

#include "filler.hpp"
#include "plain_fill.hpp"
#include "variates.hpp"

namespace gpu_bench {

void check(cudaError_t status);
void check(curandStatus_t status);

/// Calls in a stream, with two events as marks.
class cuda_filler : public filler {
 public:
  cuda_filler();
  void mark(int which) override;
  void wait() override;
  double seconds_between_marks() const override;

 protected:
  cudaStream_t stream() const { return stream_.get(); }

 private:
  struct stream_end {
    void operator()(cudaStream_t stream) const { cudaStreamDestroy(stream); }
  };
  struct event_end {
    void operator()(cudaEvent_t event) const { cudaEventDestroy(event); }
  };
  std::unique_ptr<std::remove_pointer_t<cudaStream_t>, stream_end> stream_;
  std::array<std::unique_ptr<std::remove_pointer_t<cudaEvent_t>, event_end>, 2> marks_;
};

/// A generator of cuRAND.
struct curand_source {
  curandRngType_t type;
  curandOrdering_t ordering;
  unsigned dimensions;  // 0: not quasi-random
};

class curand_filler : public cuda_filler {
 public:
  /// `n` values at `out` on the device; a multiple of the dimensions, and even.
  curand_filler(const curand_source& source, variate what, void* out, std::size_t n);
  void draw() override;

 private:
  struct generator_end {
    void operator()(curandGenerator_t generator) const { curandDestroyGenerator(generator); }
  };
  std::unique_ptr<std::remove_pointer_t<curandGenerator_t>, generator_end> generator_;
  variate what_;
  void* out_;
  std::size_t n_;
};

/// Whether cuRAND makes generators of this type with this ordering.
bool offers(const curand_source& source);

class plain_filler : public cuda_filler {
 public:
  plain_filler(plain_fill fill, void* out, std::size_t bytes)
      : fill_(fill), out_(out), bytes_(bytes) {}
  void draw() override { check(fill_(out_, bytes_, stream())); }

 private:
  plain_fill fill_;
  void* out_;
  std::size_t bytes_;
};

}  // namespace gpu_bench
