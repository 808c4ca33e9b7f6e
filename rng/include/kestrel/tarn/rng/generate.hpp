// SPDX-License-Identifier: Apache-2.0
// The one call that draws.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <sycl/sycl.hpp>

/// Random numbers: engines, distributions, and generate, the one call that draws.
namespace kestrel::tarn::rng {

/// Fills `r` with `n` results of `distr`, drawn from `engine` on the device of its queue.
///
/// \param distr   a distribution; poisson_v has as many rates as there are results
/// \param engine  moves by the words consumed
/// \param n       count of results, 0 or more. gaussian_mv writes n * dimension values, multinomial
///                n rows of one count per category, bits of mcg59 two values for a word
/// \param r       a buffer of at least the values written
///
/// The engine has moved past the call on return. On a CPU queue the values are written on return;
/// on a GPU queue access through the buffer waits for them.
///
/// Raises invalid_argument for "n" (negative, or more than the buffer holds), unsupported_device,
/// unimplemented for a combination that is not offered, computation_error when the engine cannot
/// move, and errors of the SYCL runtime unchanged.
template <typename Distr, typename Engine>
TARN_EXPORT void generate(const Distr& distr, Engine& engine, std::int64_t n,
                          sycl::buffer<typename Distr::result_type, 1>& r);

/// The same into memory that the device can write, after `dependencies`.
///
/// \param distr         as above
/// \param engine        as above
/// \param n             as above
/// \param r             not null, with room for the values written
/// \param dependencies  events to wait for before anything is written
/// \return              the event of the last kernel; on a CPU queue it is complete
///
/// Raises as above; invalid_argument for "r" when it is null.
template <typename Distr, typename Engine>
TARN_EXPORT sycl::event generate(const Distr& distr, Engine& engine, std::int64_t n,
                                 typename Distr::result_type* r,
                                 const std::vector<sycl::event>& dependencies = {});

}  // namespace kestrel::tarn::rng
