// SPDX-License-Identifier: Apache-2.0
// The columns behind the figures of distributions.
#pragma once

#include <string>

#include "plots.hpp"

// Draws a million values with philox4x32x10 and writes FOLDER/<name>.density or
// FOLDER/<name>.probabilities: a line of headings, then in each line a place, the height of the
// histogram there, and that of the law.
void write_columns(const plot& of, const std::string& folder);
