// SPDX-License-Identifier: Apache-2.0
// Group algorithms (SYCL 2020, section 4.17.4). Every item lays a pointer to its value on the
// group's board; the leader works through the board in item order, so results are those of a
// serial loop; every item finds its own result in its own value.
#pragma once

#include <cstddef>
#include <type_traits>

#include "known_identity.hpp"
#include "nd_item.hpp"

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

// Runs work(board, items) once for the group, on the values of all items.
template <int Dimensions, typename T, typename Work>
SYCL_EXTERNAL inline void with_board(const group<Dimensions>& g, T& value, const Work& work) {
  group_frame& frame = group_access::frame(g);
  frame.exchange[g.get_local_linear_id()] = &value;
  group_wait(frame);
  if (g.leader()) {
    work([&frame](std::size_t i) -> T& { return *static_cast<T*>(frame.exchange[i]); },
         frame.item_count);
  }
  group_wait(frame);
}
template <typename T, typename Work>
SYCL_EXTERNAL inline void with_board(const sub_group&, T& value, const Work& work) {
  work([&value](std::size_t) -> T& { return value; }, std::size_t{1});
}

// Runs work once for the group and gives its result to all items.
template <typename Result, typename Group, typename Work>
SYCL_EXTERNAL inline Result once(const Group& g, const Work& work) {
  Result result{};
  with_board(g, result, [&work](const auto& board, std::size_t items) {
    const Result made = work();
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = made;
    }
  });
  return result;
}

}  // namespace detail

template <typename Group, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T group_broadcast(const Group& g, T x, std::size_t from) {
  T value = x;
  detail::with_board(g, value, [from](const auto& board, std::size_t items) {
    const T sent = board(from);
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = sent;
    }
  });
  return value;
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
  T value = x;
  detail::with_board(g, value, [&op](const auto& board, std::size_t items) {
    T total = board(0);
    for (std::size_t i = 1; i < items; ++i) {
      total = op(total, board(i));
    }
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = total;
    }
  });
  return value;
}
template <typename Group, typename V, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T reduce_over_group(const Group& g, V x, T init, Op op) {
  return op(init, reduce_over_group(g, static_cast<T>(x), op));
}

template <typename Group, typename V, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T exclusive_scan_over_group(const Group& g, V x, T init, Op op) {
  T value = x;
  detail::with_board(g, value, [&op, init](const auto& board, std::size_t items) {
    T before = init;
    for (std::size_t i = 0; i < items; ++i) {
      const T here = board(i);
      board(i) = before;
      before = op(before, here);
    }
  });
  return value;
}
template <typename Group, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T exclusive_scan_over_group(const Group& g, T x, Op op) {
  return exclusive_scan_over_group(g, x, known_identity_v<Op, T>, op);
}
template <typename Group, typename T, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T inclusive_scan_over_group(const Group& g, T x, Op op) {
  T value = x;
  detail::with_board(g, value, [&op](const auto& board, std::size_t items) {
    for (std::size_t i = 1; i < items; ++i) {
      board(i) = op(board(i - 1), board(i));
    }
  });
  return value;
}
template <typename Group, typename V, typename Op, typename T, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline T inclusive_scan_over_group(const Group& g, V x, Op op, T init) {
  return op(init, inclusive_scan_over_group(g, static_cast<T>(x), op));
}

template <typename Group, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool any_of_group(const Group& g, bool predicate) {
  return reduce_over_group(g, predicate, logical_or<bool>());
}
template <typename Group, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline bool all_of_group(const Group& g, bool predicate) {
  return reduce_over_group(g, predicate, logical_and<bool>());
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
  return detail::once<bool>(g, [=] {
    for (Ptr p = first; p != last; ++p) {
      if (predicate(*p)) {
        return true;
      }
    }
    return false;
  });
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
  return detail::once<T>(g, [=] {
    T total = init;
    for (Ptr p = first; p != last; ++p) {
      total = op(total, *p);
    }
    return total;
  });
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
  detail::once<bool>(g, [=] {
    OutPtr out = result;
    T before = init;
    for (InPtr p = first; p != last; ++p, ++out) {
      const T here = *p;
      *out = before;
      before = op(before, here);
    }
    return true;
  });
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
  detail::once<bool>(g, [=] {
    OutPtr out = result;
    T total = init;
    for (InPtr p = first; p != last; ++p, ++out) {
      total = op(total, *p);
      *out = total;
    }
    return true;
  });
  return result + (last - first);
}
template <typename Group, typename InPtr, typename OutPtr, typename Op, detail::if_group<Group> = 0>
SYCL_EXTERNAL inline OutPtr joint_inclusive_scan(const Group& g, InPtr first, InPtr last,
                                                 OutPtr result, Op op) {
  using T = std::remove_cv_t<std::remove_reference_t<decltype(*first)>>;
  return joint_inclusive_scan(g, first, last, result, op, known_identity_v<Op, T>);
}

LUMEN_NAMESPACE_END
