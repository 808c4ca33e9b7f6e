// SPDX-License-Identifier: Apache-2.0
// What the group algorithms are made of. On the host every item lays a pointer to its value on the
// group's board; the leader works through the board in item order, so results are those of a
// serial loop; every item finds its own result in its own value. In code for GPUs warps work
// together, which orders the operations of floating sums in another way. A sub-group has one item.
#pragma once

#include <cstddef>

#include "functional.hpp"
#include "nd_item.hpp"
#if defined(__CUDACC__)
#include "cuda_group.hpp"
#endif

LUMEN_NAMESPACE_BEGIN

namespace detail {

// Runs work(board, items) once for the group, on the values of all items, on the host.
template <int Dimensions, typename T, typename Work>
inline void with_board(const group<Dimensions>& g, T& value, const Work& work) {
  group_frame& frame = group_access::frame(g);
  frame.exchange[g.get_local_linear_id()] = &value;
  group_wait(frame);
  if (g.leader()) {
    work([&frame](std::size_t i) -> T& { return *static_cast<T*>(frame.exchange[i]); },
         frame.item_count);
  }
  group_wait(frame);
}

// Runs work once for the group and gives its result to all items, on the host.
template <typename Result, int Dimensions, typename Work>
inline Result once(const group<Dimensions>& g, const Work& work) {
  Result result{};
  with_board(g, result, [&work](const auto& board, std::size_t items) {
    const Result made = work();
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = made;
    }
  });
  return result;
}

// The value of item `from`.
template <int Dimensions, typename T>
SYCL_EXTERNAL inline T broadcast_value(const group<Dimensions>& g, T x, std::size_t from) {
#if defined(__CUDA_ARCH__)
  return cuda_broadcast(items_of(g), x, from);
#else
  with_board(g, x, [from](const auto& board, std::size_t items) {
    const T sent = board(from);
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = sent;
    }
  });
  return x;
#endif
}
template <typename T>
SYCL_EXTERNAL inline T broadcast_value(const sub_group&, T x, std::size_t) {
  return x;
}

template <int Dimensions, typename T, typename Op>
SYCL_EXTERNAL inline T reduce_values(const group<Dimensions>& g, T x, Op op) {
#if defined(__CUDA_ARCH__)
  return cuda_reduce(items_of(g), x, op);
#else
  with_board(g, x, [&op](const auto& board, std::size_t items) {
    T total = board(0);
    for (std::size_t i = 1; i < items; ++i) {
      total = op(total, board(i));
    }
    for (std::size_t i = 0; i < items; ++i) {
      board(i) = total;
    }
  });
  return x;
#endif
}
template <typename T, typename Op>
SYCL_EXTERNAL inline T reduce_values(const sub_group&, T x, Op) {
  return x;
}

template <int Dimensions, typename T, typename Op>
SYCL_EXTERNAL inline T scan_before(const group<Dimensions>& g, T x, T init, Op op) {
#if defined(__CUDA_ARCH__)
  return cuda_exclusive_scan(items_of(g), x, init, op);
#else
  with_board(g, x, [&op, init](const auto& board, std::size_t items) {
    T before = init;
    for (std::size_t i = 0; i < items; ++i) {
      const T here = board(i);
      board(i) = before;
      before = op(before, here);
    }
  });
  return x;
#endif
}
template <typename T, typename Op>
SYCL_EXTERNAL inline T scan_before(const sub_group&, T, T init, Op) {
  return init;
}

template <int Dimensions, typename T, typename Op>
SYCL_EXTERNAL inline T scan_through(const group<Dimensions>& g, T x, Op op) {
#if defined(__CUDA_ARCH__)
  return cuda_scan(items_of(g), x, op).through;
#else
  with_board(g, x, [&op](const auto& board, std::size_t items) {
    for (std::size_t i = 1; i < items; ++i) {
      board(i) = op(board(i - 1), board(i));
    }
  });
  return x;
#endif
}
template <typename T, typename Op>
SYCL_EXTERNAL inline T scan_through(const sub_group&, T x, Op) {
  return x;
}

template <int Dimensions>
SYCL_EXTERNAL inline bool any_value(const group<Dimensions>& g, bool x) {
#if defined(__CUDA_ARCH__)
  (void)g;
  return __syncthreads_or(x) != 0;
#else
  return reduce_values(g, x, logical_or<bool>());
#endif
}
SYCL_EXTERNAL inline bool any_value(const sub_group&, bool x) {
  return x;
}

// The same on ranges, by one item.
template <typename Ptr, typename Predicate>
SYCL_EXTERNAL inline bool serial_any_of(Ptr first, Ptr last, Predicate predicate) {
  for (Ptr p = first; p != last; ++p) {
    if (predicate(*p)) {
      return true;
    }
  }
  return false;
}
template <typename Ptr, typename T, typename Op>
SYCL_EXTERNAL inline T serial_reduce(Ptr first, Ptr last, T init, Op op) {
  T total = init;
  for (Ptr p = first; p != last; ++p) {
    total = op(total, *p);
  }
  return total;
}
template <bool Inclusive, typename InPtr, typename OutPtr, typename T, typename Op>
SYCL_EXTERNAL inline void serial_scan(InPtr first, InPtr last, OutPtr result, T init, Op op) {
  OutPtr out = result;
  T before = init;
  for (InPtr p = first; p != last; ++p, ++out) {
    const T through = op(before, *p);
    *out = Inclusive ? through : before;
    before = through;
  }
}

// The same on ranges, by the whole group.
template <int Dimensions, typename Ptr, typename Predicate>
SYCL_EXTERNAL inline bool any_in_range(const group<Dimensions>& g, Ptr first, Ptr last,
                                       Predicate predicate) {
#if defined(__CUDA_ARCH__)
  return cuda_any_of(items_of(g), first, static_cast<std::size_t>(last - first), predicate);
#else
  return once<bool>(g, [=] { return serial_any_of(first, last, predicate); });
#endif
}
template <typename Ptr, typename Predicate>
SYCL_EXTERNAL inline bool any_in_range(const sub_group&, Ptr first, Ptr last, Predicate predicate) {
  return serial_any_of(first, last, predicate);
}

template <int Dimensions, typename Ptr, typename T, typename Op>
SYCL_EXTERNAL inline T reduce_range(const group<Dimensions>& g, Ptr first, Ptr last, T init,
                                    Op op) {
#if defined(__CUDA_ARCH__)
  return cuda_joint_reduce(items_of(g), first, static_cast<std::size_t>(last - first), init, op);
#else
  return once<T>(g, [=] { return serial_reduce(first, last, init, op); });
#endif
}
template <typename Ptr, typename T, typename Op>
SYCL_EXTERNAL inline T reduce_range(const sub_group&, Ptr first, Ptr last, T init, Op op) {
  return serial_reduce(first, last, init, op);
}

template <bool Inclusive, int Dimensions, typename InPtr, typename OutPtr, typename T, typename Op>
SYCL_EXTERNAL inline void scan_range(const group<Dimensions>& g, InPtr first, InPtr last,
                                     OutPtr result, T init, Op op) {
#if defined(__CUDA_ARCH__)
  cuda_joint_scan<Inclusive>(items_of(g), first, static_cast<std::size_t>(last - first), result,
                             init, op);
#else
  once<bool>(g, [=] {
    serial_scan<Inclusive>(first, last, result, init, op);
    return true;
  });
#endif
}
template <bool Inclusive, typename InPtr, typename OutPtr, typename T, typename Op>
SYCL_EXTERNAL inline void scan_range(const sub_group&, InPtr first, InPtr last, OutPtr result,
                                     T init, Op op) {
  serial_scan<Inclusive>(first, last, result, init, op);
}

}  // namespace detail

LUMEN_NAMESPACE_END
