// SPDX-License-Identifier: Apache-2.0
// The kernel of gaussian_mv: mean + T z in place, for vectors z of independent standard normals.
// Sums go column by column of T, which fixes their rounding, into memory of the work-group, so that
// a vector is only written when all of it has been read.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng/gaussian_mv.hpp>
#include <sycl/sycl.hpp>

#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// Over an nd_range of groups of one work-item, each with four vectors of its own. `Out` is a
/// pointer to `T` or an accessor that reads and writes.
template <typename Out, typename T>
struct gaussian_mv_post_process {
  using parameters = sycl::accessor<T, 1, sycl::access_mode::read>;
  static constexpr std::int32_t vectors = 4;

  std::uint32_t dimension;
  std::uint32_t layout;  // a matrix_layout
  Out out;
  parameters mean;
  parameters matrix;
  sycl::local_accessor<T, 1> tmp;  // the sums of a row
  std::uint64_t n;                 // vectors of the call, at which the last group ends

  SYCL_EXTERNAL void operator()(sycl::nd_item<1> item) const {
    const std::uint64_t first = item.get_group(0) * std::uint64_t{vectors};
    for (std::uint64_t v = first; v < first + vectors && v < n; ++v) {
      transform(static_cast<std::size_t>(v) * dimension);
    }
  }

 private:
  /// The vector whose first element is out[z]. A diagonal factor rounds product and sum at once,
  /// the others round them apart, so that the same diagonal differs in the last place. Kept:
  /// results depend on it.
  SYCL_EXTERNAL void transform(std::size_t z) const {
    if (layout == static_cast<std::uint32_t>(matrix_layout::diagonal)) {
      for (std::size_t j = 0; j < dimension; ++j) {
        out[z + j] = sycl::fma(matrix[j], out[z + j], mean[j]);
      }
    } else {
      multiply(z);
      for (std::size_t j = 0; j < dimension; ++j) {
        out[z + j] = tmp[j] + mean[j];
      }
    }
  }

  /// tmp = T z. The entries of a packed factor lie in the order of the walk.
  SYCL_EXTERNAL void multiply(std::size_t z) const {
    const std::size_t d = dimension;
    const bool packed = layout == static_cast<std::uint32_t>(matrix_layout::packed);
    std::size_t next = 0;
    for (std::size_t c = 0; c < d; ++c) {
      const T factor = out[z + c];
      for (std::size_t r = c; r < d; ++r) {
        const T entry = matrix[packed ? next++ : r * d + c];
        tmp[r] = c == 0 ? entry * factor : sycl::fma(entry, factor, tmp[r]);
      }
    }
  }
};

/// Launches the kernel on `n` vectors, behind `drawn`, which fills them with standard normals.
/// `Out` is T* or sycl::buffer<T, 1>.
template <typename T, typename Out>
void submit_post_process_gaussian_mv(sycl::handler& group, Out out, sycl::buffer<T, 1> mean,
                                     std::int64_t n, matrix_layout layout,
                                     sycl::buffer<T, 1> matrix, std::uint32_t dimension,
                                     const sycl::event& drawn) {
  group.depends_on(drawn);
  auto bound = bind_in_place(group, out);
  using kernel = gaussian_mv_post_process<decltype(bound), T>;
  // A diagonal factor needs no sums, and so no dimension is too large for it.
  const std::size_t rows = layout == matrix_layout::diagonal ? 1 : dimension;
  group.parallel_for(sycl::nd_range<1>(work_items(n, kernel::vectors), 1),
                     kernel{dimension,
                            static_cast<std::uint32_t>(layout),
                            bound,
                            {mean, group},
                            {matrix, group},
                            sycl::local_accessor<T, 1>(sycl::range<1>(rows), group),
                            static_cast<std::uint64_t>(n)});
}

/// Makes `n` vectors of mean.size() dimensions, one or more, of those of standard normals that
/// `drawn` leaves in `out`. Over on return; `mean` and `matrix` are not used any more then. `Out`
/// is T* or sycl::buffer<T, 1>.
template <typename T, typename Out>
sycl::event post_process_gaussian_mv(sycl::queue& queue, std::int64_t n, Out out,
                                     const std::vector<T>& mean, const std::vector<T>& matrix,
                                     matrix_layout layout, const sycl::event& drawn);

}  // namespace kestrel::tarn::rng::detail::gpu
