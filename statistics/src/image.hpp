// SPDX-License-Identifier: Apache-2.0
// The saved image of a stream: the stream record itself with a check sum in its header, so that
// header.length bytes hold everything. Files hold the image and nothing else.
#pragma once

#include <cstddef>
#include <cstdint>

#include "stream.hpp"

namespace tarn::statistics {

// Writes record.length bytes.
void write_image(const stream_header& stream, std::uint8_t* image);

// Reads the header at `image`, of at least 16 bytes, and gives the length of the whole image, or
// 0 if this is no header of an image: wrong mark, version, code or sum, or a length below the
// header's.
std::size_t image_length(const std::uint8_t* image);

// Makes a stream of an image of `length` bytes: 0 or a negative status, `out` written on success.
int read_image(const std::uint8_t* image, std::size_t length, stream_header** out);

// The same with a file. A save writes beside the file and renames.
int save_image_file(const stream_header& stream, const char* name);
int load_image_file(const char* name, stream_header** out);

}  // namespace tarn::statistics
