// SPDX-License-Identifier: Apache-2.0
// Checks of arguments and their reports, shared by all wrappers.
#pragma once

#include <cstdint>

#include "tarn_rvx.h"

namespace tarn::rvx {

// Reports that argument number `position` (from 1) of the function `name` is bad; gives `status`.
int report(const char* name, int position, int status);

// 0 for a stream that bears its mark; else reports `position` and gives the status.
int check_stream(const char* name, int position, rvx_stream stream);

// The same for the argument that holds a handle to be written.
int check_handle(const char* name, int position, const rvx_stream* stream);

}  // namespace tarn::rvx
