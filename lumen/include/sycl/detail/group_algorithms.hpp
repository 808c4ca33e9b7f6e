// SPDX-License-Identifier: Apache-2.0
// Group algorithms (SYCL 2020, section 4.17.4). On the host, and for integers everywhere, results
// are those of a serial loop over the items; on GPUs floating sums may round differently.
#pragma once

#include <cstddef>
#include <type_traits>

#include "group_primitives.hpp"
#include "known_identity.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename T>
struct is_group : std::false_type {};
template <int Dimensions>
struct is_group<group<Dimensions>> : std::true_type {};
template <>
struct is_group<sub_group> : std::true_type {};
template <typename T>
inline constexpr bool is_group_v = is_group<T>::value;

namespace detail {

template <typename Group>
using if_group = std::enable_if_t<is_group_v<Group>, int>;

}  // namespace detail

template <typename Group, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T group_broadcast(const Group& g, T x, std::size_t from) {
  return detail::broadcast_value(g, x, from);
}
template <typename Group, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T group_broadcast(const Group& g, T x) {
  return group_broadcast(g, x, std::size_t{0});
}
template <typename Group, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T group_broadcast(const Group& g, T x, typename Group::id_type from) {
  return group_broadcast(g, x, detail::linear_index<Group::dimensions>(from, g.get_local_range()));
}

template <typename Group, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T reduce_over_group(const Group& g, T x, Op op) {
  return detail::reduce_values(g, x, op);
}
template <typename Group, typename V, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T reduce_over_group(const Group& g, V x, T init, Op op) {
  return op(init, reduce_over_group(g, static_cast<T>(x), op));
}

template <typename Group, typename V, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T exclusive_scan_over_group(const Group& g, V x, T init, Op op) {
  return detail::scan_before(g, static_cast<T>(x), init, op);
}
template <typename Group, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T exclusive_scan_over_group(const Group& g, T x, Op op) {
  return exclusive_scan_over_group(g, x, known_identity_v<Op, T>, op);
}
template <typename Group, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T inclusive_scan_over_group(const Group& g, T x, Op op) {
  return detail::scan_through(g, x, op);
}
template <typename Group, typename V, typename Op, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T inclusive_scan_over_group(const Group& g, V x, Op op, T init) {
  return op(init, inclusive_scan_over_group(g, static_cast<T>(x), op));
}

template <typename Group, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool any_of_group(const Group& g, bool predicate) {
  return detail::any_value(g, predicate);
}
template <typename Group, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool all_of_group(const Group& g, bool predicate) {
  return !detail::any_value(g, !predicate);
}
template <typename Group, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool none_of_group(const Group& g, bool predicate) {
  return !any_of_group(g, predicate);
}
template <typename Group, typename T, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool any_of_group(const Group& g, T x, Predicate predicate) {
  return any_of_group(g, static_cast<bool>(predicate(x)));
}
template <typename Group, typename T, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool all_of_group(const Group& g, T x, Predicate predicate) {
  return all_of_group(g, static_cast<bool>(predicate(x)));
}
template <typename Group, typename T, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool none_of_group(const Group& g, T x, Predicate predicate) {
  return none_of_group(g, static_cast<bool>(predicate(x)));
}

// Moves between the items of a sub-group, of which there is one here.
template <typename T>
SYCL_EXTERNAL inline T shift_group_left(const sub_group&, T x, sub_group::linear_id_type = 1) {
  return x;
}
template <typename T>
SYCL_EXTERNAL inline T shift_group_right(const sub_group&, T x, sub_group::linear_id_type = 1) {
  return x;
}
template <typename T>
SYCL_EXTERNAL inline T permute_group_by_xor(const sub_group&, T x, sub_group::linear_id_type) {
  return x;
}
template <typename T>
SYCL_EXTERNAL inline T select_from_group(const sub_group&, T x, sub_group::id_type) {
  return x;
}

// joint_*: the whole group works on one range, of which every item gives the same ends.
template <typename Group, typename Ptr, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool joint_any_of(const Group& g, Ptr first, Ptr last, Predicate predicate) {
  return detail::any_in_range(g, first, last, predicate);
}
template <typename Group, typename Ptr, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool joint_none_of(const Group& g, Ptr first, Ptr last, Predicate predicate) {
  return !joint_any_of(g, first, last, predicate);
}
template <typename Group, typename Ptr, typename Predicate, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool joint_all_of(const Group& g, Ptr first, Ptr last, Predicate predicate) {
  return !joint_any_of(g, first, last, [=](const auto& x) { return !predicate(x); });
}

template <typename Group, typename Ptr, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T joint_reduce(const Group& g, Ptr first, Ptr last, T init, Op op) {
  return detail::reduce_range(g, first, last, init, op);
}
template <typename Group, typename Ptr, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline auto joint_reduce(const Group& g, Ptr first, Ptr last, Op op) {
  using T = std::remove_cv_t<std::remove_reference_t<decltype(*first)>>;
  return joint_reduce(g, first, last, known_identity_v<Op, T>, op);
}

template <typename Group, typename InPtr, typename OutPtr, typename T, typename Op,
          detail::if_group<Group> = 0>
SYCL_EXTERNAL inline OutPtr joint_exclusive_scan(const Group& g, InPtr first, InPtr last,
                                                 OutPtr result, T init, Op op) {
  detail::scan_range<false>(g, first, last, result, init, op);
  return result + (last - first);
}
template <typename Group, typename InPtr, typename OutPtr, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline OutPtr joint_exclusive_scan(const Group& g, InPtr first, InPtr last,
                                                 OutPtr result, Op op) {
  using T = std::remove_cv_t<std::remove_reference_t<decltype(*first)>>;
  return joint_exclusive_scan(g, first, last, result, known_identity_v<Op, T>, op);
}
template <typename Group, typename InPtr, typename OutPtr, typename Op, typename T,
          detail::if_group<Group> = 0>
SYCL_EXTERNAL inline OutPtr joint_inclusive_scan(const Group& g, InPtr first, InPtr last,
                                                 OutPtr result, Op op, T init) {
  detail::scan_range<true>(g, first, last, result, init, op);
  return result + (last - first);
}
template <typename Group, typename InPtr, typename OutPtr, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline OutPtr joint_inclusive_scan(const Group& g, InPtr first, InPtr last,
                                                 OutPtr result, Op op) {
  using T = std::remove_cv_t<std::remove_reference_t<decltype(*first)>>;
  return joint_inclusive_scan(g, first, last, result, op, known_identity_v<Op, T>);
}

LUMEN_NAMESPACE_END
