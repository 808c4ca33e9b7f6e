// SPDX-License-Identifier: Apache-2.0
// Images in files. A save goes to a new file in the same folder that is renamed over the target,
// so that an interrupted or failed save leaves an older image as it was. C streams keep the
// interface small; every failure is a status and leaves no file behind.
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <memory>
#include <new>
#include <string>
#include <unistd.h>
#include <vector>

#include "image.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

struct file_closer {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using open_file = std::unique_ptr<std::FILE, file_closer>;

// Opens a new file of a name that no file has yet, with the permissions that a plain new file
// gets, and sets `name` to it.
open_file create_beside(const std::string& target, std::string& name) {
  constexpr int attempts = 100;
  for (int i = 0; i < attempts; ++i) {
    name = target + "." + std::to_string(getpid()) + "-" + std::to_string(i) + ".part";
    const int fd = open(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (fd >= 0) {
      open_file file(fdopen(fd, "wb"));
      if (file == nullptr) {
        close(fd);
        unlink(name.c_str());
      }
      return file;
    }
    if (errno != EEXIST)
      break;
  }
  return nullptr;
}

}  // namespace

int save_image_file(const stream_header& stream, const char* name) try {
  std::vector<std::uint8_t> image(stream.length);
  write_image(stream, image.data());

  std::string part;
  open_file file = create_beside(name, part);
  if (file == nullptr)
    return RVX_STATUS_FILE_OPEN;
  const bool written = std::fwrite(image.data(), 1, image.size(), file.get()) == image.size();
  // Closing flushes: a full disk may show only here.
  const bool closed = std::fclose(file.release()) == 0;
  if (written && closed && std::rename(part.c_str(), name) == 0)
    return RVX_STATUS_OK;
  std::remove(part.c_str());
  return RVX_STATUS_FILE_WRITE;
} catch (const std::bad_alloc&) {
  return RVX_STATUS_NO_MEMORY;
}

int load_image_file(const char* name, stream_header** out) try {
  open_file file(std::fopen(name, "rbe"));
  if (file == nullptr)
    return RVX_STATUS_FILE_OPEN;
  const auto read = [&file](std::uint8_t* bytes, std::size_t size) {
    return std::fread(bytes, 1, size, file.get()) == size;
  };
  const auto short_file = [&file] {
    return std::ferror(file.get()) != 0 ? RVX_STATUS_FILE_READ : RVX_STATUS_BAD_IMAGE;
  };

  // The header first: its length says how much to read, in steps so that a damaged length cannot
  // ask for more memory than the file has bytes.
  std::vector<std::uint8_t> image(sizeof(stream_header));
  if (!read(image.data(), image.size()))
    return short_file();
  const std::size_t length = image_length(image.data());
  if (length == 0)
    return RVX_STATUS_BAD_IMAGE;
  constexpr std::size_t step = 65536;  // bytes
  while (image.size() < length) {
    const std::size_t done = image.size();
    const std::size_t next = length - done < step ? length - done : step;
    image.resize(done + next);
    if (!read(image.data() + done, next))
      return short_file();
  }
  if (std::fgetc(file.get()) != EOF)
    return RVX_STATUS_BAD_IMAGE;  // bytes behind the image
  return read_image(image.data(), length, out);
} catch (const std::bad_alloc&) {
  return RVX_STATUS_NO_MEMORY;
}

}  // namespace tarn::statistics
