// SPDX-License-Identifier: Apache-2.0
// Tarn RNG: everything a user needs.
#pragma once

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng/bit_generator.hpp>
#include <kestrel/tarn/rng/distributions.hpp>
#include <kestrel/tarn/rng/engines.hpp>
#include <kestrel/tarn/rng/functions.hpp>
#include <kestrel/tarn/rng/generate.hpp>
