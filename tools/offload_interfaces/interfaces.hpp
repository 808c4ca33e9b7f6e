// SPDX-License-Identifier: Apache-2.0
// Texts that callers of the routines compile: the C header of the offload entries and the Fortran
// modules of both families, from the two lists of routines.
#pragma once

#include <ostream>
#include <string>
#include <vector>

namespace tarn::interfaces {

/// A parameter as C has it, by value: `const double* p` has the type double and is an array.
struct parameter {
  std::string type;
  std::string name;
  bool array;
};

/// A row of a list.
struct routine {
  std::string name;
  std::string lower;                  // in lower case; offload routines only
  std::string value;                  // type of one value of the results
  std::vector<parameter> parameters;  // those of the distribution
  std::string told;                   // offload routines only; empty: as the routine before
};

/// Stands for the integer type of an entry in the parameters of offload routines.
inline constexpr const char* integer_of_entry = "Int";

std::vector<routine> offload_routines();
std::vector<routine> host_routines();

/// `const float *x, Int k` as records.
/// \throws std::invalid_argument for what is not a list of a type and a name each
std::vector<parameter> read_parameters(const std::string& text);

void write_c_header(std::ostream& out);        // offload/include/tarn_rvx_offload.h
void write_offload_module(std::ostream& out);  // offload/fortran/tarn_rvx_offload.f90
void write_host_module(std::ostream& out);     // statistics/fortran/tarn_rvx.f90

}  // namespace tarn::interfaces
