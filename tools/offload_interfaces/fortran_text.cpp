// SPDX-License-Identifier: Apache-2.0
// Lines of Fortran in the free form, which has 132 columns at most.
#include "fortran_text.hpp"

#include <algorithm>
#include <map>
#include <sstream>
#include <stdexcept>

namespace tarn::interfaces {
namespace {

constexpr std::size_t widest_line = 100;

bool alike(const dummy& x, const dummy& y) {
  return x.type == y.type && x.passed == y.passed && x.array == y.array;
}

std::string listed(const std::vector<dummy>& dummies) {
  std::string list;
  for (const dummy& one : dummies) {
    list += (list.empty() ? "" : ", ") + one.name;
  }
  return list;
}

/// One line for all dummies that are alike.
void write_declarations(std::ostream& out, std::vector<dummy> rest) {
  while (!rest.empty()) {
    const dummy first = rest.front();
    const auto others = std::stable_partition(
        rest.begin(), rest.end(), [&first](const dummy& one) { return alike(one, first); });
    std::vector<dummy> declared(rest.begin(), others);
    for (dummy& one : declared) {
      one.name += one.array ? "(*)" : "";
    }
    out << "      " << first.type << ", " << first.passed << " :: " << listed(declared) << '\n';
    rest.erase(rest.begin(), others);
  }
}

}  // namespace

std::string fortran_type(const std::string& c_type) {
  static const std::map<std::string, std::string> types = {
      {"float", "real(c_float)"},        {"double", "real(c_double)"},
      {"int32_t", "integer(c_int32_t)"}, {"uint32_t", "integer(c_int32_t)"},
      {"int64_t", "integer(c_int64_t)"}, {"uint64_t", "integer(c_int64_t)"}};
  const auto found = types.find(c_type);
  if (found == types.end()) {
    throw std::invalid_argument("no type of Fortran for " + c_type);
  }
  return found->second;
}

void write_function(std::ostream& out, const std::string& name, const std::string& label,
                    const std::vector<dummy>& dummies) {
  std::string line = "    integer(c_int) function " + name + '(';
  for (const std::string& piece : {listed(dummies) + ") ", "bind(C, name=\"" + label + "\")"}) {
    if (line.size() + piece.size() >= widest_line) {
      out << line << (line.back() == ' ' ? "&\n" : " &\n");
      line = std::string(8, ' ');
    }
    line += piece;
  }
  out << line << "\n      import\n";
  write_declarations(out, dummies);
  out << "    end function\n";
}

void write_comment(std::ostream& out, const std::string& text) {
  std::istringstream words(text);
  std::string line = "  !";
  for (std::string word; words >> word; line += ' ' + word) {
    if (line.size() + 1 + word.size() > widest_line) {
      out << line << '\n';
      line = "  !";
    }
  }
  out << line << '\n';
}

}  // namespace tarn::interfaces
