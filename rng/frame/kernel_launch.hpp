// SPDX-License-Identifier: Apache-2.0
// What all launches share: the work of a call without its types, the output bound to a kernel, and
// the submission of engines whose state travels by value. In the command group, on the calling
// thread: the state record is copied out of the host stream, the stream is skipped past the call,
// the kernel is launched with the copy. So the calls of a thread read consecutive stretches of the
// sequence whether or not earlier kernels have run, and the kernels need no order among them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <vector>

#include <sycl/sycl.hpp>

#include "frame/streams.hpp"

namespace kestrel::tarn::rng::detail {

/// A launch without its types: `launch` is called in the command group with the context and the
/// snapshot of the state record.
struct kernel_launch {
  void (*launch)(sycl::handler& group, const void* context, const void* record);
  const void* context;
  std::size_t record_size;  // at most max_record_size
};
inline constexpr std::size_t max_record_size = 32;

/// Submits the command group described above; `words` is what the call takes from the sequence.
/// Raises computation_error ("skip_ahead") and the runtime's own errors. There is no way back: the
/// stream stays moved if the launch fails.
sycl::event submit_with_snapshot(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                                 rvx_stream stream, std::uint64_t words,
                                 const kernel_launch& kernel);

/// The number of work-items for `n` values of `per_item` each, in signed arithmetic: a sum past
/// 2^63 turns negative, which the runtime's test of the range refuses like any range over 2^31.
inline std::size_t work_items(std::int64_t n, std::int32_t per_item) {
  const auto sum = static_cast<std::int64_t>(static_cast<std::uint64_t>(n) +
                                             static_cast<std::uint64_t>(per_item - 1));
  return static_cast<std::size_t>(sum / per_item);
}

/// Values that `n` results of `per_result` each fill; the largest count for what passes it, which
/// work_items turns into a range that is refused where an engine's range grows with the count.
inline std::int64_t values_of(std::int64_t n, std::int64_t per_result) {
  constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
  return n > most / per_result ? most : n * per_result;
}

/// What a kernel stores through: the pointer itself, or an accessor bound in the command group.
/// Elements past the call's values keep theirs.
template <typename T>
T* bind_output(sycl::handler&, T* r) {
  return r;
}
template <typename T>
auto bind_output(sycl::handler& group, sycl::buffer<T, 1>& r) {
  return sycl::accessor<T, 1, sycl::access_mode::write>(r, group);
}

/// The same for a kernel that reads the output as well.
template <typename T>
T* bind_in_place(sycl::handler&, T* r) {
  return r;
}
template <typename T>
auto bind_in_place(sycl::handler& group, sycl::buffer<T, 1>& r) {
  return sycl::accessor<T, 1, sycl::access_mode::read_write>(r, group);
}

}  // namespace kestrel::tarn::rng::detail
