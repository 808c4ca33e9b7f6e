// SPDX-License-Identifier: Apache-2.0
// The lines that exceptions leave behind, from the narrowest class to the widest.
#include "guard.hpp"

#include <cstdio>
#include <exception>

#include <kestrel/tarn/exceptions.hpp>
#include <sycl/sycl.hpp>

#include "statuses.hpp"

namespace kestrel::tarn::rng::detail::openmp {

int tell_exception() noexcept {
  try {
    throw;
  } catch (const tarn::exception& error) {
    std::fprintf(stderr, "Tarn RNG: kestrel::tarn::exception: what: %s\n", error.what());
  } catch (const sycl::exception& error) {
    std::fprintf(stderr, "Tarn RNG: sycl::exception what: %s \n", error.what());
  } catch (const std::exception& error) {
    std::fprintf(stderr, "Tarn RNG: std::exception what: %s\n", error.what());
  } catch (...) {
    std::fputs("Tarn RNG: unknown exception occured during Lumen call\n", stderr);
  }
  return no_device;
}

}  // namespace kestrel::tarn::rng::detail::openmp
