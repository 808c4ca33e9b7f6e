// SPDX-License-Identifier: Apache-2.0
// The end of the process: immediate exit, exit hooks, and functions called before unloading.
#include <gtest/gtest.h>

#include "child_process.hpp"
#include "tarn_serv.h"

namespace {

using core_test::run_child;

TEST(CoreEnd, ExitFlushesAndRunsNoCleanUp) {
  const auto child = run_child({"exit"});
  EXPECT_EQ(child.exit_code, 7);
  EXPECT_EQ(child.out, "no newline yet");
}

TEST(CoreEnd, AHookDecidesAndMayReturn) {
  const auto child = run_child({"hook"});
  EXPECT_EQ(child.exit_code, 0);
  EXPECT_EQ(child.out, "hook 7\nreturned\n");
}

TEST(CoreEnd, SettingAHookReturnsTheFormerOne) {
  const tarn_serv_exit_hook hook = [](int) {};
  EXPECT_EQ(tarn_serv_set_exit_hook(hook), nullptr);
  EXPECT_EQ(tarn_serv_set_exit_hook(nullptr), hook);
  EXPECT_EQ(tarn_serv_set_exit_hook(nullptr), nullptr);
}

TEST(CoreEnd, RegisteredFunctionsRunLatestFirstBeforeOlderStatics) {
  const auto child = run_child({"end"});
  EXPECT_EQ(child.exit_code, 0);
  EXPECT_EQ(child.out, "second function\nfirst function\nstatic object ends\n");
}

TEST(CoreEnd, UnloadingTheCoreCallsThemToo) {
  // A copy, since the helper program itself keeps the core it is linked with.
  const core_test::scratch_folder folder;
  const std::string copy = folder / "libcopy_of_core.so";
  ASSERT_EQ(core_test::run("/bin/cp", {TARN_CORE_LIBRARY, copy}).exit_code, 0);
  const auto child = run_child({"unload", copy});
  EXPECT_EQ(child.exit_code, 0);
  EXPECT_EQ(child.out, "before unloading\nfirst function\nafter unloading\n");
}

}  // namespace
