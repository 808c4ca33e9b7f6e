// SPDX-License-Identifier: Apache-2.0
// Every distribution that can be drawn: functors and routines.
#pragma once

#include "distributions/uniform.hpp"
