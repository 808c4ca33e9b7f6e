// SPDX-License-Identifier: Apache-2.0
// Where libraries of the system are looked for. The program's own dlopen notes what the library
// under test asks the dynamic loader for, and passes it on.
#include <atomic>
#include <chrono>
#include <dlfcn.h>
#include <link.h>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "late_binding.hpp"
#include "native_library.hpp"

namespace {

using texts = std::vector<std::string>;

std::mutex attempts_mutex;
texts attempts;
std::atomic<bool> loading_is_slow{false};

}  // namespace

extern "C" __attribute__((visibility("default"))) void* dlopen(const char* name,
                                                               int flags) noexcept {
  using function = void* (*)(const char*, int);
  static const auto next = reinterpret_cast<function>(dlsym(RTLD_NEXT, "dlopen"));
  {
    const std::lock_guard<std::mutex> guard(attempts_mutex);
    attempts.emplace_back(name != nullptr ? name : "the program itself");
  }
  if (loading_is_slow) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return next(name, flags);
}

namespace {

using kestrel::tarn::gpu::first_load_failure;
using kestrel::tarn::gpu::load_native_library;
using kestrel::tarn::gpu::native_text_size;
using kestrel::tarn::gpu::set_native_folders;

const std::string whole = TARN_STUBS "/whole/";
const std::string lacking = TARN_STUBS "/opencl_lacks_clFinish/";
const std::string nowhere = TARN_STUBS "/nowhere/";
const std::string name = "libOpenCL.so.1";

class NativeLibrary : public testing::Test {
 protected:
  NativeLibrary() {
    set_native_folders("", "");
    attempts.clear();
  }

  static std::string message() {
    char text[native_text_size];
    first_load_failure(text);
    return text;
  }

  /// What the dynamic loader says when it is asked for a file that is not there.
  static std::string message_of_loader(const std::string& path) {
    EXPECT_EQ(dlopen(path.c_str(), RTLD_NOW), nullptr);
    return dlerror();
  }

  static std::string file_of(void* library) {
    link_map* map = nullptr;
    EXPECT_EQ(dlinfo(library, RTLD_DI_LINKMAP, &map), 0);
    return map->l_name;
  }
};

TEST_F(NativeLibrary, WhatIsNoPlainNameIsNotTried) {
  load_native_library("libtarn_no_such_library.so");
  attempts.clear();
  const std::string before = message();
  ASSERT_NE(before, "");
  set_native_folders(whole.c_str(), "/");
  EXPECT_EQ(load_native_library(nullptr), nullptr);
  EXPECT_EQ(load_native_library(""), nullptr);
  EXPECT_EQ(load_native_library(std::string(260, 'a').c_str()), nullptr);
  EXPECT_EQ(load_native_library(std::string(5000, 'a').c_str()), nullptr);
  EXPECT_EQ(load_native_library((whole + name).c_str()), nullptr);
  EXPECT_EQ(load_native_library(("../whole/" + name).c_str()), nullptr);
  EXPECT_EQ(load_native_library("a\\b"), nullptr);
  EXPECT_EQ(load_native_library("\\"), nullptr);
  EXPECT_EQ(attempts, texts{});
  EXPECT_EQ(message(), before);
}

TEST_F(NativeLibrary, TheLongestNameHas259Characters) {
  const std::string longest(259, 'a');
  EXPECT_EQ(load_native_library(longest.c_str()), nullptr);
  EXPECT_EQ(attempts, (texts{longest, longest}));
}

TEST_F(NativeLibrary, WithoutFoldersThePlainNameIsTriedAndTriedAgain) {
  EXPECT_EQ(load_native_library("libtarn_no_such_library.so"), nullptr);
  EXPECT_EQ(attempts, (texts{"libtarn_no_such_library.so", "libtarn_no_such_library.so"}));
  attempts.clear();
  EXPECT_NE(load_native_library("libm.so.6"), nullptr);
  EXPECT_EQ(attempts, (texts{"libm.so.6"}));
}

TEST_F(NativeLibrary, TheFirstFolderGoesBeforeTheSecond) {
  set_native_folders(lacking.c_str(), whole.c_str());
  void* const library = load_native_library(name.c_str());
  ASSERT_NE(library, nullptr);
  EXPECT_EQ(file_of(library), lacking + name);
  EXPECT_EQ(attempts, (texts{lacking + name}));
}

TEST_F(NativeLibrary, TheSecondFolderIsTriedWhenTheFirstFails) {
  set_native_folders(nowhere.c_str(), whole.c_str());
  void* const library = load_native_library(name.c_str());
  ASSERT_NE(library, nullptr);
  EXPECT_EQ(file_of(library), whole + name);
  EXPECT_EQ(attempts, (texts{nowhere + name, whole + name}));
}

TEST_F(NativeLibrary, ASecondFolderThatIsTheFirstIsNotTriedAgain) {
  set_native_folders(nowhere.c_str(), nowhere.c_str());
  EXPECT_NE(load_native_library("libm.so.6"), nullptr);
  EXPECT_EQ(attempts, (texts{nowhere + "libm.so.6", "libm.so.6"}));
}

TEST_F(NativeLibrary, ThePlainNameComesLast) {
  set_native_folders(nowhere.c_str(), lacking.c_str());
  EXPECT_NE(load_native_library("libm.so.6"), nullptr);
  EXPECT_EQ(attempts, (texts{nowhere + "libm.so.6", lacking + "libm.so.6", "libm.so.6"}));
}

TEST_F(NativeLibrary, TheMessageOfTheFailedFirstAttemptIsKept) {
  set_native_folders(nowhere.c_str(), whole.c_str());
  ASSERT_NE(load_native_library(name.c_str()), nullptr);
  const std::string expected = message_of_loader(nowhere + name) + " " + name;
  ASSERT_LT(expected.size(), native_text_size) << "the folder of the build is too deep for this";
  EXPECT_EQ(message(), expected);
  set_native_folders(whole.c_str(), nowhere.c_str());
  ASSERT_NE(load_native_library(name.c_str()), nullptr);
  EXPECT_EQ(message(), expected) << "kept when the first attempt succeeds";
}

TEST_F(NativeLibrary, TheMessageIsCutToItsRoom) {
  const std::string deep = "/" + std::string(240, 'd') + "/";
  set_native_folders(deep.c_str(), deep.c_str());
  ASSERT_NE(load_native_library("libm.so.6"), nullptr);
  const std::string expected = message_of_loader(deep + "libm.so.6");
  ASSERT_GT(expected.size(), 259U);
  EXPECT_EQ(message(), expected.substr(0, 259));
}

TEST_F(NativeLibrary, AFolderIsCutToItsRoom) {
  const std::string folder(300, 'f');
  set_native_folders(folder.c_str(), folder.c_str());
  EXPECT_NE(load_native_library("libm.so.6"), nullptr);
  EXPECT_EQ(attempts, (texts{folder.substr(0, 259) + "libm.so.6", "libm.so.6"}));
}

TEST_F(NativeLibrary, ThreadsMayLoadWhileFoldersChange) {
  std::vector<std::thread> threads;
  std::vector<void*> found(16, nullptr);
  for (std::size_t t = 0; t < found.size(); ++t) {
    threads.emplace_back([&found, t] {
      set_native_folders(nowhere.c_str(), t % 2 == 0 ? nowhere.c_str() : "");
      found[t] = load_native_library("libm.so.6");
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  for (void* const library : found) {
    EXPECT_EQ(library, dlopen("libm.so.6", RTLD_NOW));
    EXPECT_NE(library, nullptr);
  }
  EXPECT_NE(message().find("nowhere/libm.so.6: "), std::string::npos);
}

TEST_F(NativeLibrary, ThreadsThatBindATableAtTheSameTimeLoadItsLibraryOnce) {
  const char* const names[] = {"cos", "sin"};
  std::atomic<void*> functions[2] = {};
  kestrel::tarn::gpu::binding_record record{"libm.so.6", names, functions, 2};
  loading_is_slow = true;  // so that threads without a lock would meet
  std::atomic<int> waiting{16};
  std::atomic<int> bound{0};
  std::vector<std::thread> threads;
  for (int t = waiting; t > 0; --t) {
    threads.emplace_back([&] {
      --waiting;
      while (waiting.load() != 0) {
        std::this_thread::yield();
      }
      bound += kestrel::tarn::gpu::bind_under_lock(record) == 0 ? 1 : 0;
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  loading_is_slow = false;
  EXPECT_EQ(bound.load(), 16);
  EXPECT_EQ(attempts, (texts{"libm.so.6"}));
}

}  // namespace
