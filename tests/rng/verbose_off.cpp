// SPDX-License-Identifier: Apache-2.0
// What verbose reports cost a call while they are off: every entry reads the level once, compares
// once, branches once, and calls the backend frame. Read from the machine code of the library, in
// the writing of GNU objdump for x86-64 (AT&T syntax), since no clock is fine enough.
#include <cstdio>
#include <cstring>
#include <functional>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace {

struct instruction {
  std::string address;
  std::string name;
  std::string operands;  // with the comment of objdump: the symbol that an address is that of
};

using instructions = std::vector<instruction>;

bool starts_with(const std::string& text, const char* start) {
  return text.rfind(start, 0) == 0;
}
bool holds(const std::string& text, const char* part) {
  return text.find(part) != std::string::npos;
}

std::string cut(const std::string& text, std::size_t begin, std::size_t end) {
  const std::size_t first = text.find_first_not_of(" \t", begin);
  return first == std::string::npos || first >= end ? "" : text.substr(first, end - first);
}

/// "  5d55d5:\tmov    (%rax),%rax"
instruction parse(const std::string& line) {
  const std::size_t colon = line.find(':');
  const std::size_t name = line.find_first_not_of(" \t", colon + 1);
  const std::size_t end = line.find_first_of(" \t", name);
  return {cut(line, 0, colon), line.substr(name, end - name),
          end == std::string::npos ? "" : cut(line, end, line.size())};
}

bool is_call(const instruction& i) {
  return starts_with(i.name, "call");
}
bool is_branch(const instruction& i) {
  return i.name[0] == 'j' && i.name != "jmp";
}
/// The operand that is read, if it is memory other than the stack's. The target of an instruction
/// that stores is its last operand.
bool reads_memory(const instruction& i) {
  const std::size_t open = i.operands.find('(');
  const bool first_operand =
      open != std::string::npos && i.operands.find("),") != std::string::npos && i.name != "lea";
  const bool compared = starts_with(i.name, "cmp") && open != std::string::npos;
  return (first_operand || compared) && !holds(i.operands, "(%rsp") && !holds(i.operands, "(%rbp");
}

/// The function's instructions up to the first that leaves it, with branches not taken.
instructions straight_on(const instructions& body) {
  instructions path;
  for (const instruction& i : body) {
    path.push_back(i);
    if (is_call(i) || i.name == "jmp" || starts_with(i.name, "ret")) {
      break;
    }
  }
  return path;
}

/// From the target of a branch up to the next call.
const instruction* first_call_at(const instructions& body, const std::string& target) {
  bool reached = false;
  for (const instruction& i : body) {
    reached = reached || i.address == target;
    if (reached && is_call(i)) {
      return &i;
    }
  }
  return nullptr;
}

bool calls_frame(const instruction& i) {
  return is_call(i) && holds(i.operands, "generate_on_device");
}
bool calls_slow_test(const instruction& i) {
  return is_call(i) && holds(i.operands, "is_verbose_slow");
}

/// What is wrong with an entry; empty if nothing is.
std::string fault_of(const instructions& body) {
  const instructions path = straight_on(body);
  const instruction* branch = nullptr;
  int branches = 0;
  int references = 0;
  int reads = 0;  // up to the branch
  for (const instruction& i : path) {
    references += holds(i.operands, "verbose_level") ? 1 : 0;
    reads += branches == 0 && reads_memory(i) ? 1 : 0;
    if (is_branch(i)) {
      ++branches;
      branch = &i;
    }
  }
  if (branches != 1 || references != 1) {
    return std::to_string(branches) + " branches, " + std::to_string(references) +
           " references to the level";
  }
  if (reads != 2) {
    return std::to_string(reads) + " words read, not the pointer and the level";
  }
  const instruction* const other =
      first_call_at(body, cut(branch->operands, 0, branch->operands.find(' ')));
  if (other == nullptr) {
    return "the branch leads to no call";
  }
  // A frame that does nothing but refuse is where the compiler expects nobody: it lies behind the
  // branch.
  const bool frame_first = calls_frame(path.back()) && calls_slow_test(*other);
  const bool frame_behind = calls_slow_test(path.back()) && calls_frame(*other);
  if (!frame_first && !frame_behind) {
    return "the two ways do not lead to the backend frame and to the slow test";
  }
  return "";
}

/// Calls `take` with each function of the library: its mangled name and its instructions.
void disassemble(const std::function<void(const std::string&, const instructions&)>& take) {
  const std::string command =
      std::string(TARN_OBJDUMP) + " -d --no-show-raw-insn " + TARN_RNG_LIBRARY;
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> pipe(popen(command.c_str(), "r"), pclose);
  if (pipe == nullptr) {
    throw std::runtime_error("cannot run " + command);
  }
  std::string name;
  instructions body;
  std::vector<char> buffer(1 << 16);
  while (std::fgets(buffer.data(), static_cast<int>(buffer.size()), pipe.get()) != nullptr) {
    std::string line(buffer.data(), std::strcspn(buffer.data(), "\n"));
    const std::size_t open = line.find(" <");
    if (!line.empty() && line.back() == ':' && open != std::string::npos) {
      name = line.substr(open + 2, line.size() - open - 4);
      body.clear();
    } else if (holds(line, ":\t")) {
      body.push_back(parse(line));
    } else if (!body.empty()) {
      take(name, body);
      body.clear();
    }
  }
  if (!body.empty()) {
    take(name, body);
  }
}

constexpr int distributions = 0
#define TARN_DISTRIBUTION(family, result, method, type, words, road, gpu) +1
#include "distributions/distributions.def"
    ;
constexpr int engines = 0
#define TARN_ENGINE(name, ...) +1
#include "engines/engines.def"
    ;

TEST(verbose_off, every_entry_costs_one_load_and_one_branch) {
  int entries = 0;
  std::map<std::string, int> faults;
  disassemble([&](const std::string& name, const instructions& body) {
    if (starts_with(name, "_ZN7kestrel4tarn3rng8generateI") && !holds(name, ".cold")) {
      ++entries;
      const std::string fault = fault_of(body);
      if (!fault.empty() && faults[fault]++ == 0) {
        ADD_FAILURE() << name << ": " << fault;
      }
    }
  });
  for (const auto& [fault, count] : faults) {
    ADD_FAILURE() << count << " entries: " << fault;
  }
  EXPECT_EQ(entries, 2 * engines * distributions);  // the USM form and that of buffers
}

}  // namespace
