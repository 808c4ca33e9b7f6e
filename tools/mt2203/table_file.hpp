// SPDX-License-Identifier: Apache-2.0
// The table as text: comment lines, then one row for each member.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "twister.hpp"

namespace tarn::mt2203 {

// The comment lines, which tell the method and the bounds. Each ends with a newline.
std::string table_header();

// A row as it stands in the table, with its newline.
std::string row_text(const parameters& row);

// The rows of a table, in their order. Throws if a line is neither a comment nor a row.
std::vector<parameters> read_table(const std::string& path);

// The rows of a table that is being written and may have been cut off anywhere: whole lines only.
// None at all if it does not exist or begins with a header other than table_header().
std::vector<parameters> read_unfinished_table(const std::string& path);

// Writes header and rows; at every moment `path` is the old file or the new one.
void write_table(const std::string& path, const std::vector<parameters>& rows);

}  // namespace tarn::mt2203
