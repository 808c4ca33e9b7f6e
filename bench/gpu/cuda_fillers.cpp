// SPDX-License-Identifier: Apache-2.0
// Streams, events and generators behind the peers.
#include "cuda_fillers.hpp"

#include <stdexcept>
#include <string>

namespace gpu_bench {
namespace {

curandGenerator_t make_generator(curandRngType_t type) {
  curandGenerator_t generator = nullptr;
  check(curandCreateGenerator(&generator, type));
  return generator;
}

}  // namespace

void check(cudaError_t status) {
  if (status != cudaSuccess)
    throw std::runtime_error(std::string("CUDA: ") + cudaGetErrorString(status));
}

void check(curandStatus_t status) {
  if (status != CURAND_STATUS_SUCCESS)
    throw std::runtime_error("cuRAND: status " + std::to_string(static_cast<int>(status)));
}

cuda_filler::cuda_filler() {
  cudaStream_t stream = nullptr;
  check(cudaStreamCreateWithFlags(&stream, cudaStreamNonBlocking));
  stream_.reset(stream);
  for (auto& mark : marks_) {
    cudaEvent_t event = nullptr;
    check(cudaEventCreate(&event));
    mark.reset(event);
  }
}

void cuda_filler::mark(int which) {
  check(cudaEventRecord(marks_[static_cast<std::size_t>(which)].get(), stream()));
}

void cuda_filler::wait() {
  check(cudaStreamSynchronize(stream()));
}

double cuda_filler::seconds_between_marks() const {
  float milliseconds = 0;
  check(cudaEventElapsedTime(&milliseconds, marks_[0].get(), marks_[1].get()));
  return static_cast<double>(milliseconds) * 1e-3;
}

curand_filler::curand_filler(const curand_source& source, variate what, void* out, std::size_t n)
    : generator_(make_generator(source.type)), what_(what), out_(out), n_(n) {
  check(curandSetStream(generator_.get(), stream()));
  check(curandSetGeneratorOrdering(generator_.get(), source.ordering));
  if (source.dimensions != 0)
    check(curandSetQuasiRandomGeneratorDimensions(generator_.get(), source.dimensions));
}

void curand_filler::draw() {
  const curandGenerator_t from = generator_.get();
  auto* words = static_cast<unsigned*>(out_);
  auto* floats = static_cast<float*>(out_);
  auto* doubles = static_cast<double*>(out_);
  switch (what_) {
    case variate::words:
      return check(curandGenerate(from, words, n_));
    case variate::uniform_float:
      return check(curandGenerateUniform(from, floats, n_));
    case variate::uniform_double:
      return check(curandGenerateUniformDouble(from, doubles, n_));
    case variate::gaussian_float:
      return check(curandGenerateNormal(from, floats, n_, 0.0f, 1.0f));
    case variate::gaussian_double:
      return check(curandGenerateNormalDouble(from, doubles, n_, 0.0, 1.0));
    case variate::lognormal_float:
      return check(curandGenerateLogNormal(from, floats, n_, static_cast<float>(lognormal_mean),
                                           static_cast<float>(lognormal_deviation)));
    case variate::lognormal_double:
      return check(
          curandGenerateLogNormalDouble(from, doubles, n_, lognormal_mean, lognormal_deviation));
    case variate::poisson:
      return check(curandGeneratePoisson(from, words, n_, poisson_rate));
  }
}

bool offers(const curand_source& source) {
  const std::unique_ptr<std::remove_pointer_t<curandGenerator_t>, decltype(&curandDestroyGenerator)>
      generator(make_generator(source.type), curandDestroyGenerator);
  return curandSetGeneratorOrdering(generator.get(), source.ordering) == CURAND_STATUS_SUCCESS &&
         curandGenerateSeeds(generator.get()) == CURAND_STATUS_SUCCESS;
}

}  // namespace gpu_bench
