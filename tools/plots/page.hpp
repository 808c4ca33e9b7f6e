// SPDX-License-Identifier: Apache-2.0
// The manual's page of all figures.
#pragma once

#include <string>
#include <vector>

#include "plots.hpp"
#include "scatters.hpp"

// Writes the Markdown page PATH, whose links start in its folder.
void write_page(const std::vector<plot>& plots, const std::vector<scatter>& scatters,
                const std::string& path);
