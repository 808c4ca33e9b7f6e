// SPDX-License-Identifier: Apache-2.0
// Child processes by posix_spawn, with their output in files.
#include "child_process.hpp"

#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <spawn.h>
#include <sstream>
#include <stdexcept>

#include <sys/wait.h>

extern char** environ;

namespace core_test {

namespace {

std::vector<char*> pointers_to(std::vector<std::string>& texts) {
  std::vector<char*> list;
  for (std::string& text : texts) {
    list.push_back(text.data());
  }
  list.push_back(nullptr);
  return list;
}

bool starts_with(const std::string& text, const std::string& start) {
  return text.compare(0, start.size(), start) == 0;
}

}  // namespace

outcome run(const std::string& program, const std::vector<std::string>& arguments,
            const std::vector<std::string>& settings) {
  const scratch_folder folder;
  std::vector<std::string> command = {program};
  command.insert(command.end(), arguments.begin(), arguments.end());
  std::vector<std::string> environment = settings;
  for (char** entry = environ; *entry != nullptr; ++entry) {
    if (!starts_with(*entry, "TARN_") && !starts_with(*entry, "LD_LIBRARY_PATH=")) {
      environment.emplace_back(*entry);
    }
  }
  posix_spawn_file_actions_t actions;
  ::posix_spawn_file_actions_init(&actions);
  const std::string out = folder / "out";
  const std::string err = folder / "err";
  ::posix_spawn_file_actions_addopen(&actions, 1, out.c_str(), O_CREAT | O_WRONLY, 0600);
  ::posix_spawn_file_actions_addopen(&actions, 2, err.c_str(), O_CREAT | O_WRONLY, 0600);
  pid_t child = 0;
  const int failed = ::posix_spawn(&child, program.c_str(), &actions, nullptr,
                                   pointers_to(command).data(), pointers_to(environment).data());
  ::posix_spawn_file_actions_destroy(&actions);
  if (failed != 0) {
    throw std::runtime_error("cannot start " + program);
  }
  int status = 0;
  ::waitpid(child, &status, 0);
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contents(out), contents(err)};
}

outcome run_child(const std::vector<std::string>& arguments,
                  const std::vector<std::string>& settings) {
  return run(TARN_CORE_CHILD, arguments, settings);
}

int lines_with(const std::string& text, const std::string& part) {
  std::istringstream lines(text);
  int count = 0;
  for (std::string line; std::getline(lines, line);) {
    count += line.find(part) != std::string::npos ? 1 : 0;
  }
  return count;
}

scratch_folder::scratch_folder() {
  std::string pattern = (std::filesystem::temp_directory_path() / "tarn_core_XXXXXX").string();
  if (::mkdtemp(pattern.data()) == nullptr) {
    throw std::runtime_error("cannot make a folder");
  }
  path_ = pattern;
}

scratch_folder::~scratch_folder() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

std::string contents(const std::string& path) {
  std::ifstream file(path);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

}  // namespace core_test
