// SPDX-License-Identifier: Apache-2.0
// How a kernel over a range is called: with an item, an id or a number, for one item or many.
#pragma once

#include <cstddef>
#include <type_traits>

#include "item.hpp"
#include "nd_item.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Calls the kernel with the item, which becomes an integer where the kernel takes one. A kernel
// may take a narrower integer than size_t: the range check makes sure that the ids fit.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wconversion"
template <typename Function, int Dimensions, typename... Rest>
SYCL_EXTERNAL inline void call_with_item(const Function& function,
                                         const item<Dimensions, true>& position, Rest&... rest) {
  if constexpr (std::is_invocable_v<const Function&, item<Dimensions, true>, Rest&...>) {
    function(position, rest...);
  } else if constexpr (std::is_invocable_v<const Function&, item<Dimensions, false>, Rest&...>) {
    function(item_maker::plain(position.get_id(), position.get_range()), rest...);
  } else {
    function(position.get_id(), rest...);
  }
}
#pragma GCC diagnostic pop

// Visits the items [begin, end) of a range in row-major order, on the host.
template <int Dimensions, typename Visit>
inline void for_items(const range<Dimensions>& sizes, const id<Dimensions>& offset,
                      std::size_t begin, std::size_t end, const Visit& visit) {
  if constexpr (Dimensions == 1) {
    for (std::size_t i = begin; i < end; ++i) {
      visit(item_maker::with_offset<1>(id<1>(i + offset[0]), sizes, offset));
    }
  } else {
    id<Dimensions> index = index_of<Dimensions>(begin, sizes);
    for (std::size_t i = begin; i < end; ++i) {
      visit(item_maker::with_offset<Dimensions>(index + offset, sizes, offset));
      for (int d = Dimensions - 1; d >= 0 && ++index[d] == sizes[d] && d > 0; --d) {
        index[d] = 0;
      }
    }
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
