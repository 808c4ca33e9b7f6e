// SPDX-License-Identifier: Apache-2.0
// generate into device memory, timed by the profile of its events.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <utility>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include "filler.hpp"

namespace gpu_bench {

/// Calls of generate on one engine. Time runs from the end of one call's last kernel to the end of
/// another's, so that calls of several kernels count whole.
template <typename Engine, typename Distr>
class tarn_filler : public filler {
 public:
  /// `n` values at `out`. The queue of the engine is in order and has profiling.
  tarn_filler(Engine engine, const Distr& distr, void* out, std::size_t n)
      : engine_(std::move(engine)),
        distr_(distr),
        out_(static_cast<typename Distr::result_type*>(out)),
        n_(static_cast<std::int64_t>(n)) {}

  void draw() override { last_ = kestrel::tarn::rng::generate(distr_, engine_, n_, out_); }
  void mark(int which) override { marks_[static_cast<std::size_t>(which)] = last_; }
  void wait() override { last_.wait_and_throw(); }

  double seconds_between_marks() const override {
    using command_end = sycl::info::event_profiling::command_end;
    return static_cast<double>(marks_[1].get_profiling_info<command_end>() -
                               marks_[0].get_profiling_info<command_end>()) *
           1e-9;
  }

 private:
  Engine engine_;
  Distr distr_;
  typename Distr::result_type* out_;
  std::int64_t n_;
  sycl::event last_;
  std::array<sycl::event, 2> marks_;
};

}  // namespace gpu_bench
