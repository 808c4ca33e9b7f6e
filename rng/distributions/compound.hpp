// SPDX-License-Identifier: Apache-2.0
// The device roads of all rejecting and compound families.
#pragma once

#include "distributions/all.hpp"
#include "distributions/beta_gpu_dispatch.hpp"
#include "distributions/binomial_gpu_dispatch.hpp"
#include "distributions/chi_square_gpu_dispatch.hpp"
#include "distributions/compound_call.hpp"
#include "distributions/gamma_gpu_dispatch.hpp"
#include "distributions/gaussian_mv_gpu_dispatch.hpp"
#include "distributions/hypergeometric_gpu_dispatch.hpp"
#include "distributions/multinomial_gpu_dispatch.hpp"
#include "distributions/negbinomial_gpu_dispatch.hpp"
#include "distributions/poisson_v_gpu_dispatch.hpp"
