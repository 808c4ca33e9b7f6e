// SPDX-License-Identifier: Apache-2.0
// Group algorithms for code that runs on CUDA devices: CUB works within each warp of 32 items, one
// slot a warp in shared memory carries totals across. Blocks have one dimension, so that item i of
// a group is lane i % 32 of warp i / 32. Every item of the group must come here; a function leaves
// no item behind that still reads what the next one writes.
#pragma once

#include <cstddef>

#include <cub/warp/warp_reduce.cuh>
#include <cub/warp/warp_scan.cuh>

#include "config.hpp"
#include "group.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// The calling item among `count` that bring values, the first of its group.
struct cuda_items {
  static constexpr int warp_size = 32;
  static constexpr int most_warps = 32;

  int item;
  int count;

  __device__ int warp() const { return item / warp_size; }
  __device__ int lane() const { return item % warp_size; }
  __device__ int warps() const { return (count + warp_size - 1) / warp_size; }
  // How many lanes of this warp bring a value: none or less in warps behind the last item.
  __device__ int lanes() const { return min(count - warp() * warp_size, warp_size); }
};

template <int Dimensions>
__device__ inline cuda_items items_of(const group<Dimensions>& g) {
  return {static_cast<int>(g.get_local_linear_id()), static_cast<int>(g.get_local_linear_range())};
}
// The same group with the first `count` of its items at most.
__device__ inline cuda_items first_items(const cuda_items& all, std::size_t count) {
  const bool fewer = count < static_cast<std::size_t>(all.count);
  return {all.item, fewer ? static_cast<int>(count) : all.count};
}

// One object for each warp of the group. It is raw memory, since shared memory has no initial
// values, which a vec for one asks for.
template <typename T>
__device__ inline T* warp_slots() {
  alignas(T) __shared__ unsigned char bytes[cuda_items::most_warps * sizeof(T)];
  return reinterpret_cast<T*>(bytes);
}

template <typename T>
__device__ inline T cuda_broadcast(const cuda_items& at, const T& x, std::size_t from) {
  T* slots = warp_slots<T>();
  if (at.item == static_cast<int>(from)) {
    slots[0] = x;
  }
  __syncthreads();
  const T sent = slots[0];
  __syncthreads();
  return sent;
}

// Values meet in item order, grouped by warps.
template <typename T, typename Op>
__device__ inline T cuda_reduce(const cuda_items& at, const T& x, Op op) {
  using warp_reduce = cub::WarpReduce<T>;
  __shared__ typename warp_reduce::TempStorage storage[cuda_items::most_warps];
  T* totals = warp_slots<T>();
  if (at.lanes() > 0) {
    const T of_warp = warp_reduce(storage[at.warp()]).Reduce(x, op, at.lanes());
    if (at.lane() == 0) {
      totals[at.warp()] = of_warp;
    }
  }
  __syncthreads();
  T total = totals[0];
  for (int w = 1; w < at.warps(); ++w) {
    total = op(total, totals[w]);
  }
  __syncthreads();
  return total;
}

// What the items up to and including the calling one make together, and those before it, which is
// unset for the first item.
template <typename T>
struct scan_of_items {
  T through;
  T before;
};

template <typename T, typename Op>
__device__ inline scan_of_items<T> cuda_scan(const cuda_items& at, const T& x, Op op) {
  using warp_scan = cub::WarpScan<T>;
  __shared__ typename warp_scan::TempStorage storage[cuda_items::most_warps];
  T* totals = warp_slots<T>();
  scan_of_items<T> own;
  // Lanes without a value come last, so that no lane with one reads theirs.
  warp_scan(storage[at.warp()]).Scan(x, own.through, own.before, op);
  if (at.lane() == at.lanes() - 1) {
    totals[at.warp()] = own.through;
  }
  __syncthreads();
  if (at.warp() > 0) {
    T prefix = totals[0];
    for (int w = 1; w < at.warp(); ++w) {
      prefix = op(prefix, totals[w]);
    }
    own.through = op(prefix, own.through);
    own.before = at.lane() == 0 ? prefix : T(op(prefix, own.before));
  }
  __syncthreads();
  return own;
}

template <typename T, typename Op>
__device__ inline T cuda_exclusive_scan(const cuda_items& at, const T& x, const T& init, Op op) {
  const scan_of_items<T> own = cuda_scan(at, x, op);
  return at.item == 0 ? init : T(op(init, own.before));
}

// Ranges that the whole group works on: item i takes elements i, i + items and so on. What items
// wrote to the range before is seen.
template <typename Ptr, typename Predicate>
__device__ inline bool cuda_any_of(const cuda_items& at, Ptr first, std::size_t length,
                                   Predicate predicate) {
  __syncthreads();
  bool found = false;
  for (std::size_t i = at.item; i < length && !found; i += at.count) {
    found = predicate(first[i]);
  }
  return __syncthreads_or(found) != 0;
}

template <typename Ptr, typename T, typename Op>
__device__ inline T cuda_joint_reduce(const cuda_items& at, Ptr first, std::size_t length,
                                      const T& init, Op op) {
  __syncthreads();
  if (length == 0) {
    return init;
  }
  const cuda_items used = first_items(at, length);
  T share = first[used.item < used.count ? used.item : 0];
  for (std::size_t i = at.item + at.count; i < length; i += at.count) {
    share = op(share, first[i]);
  }
  return op(init, cuda_reduce(used, share, op));
}

// Tile by tile, one element an item; `carry` is what all tiles before make.
template <bool Inclusive, typename InPtr, typename OutPtr, typename T, typename Op>
__device__ inline void cuda_joint_scan(const cuda_items& at, InPtr first, std::size_t length,
                                       OutPtr result, const T& init, Op op) {
  __syncthreads();
  T carry = init;
  for (std::size_t start = 0; start < length; start += at.count) {
    const cuda_items used = first_items(at, length - start);
    const bool brings = used.item < used.count;
    const T x = first[start + (brings ? used.item : 0)];
    const scan_of_items<T> own = cuda_scan(used, x, op);
    const T through = op(carry, own.through);
    if (brings) {
      const T before = used.item == 0 ? carry : T(op(carry, own.before));
      result[start + used.item] = Inclusive ? through : before;
    }
    carry = cuda_broadcast(at, through, used.count - 1);
  }
}

}  // namespace detail

LUMEN_NAMESPACE_END
