// SPDX-License-Identifier: Apache-2.0
// The SYCL 2020 interface of lumen: one include for everything.
#pragma once

#include "detail/config.hpp"
#if __has_include("detail/vec.hpp")
#include "detail/vec.hpp"
#endif
#if __has_include("detail/builtins.hpp")
#include "detail/builtins.hpp"
#endif
#if __has_include("detail/bit.hpp")
#include "detail/bit.hpp"
#endif
#if __has_include("detail/functional.hpp")
#include "detail/functional.hpp"
#endif
#if __has_include("detail/atomic_ref.hpp")
#include "detail/atomic_ref.hpp"
#endif
