// SPDX-License-Identifier: Apache-2.0
// Makes the whole table. A run that is stopped can be taken up again: finished rows stand in
// `path`.part, in any order, and are not made a second time.
#pragma once

#include <string>

namespace tarn::mt2203 {

// Tells its progress on stderr. The file does not depend on the number of threads.
void generate_table(const std::string& path, unsigned threads);

}  // namespace tarn::mt2203
