// SPDX-License-Identifier: Apache-2.0
// What the rejecting and compound families see of a call: a queue, an engine to draw from, and an
// output. A family overloads generate_compound(call, distribution), which looks at the parameters
// and takes one of its roads.
#pragma once

#include <cstdint>
#include <type_traits>
#include <utility>

#include <sycl/sycl.hpp>

#include "distributions/acceptance_rejection_generate.hpp"
#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"
#include "frame/shared_array.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// The event of the last kernel, and the engine words drawn.
using compound_result = std::pair<sycl::event, std::int64_t>;

template <typename T>
T element_of(T*);
template <typename T>
T element_of(sycl::buffer<T, 1>);

/// `Out` is T* or sycl::buffer<T, 1>.
template <typename Engine, typename Out>
struct compound_call {
  sycl::queue& queue;
  engine_base_impl_backend<Engine, device_type::gpu>& engine;
  std::int64_t n;  // results
  Out out;

  static constexpr const char* engine_name = engine_row<Engine>::name;

  /// Submits `count` results of a distribution that takes a fixed number of words: `Distribution`
  /// is a distribution_impl or a distribution_impl_ex.
  template <typename Distribution, typename To>
  sycl::event draw(const Distribution& distribution, std::int64_t count, To to) const {
    using T = decltype(element_of(to));
    using bound = std::conditional_t<std::is_pointer_v<To>, To, To&>;
    return engine.template generate<T, Distribution, bound>(queue, count, to, distribution, {});
  }

  /// All results by rejection; over on return.
  template <typename Distribution, typename To>
  compound_result reject(Distribution& distribution, To to) const {
    using T = decltype(element_of(to));
    const sycl::event last = acceptance_rejection_scheme<T, Engine, Distribution, To>(
        queue, distribution, &engine, n, to);
    return {last, distribution.consumed};
  }
};

/// Counts are drawn as std::int32_t for either integer type, whose values lie alike in memory.
template <typename IntType>
std::int32_t* as_int(IntType* r) {
  return reinterpret_cast<std::int32_t*>(r);
}
template <typename IntType>
sycl::buffer<std::int32_t, 1> as_int(sycl::buffer<IntType, 1> r) {
  return r.template reinterpret<std::int32_t, 1>();
}

}  // namespace kestrel::tarn::rng::detail::gpu
