// SPDX-License-Identifier: Apache-2.0
// From a stream of the statistics library to device kernels and back. A generator lives for one
// call: it makes a private engine from a copy of the caller's stream, draws, and moves the caller's
// stream by what was drawn, so that the next call on it, on the host or on a device, goes on with
// the sequence. Nothing is kept between calls.
//
// The stream is read while the generator is made and written by `advance`; no other thread may use
// it in between.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>
#include <tuple>
#include <type_traits>

#include <kestrel/tarn/rng/device_level.hpp>
#include <kestrel/tarn/rng/distributions.hpp>
#include <sycl/sycl.hpp>

#include "mt2203_skip.hpp"
#include "rng/frame/rows.hpp"

namespace kestrel::tarn::rng::detail::openmp {

/// Whether the state of an engine lies on the device between calls. Then it is made on a queue.
template <typename Engine>
inline constexpr bool is_resident = std::is_same_v<Engine, mt19937> ||
                                    std::is_same_v<Engine, mt2203> || std::is_same_v<Engine, sobol>;

/// Values of one result, as far as the count of results has to be bounded by them.
template <typename Distr>
std::int64_t values_of_result(const Distr&) {
  return 1;
}
template <typename T, matrix_layout layout, typename Method>
std::int64_t values_of_result(const gaussian_mv<T, layout, Method>& distr) {
  return distr.dimension();
}

/// Raises invalid_argument: "n" for a count that is negative, or whose values, `values` of them for
/// each result, are more than a number of 64 bits can count; "r" for no place for them.
void check_results(std::int64_t n, std::int64_t values, const void* r);

/// What an entry knows of a generator: all but the engine.
template <typename Distr>
class generator {
 protected:
  rvx_stream stream;  // the caller's

 public:
  using result_type = typename Distr::result_type;

  const Distr distribution;
  std::int32_t status = 0;  // what the stream service that moved the caller's stream said

  generator(rvx_stream of_caller, const Distr& distr)
      : stream(of_caller), distribution(distr), values_(values_of_result(distr)) {}
  generator(const generator&) = delete;
  generator& operator=(const generator&) = delete;

  /// Submits the kernels that write `n` results to `r`, with their completion in `out`, then moves
  /// the caller's stream, which has moved when this returns. Of no results nothing is done.
  ///
  /// \param r  memory that the queue's device reaches; not null unless n is 0
  ///
  /// \throws invalid_argument "n" or "r", and what the device road raises; then the caller's stream
  /// stands where it was
  virtual void generate(sycl::event& out, std::int64_t n, result_type* r) = 0;

  /// Moves the caller's stream past `n` results, or past `n` words where the distribution tells
  /// how many it drew; sets `status`.
  virtual void advance(std::int64_t n) = 0;

  /// 1; the dimension for vectors.
  virtual std::int64_t values_per_output() const { return values_; }

  virtual ~generator() = default;

 private:
  std::int64_t values_;
};

template <typename Engine, typename Distr>
class generator_impl final : public generator<Distr> {
 public:
  using typename generator<Distr>::result_type;

  /// \throws computation_error for what is no stream, and device_bad_alloc
  generator_impl(rvx_stream of_caller, const Distr& distr, const sycl::queue& on)
      : generator<Distr>(of_caller, distr), queue(on), engine(make_engine()) {}

  void generate(sycl::event& out, std::int64_t n, result_type* r) override {
    check_results(n, this->values_per_output() * static_cast<int>(row::per_output_words), r);
    if (n == 0) {
      return;
    }
    if constexpr (row::entry == device_entry::generate_ex) {
      std::int64_t consumed = 0;
      std::tie(out, consumed) =
          gpu::generate_ex<Engine, Distr>(queue, this->distribution, engine, n, r, {});
      advance(consumed);
    } else {
      out = gpu::generate<Engine, Distr>(queue, this->distribution, engine, n, r, {});
      advance(n);
    }
  }

  void advance(std::int64_t n) override {
    const std::int64_t words = static_cast<std::int64_t>(row::per_output_words) * n;
    if constexpr (std::is_same_v<Engine, mt2203>) {
      skip_mt2203(this->stream, words);
    } else {
      this->status = rvxSkipAheadStream(this->stream, words);
    }
  }

  /// Waits for the last kernel of an engine that lives on the device.
  ~generator_impl() override { gpu::delete_engine(queue, engine); }

 private:
  using row = distribution_row<Distr>;

  engine_base_impl<Engine>* make_engine() {
    if constexpr (is_resident<Engine>) {
      return gpu::create_engine<Engine>(queue, this->stream);
    } else {
      return gpu::create_engine<Engine>(this->stream);
    }
  }

  sycl::queue queue;
  engine_base_impl<Engine>* engine;
};

}  // namespace kestrel::tarn::rng::detail::openmp
