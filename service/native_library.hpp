// SPDX-License-Identifier: Apache-2.0
// Loads libraries of the system by name, and by nothing but a name: what decides where a library
// comes from is the dynamic loader's own search, never a path that somebody handed in.
#pragma once

#include <cstddef>

namespace kestrel::tarn::gpu {

/// Room for a library's name, for a folder, and for the kept message, each with its closing NUL.
inline constexpr std::size_t native_text_size = 260;

/// The library `name`, or null. Null at once for a name that is missing, empty or of 260 or more
/// characters, and for one that holds '/' or '\\'. Otherwise the library is looked for in the two
/// folders of set_native_folders, in the second one only if it is another one, and last by its
/// plain name. Never unloaded. Any thread may call.
void* load_native_library(const char* name);

/// The message of the dynamic loader for the latest first attempt that failed, a blank, and the
/// name, cut to 259 characters; empty if none has failed. `text` has native_text_size bytes.
void first_load_failure(char* text);

/// Where libraries are looked for before the dynamic loader's own search: texts that are put before
/// the name, so a folder ends in '/'; cut to 259 characters. Both are empty until this is called.
void set_native_folders(const char* first, const char* second);

}  // namespace kestrel::tarn::gpu
