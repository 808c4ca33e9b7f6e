// SPDX-License-Identifier: Apache-2.0
// Pieces of Fortran modules: interfaces of C functions. All of them return a status.
#pragma once

#include <ostream>
#include <string>
#include <vector>

namespace tarn::interfaces {

/// A dummy argument.
struct dummy {
  std::string name;
  std::string type;    // such as real(c_float)
  std::string passed;  // value, intent(in) or intent(inout)
  bool array;          // of assumed size
};

/// The type that is interoperable with a C type. Unsigned numbers become signed ones of the same
/// bits.
/// \throws std::invalid_argument for a type that no list has
std::string fortran_type(const std::string& c_type);

/// The interface of the C function `label`, which is `name` within Fortran.
void write_function(std::ostream& out, const std::string& name, const std::string& label,
                    const std::vector<dummy>& dummies);

/// A comment of whole lines.
void write_comment(std::ostream& out, const std::string& text);

}  // namespace tarn::interfaces
