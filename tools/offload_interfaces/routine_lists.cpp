// SPDX-License-Identifier: Apache-2.0
// The rows of the two lists as records. The shapes of parameters are macros, so the preprocessor
// puts the parameters together, and their text is read.
#include <sstream>
#include <stdexcept>

#include "interfaces.hpp"
#include "offload/shapes.hpp"

namespace tarn::interfaces {
namespace {

#define TARN_TEXT(...) TARN_TEXT_OF(__VA_ARGS__)
#define TARN_TEXT_OF(...) #__VA_ARGS__

std::string without_commas_ahead(std::string text) {
  return text.erase(0, text.find_first_not_of(" ,"));
}

std::string without_std(const std::string& type) {
  return type.rfind("std::", 0) == 0 ? type.substr(5) : type;
}

parameter read_parameter(std::string text) {
  const std::size_t star = text.find('*');
  const bool array = star != std::string::npos;
  if (array) {
    text.replace(star, 1, " ");
  }
  std::istringstream words(text);
  parameter found{"", "", array};
  words >> found.type;
  const bool constant = found.type == "const";
  if (constant) {
    words >> found.type;
  }
  std::string more;
  if (!(words >> found.name) || words >> more || constant != array) {
    throw std::invalid_argument("not a parameter: " + text);
  }
  found.type = without_std(found.type);
  return found;
}

}  // namespace

std::vector<parameter> read_parameters(const std::string& text) {
  std::vector<parameter> found;
  std::istringstream parts(text);
  for (std::string part; std::getline(parts, part, ',');) {
    found.push_back(read_parameter(part));
  }
  return found;
}

std::vector<routine> offload_routines() {
  std::vector<routine> rows;
#define TARN_OFFLOAD_ROUTINE(name, lower, family, value, shape, arguments, told)           \
  rows.push_back({#name, #lower, #value,                                                   \
                  read_parameters(without_commas_ahead(TARN_TEXT(TARN_OFFLOAD_APPLY(       \
                      TARN_BY_VALUE_##shape, value, Int, TARN_OFFLOAD_NAMES arguments)))), \
                  told});
#include "offload/routines.def"
  return rows;
}

std::vector<routine> host_routines() {
  std::vector<routine> rows;
#define TARN_ROUTINE(name, value, methods, width, parameters, arguments, check)                    \
  rows.push_back({"rvx" #name, "", without_std(#value),                                            \
                  read_parameters(without_commas_ahead(TARN_TEXT(TARN_OFFLOAD_NAMES parameters))), \
                  ""});
#include "statistics/common/routines.def"
  // Its rates go in step with its results, which the list does not tell.
  rows.push_back({"rvxiRngPoissonV", "", "int32_t", {{"double", "lambda", true}}, ""});
  return rows;
}

}  // namespace tarn::interfaces
