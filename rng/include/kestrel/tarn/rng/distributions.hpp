// SPDX-License-Identifier: Apache-2.0
// All distributions.
#pragma once

#include <kestrel/tarn/rng/bits.hpp>
#include <kestrel/tarn/rng/continuous.hpp>
#include <kestrel/tarn/rng/discrete.hpp>
#include <kestrel/tarn/rng/gaussian_mv.hpp>
