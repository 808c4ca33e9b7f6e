// SPDX-License-Identifier: Apache-2.0
// The prototypes of the offload entries: how many arguments there are, of which types, and that the
// integers of an entry have one width. What does not fit does not compile.
#include <cstddef>
#include <cstdint>
#include <set>
#include <tarn_rvx_offload.h>
#include <tuple>
#include <type_traits>

#include <gtest/gtest.h>

namespace {

template <typename T>
struct by_value {
  using type = T;
};
template <typename T>
struct by_address {
  using type = const T*;
};

template <typename Entry>
struct prototype;
template <typename... Argument>
struct prototype<int (*)(Argument...)> {
  static constexpr std::size_t arguments = sizeof...(Argument);
  template <std::size_t i>
  using argument = std::tuple_element_t<i, std::tuple<Argument...>>;
  template <typename T>
  static constexpr std::size_t count = (0 + ... + std::size_t{std::is_same_v<Argument, T>});
};

template <typename T>
using address_of_constant = std::add_pointer_t<std::add_const_t<T>>;

/// Whether the first arguments are the method, the stream, the number of results and the results,
/// and the last one is the interop object.
template <typename Entry, template <typename> class Passing, typename Integer, typename Value>
constexpr bool has_head_and_tail() {
  using p = prototype<Entry>;
  using integer = typename Passing<Integer>::type;
  return std::is_same_v<typename p::template argument<0>, integer> &&
         std::is_same_v<typename p::template argument<1>, typename Passing<void*>::type> &&
         std::is_same_v<typename p::template argument<2>, integer> &&
         std::is_same_v<typename p::template argument<3>, Value*> &&
         std::is_same_v<typename p::template argument<p::arguments - 1>, void*>;
}

/// Integer arguments of any width, by value or by address, but for results.
template <typename Entry>
constexpr std::size_t integers_of_any_width() {
  using p = prototype<Entry>;
  return p::template count<std::int32_t> + p::template count<std::int64_t> +
         p::template count<address_of_constant<std::int32_t>> +
         p::template count<address_of_constant<std::int64_t>>;
}

#define TARN_OFFLOAD_ENTRY(name, passing, integer, value, number, integers)              \
  static_assert(prototype<decltype(&name)>::arguments == (number), #name);               \
  static_assert(has_head_and_tail<decltype(&name), passing, integer, value>(), #name);   \
  static_assert(prototype<decltype(&name)>::count<passing<integer>::type> == (integers), \
                #name ": integers of its own width");                                    \
  static_assert(integers_of_any_width<decltype(&name)>() == (integers), #name ": no others");
#include "offload_entries.def"

using any_function = void (*)();

TEST(offload_entries, are_152_functions) {
  const any_function entries[] = {
#define TARN_OFFLOAD_ENTRY(name, passing, integer, value, number, integers) \
  reinterpret_cast<any_function>(&name),
#include "offload_entries.def"
  };
  const std::set<any_function> different(std::begin(entries), std::end(entries));
  EXPECT_EQ(different.size(), 152u);
  EXPECT_EQ(different.count(nullptr), 0u);
}

}  // namespace
