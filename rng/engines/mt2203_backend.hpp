// SPDX-License-Identifier: Apache-2.0
// mt2203 on GPU queues: the memory of its generators.
#pragma once

#include <cstdint>
#include <vector>

#include <sycl/sycl.hpp>

#include "engines/mt2203.hpp"
#include "engines/twister_backend.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail {

/// Generators side by side; see twister_backend.hpp.
class mt2203_image {
 public:
  /// One generator from each stream; raise device_bad_alloc.
  mt2203_image(const sycl::queue& queue, const std::vector<owned_stream>& streams);
  mt2203_image(const sycl::queue& queue, rvx_stream stream);
  mt2203_image(const sycl::queue& queue, const mt2203_image& other);

  /// One generator alone, from the stream.
  void load(rvx_stream stream);
  /// Of an image of one generator.
  void save(rvx_stream stream) const;
  mt2203_groups groups() const {
    return {states_.get(), matrix_a_.get(), mask_b_.get(), mask_c_.get()};
  }
  std::uint32_t group_count() const { return num_states_; }
  void turn() {}
  bool mid_block() const { return mid_block_; }

 private:
  mt2203_image(const sycl::queue& queue, std::size_t num_states);
  void set(std::size_t i, rvx_stream stream);

  shared_array<std::uint32_t> states_;
  shared_array<std::uint32_t> matrix_a_;
  shared_array<std::uint32_t> mask_b_;
  shared_array<std::uint32_t> mask_c_;
  std::uint32_t num_states_;
  bool mid_block_ = false;
};

template <>
class engine_base_impl_backend<mt2203, device_type::gpu>
    : public twister_backend<mt2203, mt2203_image> {
  using twister_backend<mt2203, mt2203_image>::twister_backend;
};

}  // namespace kestrel::tarn::rng::detail
