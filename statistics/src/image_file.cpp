// SPDX-License-Identifier: Apache-2.0
// Images in files. A save goes to a new file in the same folder that is brought to the disk and
// then renamed over the target, so that a save which fails or is interrupted, by a power cut too,
// leaves an older image as it was. The new file has the mode of the older one, and takes the place
// of the file that a symbolic link leads to. Every failure is a status and leaves no file behind.
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <memory>
#include <new>
#include <string>
#include <unistd.h>
#include <vector>

#include <sys/stat.h>

#include "image.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

struct file_closer {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using open_file = std::unique_ptr<std::FILE, file_closer>;

// The file that is meant: behind symbolic links, if it exists.
std::string resolved(const char* name) {
  const std::unique_ptr<char, decltype(&std::free)> path(realpath(name, nullptr), &std::free);
  return path == nullptr ? name : path.get();
}

// Opens a new file in the target's folder, of a name that no file has yet, and sets `name` to it.
// It gets the mode of the file `old` unless that is null. The target's own name is no part of it:
// that may be as long as the file system allows.
open_file create_beside(const std::string& target, const struct stat* old, std::string& name) {
  constexpr int attempts = 100;
  const std::string folder = target.substr(0, target.rfind('/') + 1);  // "" if there is no slash
  for (int i = 0; i < attempts; ++i) {
    name = folder + ".tarn-" + std::to_string(getpid()) + "-" + std::to_string(i) + ".part";
    const int fd = open(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (fd >= 0) {
      const bool kept = old == nullptr || fchmod(fd, old->st_mode & 07777) == 0;
      open_file file(kept ? fdopen(fd, "wb") : nullptr);
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

  const std::string target = resolved(name);
  struct stat old;
  const bool exists = stat(target.c_str(), &old) == 0;
  if (exists && !S_ISREG(old.st_mode))
    return RVX_STATUS_FILE_WRITE;  // a folder, a device: nothing to be replaced
  std::string part;
  open_file file = create_beside(target, exists ? &old : nullptr, part);
  if (file == nullptr)
    return RVX_STATUS_FILE_OPEN;
  // A full disk may show at any of these steps.
  const bool written = std::fwrite(image.data(), 1, image.size(), file.get()) == image.size() &&
                       std::fflush(file.get()) == 0 && fsync(fileno(file.get())) == 0;
  const bool closed = std::fclose(file.release()) == 0;
  if (written && closed && std::rename(part.c_str(), target.c_str()) == 0)
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
