// SPDX-License-Identifier: Apache-2.0
// Where the statistics library is looked for: the loader's path first, then beside the core.
#include <string>

#include <gtest/gtest.h>

#include "child_process.hpp"
#include "tarn_serv.h"

namespace {

using core_test::run;

const std::string versioned_name = "libtarn_vlx.so." TARN_SOVERSION;

// A folder that holds the helper program's core alone, under the name it is loaded by.
class core_alone {
 public:
  core_alone() { copy(TARN_CORE_LIBRARY, "libtarn_core.so." TARN_SOVERSION); }

  void add_statistics_as(const std::string& name) const {
    copy(TARN_FAKE_VLX_FOLDER "/beside_core/" + versioned_name, name);
  }

  // The statistics library that a program finds which runs with this core and that search path.
  std::string found_with_path(const std::string& path) const {
    return run(TARN_CORE_CHILD, {"statistics"},
               {"LD_PRELOAD=" + (folder_ / ("libtarn_core.so." TARN_SOVERSION)),
                "LD_LIBRARY_PATH=" + path})
        .out;
  }

 private:
  void copy(const std::string& from, const std::string& name) const {
    EXPECT_EQ(run("/bin/cp", {from, folder_ / name}).exit_code, 0) << from;
  }

  core_test::scratch_folder folder_;
};

TEST(CoreLoader, SymbolsOfNothingAreNothing) {
  EXPECT_EQ(tarn_serv_find_symbol(nullptr, "malloc"), nullptr);
}

// The sanitizers' runtime must come first among preloaded libraries, and they load by their own
// search: these cases are for plain builds.
#if !TARN_SANITIZED

TEST(CoreLoader, NothingAnywhereGivesNull) {
  EXPECT_EQ(core_alone().found_with_path(""), "no library\n");
}

TEST(CoreLoader, TheNeighbourOfTheCoreIsFound) {
  core_alone core;
  core.add_statistics_as(versioned_name);
  EXPECT_EQ(core.found_with_path(""), "beside_core\n");
}

TEST(CoreLoader, ThePlainNameWillDo) {
  core_alone core;
  core.add_statistics_as("libtarn_vlx.so");
  EXPECT_EQ(core.found_with_path(""), "beside_core\n");
}

TEST(CoreLoader, TheLoadersPathWinsOverTheNeighbour) {
  core_alone core;
  core.add_statistics_as(versioned_name);
  EXPECT_EQ(core.found_with_path(TARN_FAKE_VLX_FOLDER "/on_path"), "on_path\n");
}

#endif

}  // namespace
