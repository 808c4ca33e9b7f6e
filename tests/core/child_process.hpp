// SPDX-License-Identifier: Apache-2.0
// Runs a program to its end under a chosen environment, and collects what it printed.
#pragma once

#include <string>
#include <vector>

namespace core_test {

struct outcome {
  int exit_code;  // -1 if a signal ended the program.
  std::string out;
  std::string err;
};

// Runs `program` with `arguments`; `settings` are NAME=VALUE pairs added to an environment from
// which all TARN_ variables and LD_LIBRARY_PATH have been taken.
outcome run(const std::string& program, const std::vector<std::string>& arguments,
            const std::vector<std::string>& settings = {});

// The helper program of these tests.
outcome run_child(const std::vector<std::string>& arguments,
                  const std::vector<std::string>& settings = {});

// How many lines of `text` hold `part`.
int lines_with(const std::string& text, const std::string& part);

// A new empty folder, removed with all its files at the end of the scope.
class scratch_folder {
 public:
  scratch_folder();
  ~scratch_folder();
  scratch_folder(const scratch_folder&) = delete;
  scratch_folder& operator=(const scratch_folder&) = delete;
  std::string operator/(const std::string& name) const { return path_ + "/" + name; }
  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

std::string contents(const std::string& path);

}  // namespace core_test
