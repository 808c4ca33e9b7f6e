// SPDX-License-Identifier: Apache-2.0
// Saved streams: they come back whole or not at all.
#include <csignal>
#include <cstdio>
#include <dirent.h>
#include <fstream>
#include <unistd.h>

#include <sys/resource.h>
#include <sys/stat.h>

#include "support.hpp"

namespace {

using bytes = std::vector<std::uint8_t>;

bytes image_of(rvx_stream s) {
  bytes image(static_cast<std::size_t>(rvxGetStreamSize(s)) + 8, 0xA5);
  EXPECT_EQ(rvxSaveStreamM(s, image.data()), 0);
  EXPECT_TRUE(std::all_of(image.end() - 8, image.end(), [](auto b) { return b == 0xA5; }));
  image.resize(image.size() - 8);
  return image;
}

// A folder of its own for each case.
class files : public testing::Test {
 protected:
  void SetUp() override {
    folder_ = testing::TempDir() + "tarn_images_XXXXXX";
    ASSERT_NE(mkdtemp(folder_.data()), nullptr);
  }
  void TearDown() override {
    for (const std::string& name : list())
      std::remove(path(name).c_str());
    rmdir(folder_.c_str());
  }

  std::string path(const std::string& name) const { return folder_ + "/" + name; }
  std::vector<std::string> list() const {
    std::vector<std::string> names;
    DIR* dir = opendir(folder_.c_str());
    while (const dirent* entry = readdir(dir)) {
      if (entry->d_name[0] != '.')
        names.emplace_back(entry->d_name);
    }
    closedir(dir);
    return names;
  }
  void write(const std::string& name, const bytes& content) const {
    std::ofstream(path(name), std::ios::binary)
        .write(reinterpret_cast<const char*>(content.data()),
               static_cast<std::streamsize>(content.size()));
  }
  int load(const std::string& name) const {
    rvx_stream loaded = nullptr;
    const int status = rvxLoadStreamF(&loaded, path(name).c_str(), -1);
    if (status == 0)
      rvxDeleteStream(&loaded);
    EXPECT_EQ(loaded, nullptr);
    return status;
  }

  std::string folder_;
};

void expect_same_future(rvx_stream a, rvx_stream b) {
  std::uint32_t x[50], y[50];
  ASSERT_EQ(rvxiRngUniformBits(0, a, 50, x), 0);
  ASSERT_EQ(rvxiRngUniformBits(0, b, 50, y), 0);
  EXPECT_TRUE(std::equal(x, x + 50, y));
}

TEST(images, layout) {
  support::stream s;
  s.set({0x11121314, 0x21222324}, 5, 2);
  const bytes image = image_of(s);
  ASSERT_EQ(image.size(), 44u);
  std::uint32_t code;
  std::memcpy(&code, image.data(), sizeof code);
  EXPECT_EQ(code, 0x1000000u);
  EXPECT_EQ(image[4], 1);
  const support::record r = s.state();
  EXPECT_EQ(std::memcmp(image.data() + 16, &r, sizeof r), 0);
}

TEST(images, round_trip_in_memory_from_every_place_in_a_block) {
  for (std::uint32_t idx = 0; idx <= 4; ++idx) {
    support::stream s;
    s.set({1, 2}, 0xFFFFFFFF, idx);
    const bytes image = image_of(s);
    rvx_stream loaded = nullptr;
    ASSERT_EQ(rvxLoadStreamM(&loaded, image.data()), 0);
    expect_same_future(s, loaded);
    EXPECT_EQ(rvxDeleteStream(&loaded), 0);
  }
}

TEST(images, damage_to_any_byte_is_refused) {
  support::stream s(77);
  const bytes image = image_of(s);
  for (std::size_t at = 0; at < image.size(); ++at) {
    for (unsigned change = 1; change < 256; ++change) {
      bytes damaged = image;
      damaged[at] = static_cast<std::uint8_t>(damaged[at] ^ change);
      rvx_stream loaded = nullptr;
      ASSERT_EQ(rvxLoadStreamM(&loaded, damaged.data()), RVX_STATUS_BAD_IMAGE)
          << "byte " << at << " changed by " << change;
      ASSERT_EQ(loaded, nullptr);
    }
  }
}

TEST(images, random_damage_is_refused) {
  support::stream s(78);
  const bytes image = image_of(s);
  support::test_data data(6);
  for (int round = 0; round < 2000; ++round) {
    bytes damaged = image;
    for (std::size_t i = 0, count = 1 + data.below(12); i < count; ++i)
      damaged[data.below(damaged.size())] = static_cast<std::uint8_t>(data());
    if (damaged == image)
      continue;
    rvx_stream loaded = nullptr;
    ASSERT_EQ(rvxLoadStreamM(&loaded, damaged.data()), RVX_STATUS_BAD_IMAGE) << "round " << round;
    ASSERT_EQ(loaded, nullptr);
  }
}

// An impossible field is refused even if the check sum fits it, as in an image that a faulty
// program made.
TEST(images, impossible_fields_are_refused_with_a_right_check_sum) {
  const auto check_sum = [](const bytes& image) {
    std::uint32_t sum = 0x811C9DC5;  // FNV-1a, the sum's own bytes read as zero
    for (std::size_t i = 0; i < image.size(); ++i)
      sum = (sum ^ (12 <= i && i < 16 ? std::uint8_t{0} : image[i])) * 0x01000193;
    return sum;
  };
  support::stream s;
  bytes image = image_of(s);
  const auto load_with_idx = [&](std::uint8_t idx) {
    image[40] = idx;
    const std::uint32_t sum = check_sum(image);
    std::memcpy(image.data() + 12, &sum, sizeof sum);
    rvx_stream loaded = nullptr;
    const int status = rvxLoadStreamM(&loaded, image.data());
    if (status == 0)
      rvxDeleteStream(&loaded);
    return status;
  };
  EXPECT_EQ(load_with_idx(4), 0);
  EXPECT_EQ(load_with_idx(5), RVX_STATUS_BAD_IMAGE);
  EXPECT_EQ(load_with_idx(255), RVX_STATUS_BAD_IMAGE);
}

TEST_F(files, round_trip_and_replacing) {
  support::stream first(1), second(2);
  const std::string name = path("state");
  ASSERT_EQ(rvxSaveStreamF(first, name.c_str(), -1), 0);
  ASSERT_EQ(rvxSaveStreamF(second, name.c_str(), -1), 0);
  EXPECT_EQ(list(), std::vector<std::string>{"state"});
  rvx_stream loaded = nullptr;
  ASSERT_EQ(rvxLoadStreamF(&loaded, name.c_str(), -1), 0);
  expect_same_future(second, loaded);
  EXPECT_EQ(rvxDeleteStream(&loaded), 0);
}

TEST_F(files, names_as_long_as_the_file_system_takes) {
  support::stream s(3);
  const std::string name = path(std::string(255, 'n'));
  ASSERT_EQ(rvxSaveStreamF(s, name.c_str(), -1), 0);
  ASSERT_EQ(rvxSaveStreamF(s, name.c_str(), -1), 0);
  EXPECT_EQ(list(), std::vector<std::string>{std::string(255, 'n')});
  EXPECT_EQ(load(std::string(255, 'n')), 0);
}

TEST_F(files, a_save_keeps_the_mode_and_the_link) {
  support::stream s(3);
  ASSERT_EQ(rvxSaveStreamF(s, path("private").c_str(), -1), 0);
  ASSERT_EQ(chmod(path("private").c_str(), 0600), 0);
  ASSERT_EQ(symlink("private", path("link").c_str()), 0);
  ASSERT_EQ(rvxSaveStreamF(s, path("link").c_str(), -1), 0);
  struct stat file {
  }, link{};
  ASSERT_EQ(stat(path("private").c_str(), &file), 0);
  ASSERT_EQ(lstat(path("link").c_str(), &link), 0);
  EXPECT_EQ(file.st_mode & 07777, 0600u);
  EXPECT_TRUE(S_ISLNK(link.st_mode));
  EXPECT_EQ(load("link"), 0);
}

TEST_F(files, names_with_a_length_need_no_terminator) {
  support::stream s(3);
  const std::string name = path("cut");
  const std::string longer = name + "-and-more";
  const int length = static_cast<int>(name.size());
  ASSERT_EQ(rvxSaveStreamF(s, longer.c_str(), length), 0);
  EXPECT_EQ(list(), std::vector<std::string>{"cut"});
  rvx_stream loaded = nullptr;
  ASSERT_EQ(rvxLoadStreamF(&loaded, longer.c_str(), length), 0);
  EXPECT_EQ(rvxDeleteStream(&loaded), 0);
}

TEST_F(files, cut_or_lengthened_files_are_refused) {
  support::stream s(4);
  const bytes image = image_of(s);
  for (std::size_t length = 0; length < image.size(); ++length) {
    write("cut", bytes(image.begin(), image.begin() + static_cast<std::ptrdiff_t>(length)));
    ASSERT_EQ(load("cut"), RVX_STATUS_BAD_IMAGE) << length << " bytes";
  }
  write("whole", image);
  EXPECT_EQ(load("whole"), 0);
  bytes longer = image;
  longer.push_back(0);
  write("longer", longer);
  EXPECT_EQ(load("longer"), RVX_STATUS_BAD_IMAGE);
  // A length that no memory holds.
  bytes huge = image;
  for (std::size_t i = 8; i < 12; ++i)
    huge[i] = 0xFF;
  write("huge", huge);
  EXPECT_EQ(load("huge"), RVX_STATUS_BAD_IMAGE);
}

TEST_F(files, missing_files_and_folders) {
  support::stream s(5);
  EXPECT_EQ(load("none"), RVX_STATUS_FILE_OPEN);
  EXPECT_EQ(rvxSaveStreamF(s, path("no/such/folder").c_str(), -1), RVX_STATUS_FILE_OPEN);
  EXPECT_EQ(rvxSaveStreamF(s, "", 0), RVX_STATUS_FILE_WRITE);
  EXPECT_EQ(load(""), RVX_STATUS_FILE_READ) << "a folder is no image";
  // A folder, or what else is no plain file, is not replaced.
  ASSERT_EQ(mkdir(path("folder").c_str(), 0700), 0);
  EXPECT_EQ(rvxSaveStreamF(s, path("folder").c_str(), -1), RVX_STATUS_FILE_WRITE);
  EXPECT_EQ(list(), std::vector<std::string>{"folder"});
  ASSERT_EQ(mkfifo(path("pipe").c_str(), 0600), 0);
  EXPECT_EQ(rvxSaveStreamF(s, path("pipe").c_str(), -1), RVX_STATUS_FILE_WRITE);
  struct stat pipe {};
  ASSERT_EQ(stat(path("pipe").c_str(), &pipe), 0);
  EXPECT_TRUE(S_ISFIFO(pipe.st_mode));
}

// A disk without room, played by the limit of the size of files.
TEST_F(files, a_full_disk_leaves_the_older_image) {
  support::stream s(6);
  ASSERT_EQ(rvxSaveStreamF(s, path("state").c_str(), -1), 0);
  rlimit before{};
  ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &before), 0);
  const auto old_handler = std::signal(SIGXFSZ, SIG_IGN);
  const rlimit small{20, before.rlim_max};
  ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
  const int status = rvxSaveStreamF(s, path("state").c_str(), -1);
  ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &before), 0);
  std::signal(SIGXFSZ, old_handler);
  EXPECT_EQ(status, RVX_STATUS_FILE_WRITE);
  EXPECT_EQ(list(), std::vector<std::string>{"state"});
  EXPECT_EQ(load("state"), 0);
}

}  // namespace
