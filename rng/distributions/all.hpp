// SPDX-License-Identifier: Apache-2.0
// Every family: its routines on the host, and the functors of those that draw with one kernel.
#pragma once

#include "distributions/gamma.hpp"
#include "distributions/gaussian.hpp"
#include "distributions/gaussian_mv.hpp"
#include "distributions/inverse_cdf.hpp"
#include "distributions/poisson.hpp"
#include "distributions/trials.hpp"
#include "distributions/uniform.hpp"
