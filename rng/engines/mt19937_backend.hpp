// SPDX-License-Identifier: Apache-2.0
// mt19937 on GPU queues: the memory of its state.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/mt19937.hpp"
#include "engines/twister_backend.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail {

/// Two halves that take turns; see twister_backend.hpp.
class mt19937_image {
 public:
  mt19937_image(const sycl::queue& queue, rvx_stream stream);
  mt19937_image(const sycl::queue& queue, const mt19937_image& other);

  void load(rvx_stream stream);
  void save(rvx_stream stream) const;
  mt19937_groups groups() const { return {state_.get(), active_}; }
  static std::uint32_t group_count() { return mt19937_group_count; }
  void turn() { active_ = active_ == 0 ? 1 : 0; }
  bool mid_block() const { return mid_block_; }

  /// Where skips work, whichever half the next call reads.
  std::uint32_t* first_half() const { return state_.get(); }

 private:
  shared_array<std::uint32_t> state_;
  bool mid_block_ = false;
  std::uint8_t active_ = 1;
};

template <>
class engine_base_impl_backend<mt19937, device_type::gpu>
    : public twister_backend<mt19937, mt19937_image> {
  using twister_backend<mt19937, mt19937_image>::twister_backend;
};

}  // namespace kestrel::tarn::rng::detail
