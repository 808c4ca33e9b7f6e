# SPDX-License-Identifier: Apache-2.0
# What must not compile against the public headers does not, for the reason that is meant:
#   cmake -Dcompiler=... -Dinclude=... -Dsycl=... -Drows=engines.def -Dfolder=... -P interface.cmake
# Each snippet stands in two files, one statement to a line: `kept.cpp` has it in a form that has to
# compile, without a warning, and `refused.cpp` in the form that must not. The compiler, which is
# GCC, goes on behind an error, so that each line of refused.cpp is seen to fail by itself, with its
# own message.
cmake_minimum_required(VERSION 3.25)

set(kept "")
set(refused "")
set(reasons "")

# keep(STATEMENT): must compile.
macro(keep statement)
  string(APPEND kept "  ${statement};\n")
endmacro()

# refuse(STATEMENT REASON): must not compile; REASON is a regular expression on the message.
macro(refuse statement reason)
  string(APPEND refused "  ${statement};\n")
  list(APPEND reasons "${reason}")
endmacro()

# snippet(STATEMENT GOOD BAD REASON): @ stands for GOOD in the form that compiles, and for BAD in
# the other one.
macro(snippet statement good bad reason)
  string(REPLACE "@" "${good}" form "${statement}")
  keep("${form}")
  string(REPLACE "@" "${bad}" form "${statement}")
  refuse("${form}" "${reason}")
endmacro()

# service(OFFERED NAME CALL GOOD): a service that the engine NAME offers or has not.
macro(service offered name call good)
  if(${offered})
    string(REPLACE "@" "${name}" form "${call}")
    keep("${form}")
  else()
    snippet("${call}" ${good} ${name} "no matching function for call to '(skip_ahead|leapfrog)")
  endif()
endmacro()

set(no_constructor "no matching function for call to 'kestrel::tarn::rng::[a-z0-9_]+::[a-z0-9_]+")

file(STRINGS "${rows}" lines REGEX "^TARN_ENGINE\\(")
foreach(line IN LISTS lines)
  string(REGEX REPLACE "^TARN_ENGINE\\((.*)\\)$" "\\1" columns "${line}")
  string(REPLACE ", " ";" columns "${columns}")
  list(GET columns 0 name)
  list(GET columns 4 seed_type)
  list(GET columns 6 skip)
  list(GET columns 7 skip_list)
  list(GET columns 8 leapfrog)
  service(${skip} ${name} "skip_ahead(made<@>(), 5)" philox4x32x10)
  service(${skip_list} ${name} "skip_ahead(made<@>(), {5, 7})" philox4x32x10)
  service(${leapfrog} ${name} "leapfrog(made<@>(), 1, 2)" mcg59)
  keep("sink(${name}(queue()))")

  if(NOT name STREQUAL "mrg32k3a")
    snippet("sink(@(queue(), 1, mrg32k3a_mode::optimal{}))" mrg32k3a ${name} "${no_constructor}")
    snippet("sink(@(queue(), 1, mrg32k3a_mode::custom(64)))" mrg32k3a ${name} "${no_constructor}")
    snippet("sink(@(queue(), {1, 2}, mrg32k3a_mode::optimal{}))" mrg32k3a ${name}
            "${no_constructor}")
  endif()
  if(name MATCHES "^(mcg31m1|mcg59|sobol|niederreiter|nondeterministic)$")
    snippet("sink(@(queue(), {1, 2}))" mt19937 ${name} "${no_constructor}")
  endif()
  if(NOT name MATCHES "^(mt2203|wichmann_hill)$")
    snippet("sink(@(queue(), 1, 2))" mt2203 ${name} "${no_constructor}")
  endif()
  if(seed_type STREQUAL "none")
    snippet("sink(@(queue(), 1))" mcg59 ${name} "${no_constructor}")
  endif()
  snippet("@" "${name} engine_${name}(queue())" "${name} engine_${name} = queue()"
          "conversion from 'sycl::[a-z0-9_:]*queue' to non-scalar type")
  # A service is no member of the class.
  snippet("made<${name}>().@" "get_queue()" "skip_ahead(5)"
          "(is private within this context|has no member named 'skip_ahead')")
endforeach()

# Result types and methods of distributions: family, one of its methods.
# family_snippets(PAIR GOOD BAD TYPES)
macro(family_snippets pair good bad types)
  string(REGEX REPLACE "/.*" "" family "${pair}")
  string(REGEX REPLACE ".*/" "" method "${pair}")
  snippet("static_assert(sizeof(${family}<@>) != 0)" ${good} ${bad}
          "${family}: the result type is ${types}")
  snippet("static_assert(sizeof(${family}<${good}, @>) != 0)" "${family}_method::${method}"
          "uniform_method::standard" "${family}: no such method")
endmacro()
foreach(pair IN ITEMS gaussian/icdf lognormal/icdf exponential/icdf weibull/icdf rayleigh/icdf
                      gumbel/icdf laplace/icdf cauchy/icdf gamma/marsaglia beta/cja
                      chi_square/gamma_based)
  family_snippets(${pair} float std::int32_t "float or double")
endforeach()
foreach(pair IN ITEMS poisson/ptpe poisson_v/gaussian_icdf_based binomial/btpe
                      negative_binomial/nbar hypergeometric/h2pe multinomial/poisson_icdf_based
                      geometric/icdf bernoulli/icdf)
  family_snippets(${pair} std::uint32_t float "std::int32_t or std::uint32_t")
endforeach()
snippet("static_assert(sizeof(gaussian_mv<@>) != 0)" float std::int32_t
        "gaussian_mv: the result type is float or double")
snippet("static_assert(sizeof(uniform<@>) != 0)" std::uint32_t std::int64_t
        "uniform: the result type is float, double, std::int32_t or std::uint32_t")
snippet("static_assert(sizeof(uniform<float, @>) != 0)" uniform_method::accurate
        gaussian_method::icdf "uniform: no such method")
snippet("static_assert(sizeof(bits<@>) != 0)" std::uint32_t std::uint64_t
        "bits: the result type is std::uint32_t")
snippet("static_assert(sizeof(uniform_bits<@>) != 0)" std::uint64_t std::int32_t
        "uniform_bits: the result type is std::uint32_t or std::uint64_t")

# Results go to memory of their own type.
snippet("generate(uniform<float>(), made<mcg59>(), 1, made<@>())" "float*" "double*"
        "no matching function for call to 'generate")
snippet("generate(uniform<float>(), made<mcg59>(), 1, made<@>())" "sycl::buffer<float>"
        "sycl::buffer<double>" "no matching function for call to 'generate")

set(head [[
#include <kestrel/tarn/rng.hpp>

using namespace kestrel::tarn::rng;

template <typename Type>
Type& made();
sycl::queue queue();
template <typename Type>
void sink(const Type&) {}

void snippets() {
  using kestrel::tarn::rng::gamma;  // <math.h> has one as well
]])
string(REGEX MATCHALL "\n" head_lines "${head}")
list(LENGTH head_lines head_lines)

# compile(FORM): writes and compiles one of the files.
function(compile form)
  string(REPLACE "" "\;" text "${${form}}")
  file(WRITE "${folder}/${form}.cpp" "${head}${text}}\n")
  execute_process(
    COMMAND "${compiler}" -std=c++17 -fsyntax-only -fno-diagnostics-show-caret -Wall -Wextra
            -Werror "-I${include}" "-I${sycl}" "${folder}/${form}.cpp"
    RESULT_VARIABLE status ERROR_VARIABLE messages)
  set(status "${status}" PARENT_SCOPE)
  set(messages "${messages}" PARENT_SCOPE)
endfunction()

set(ENV{LC_ALL} C)  # plain quotes in messages
file(MAKE_DIRECTORY "${folder}")
compile(kept)
if(NOT status EQUAL 0)
  message(FATAL_ERROR "kept.cpp does not compile:\n${messages}")
endif()
compile(refused)
if(status EQUAL 0)
  message(FATAL_ERROR "all of refused.cpp compiles")
endif()
set(line ${head_lines})
set(wrong "")
foreach(reason IN LISTS reasons)
  math(EXPR line "${line} + 1")
  # In the line itself, or in a header that the line has instantiated.
  if(NOT messages MATCHES "refused\\.cpp:${line}:[0-9]+:( error:|   required from here\n[^\n]*error:)[^\n]*${reason}")
    string(APPEND wrong "refused.cpp:${line} is not refused with: ${reason}\n")
  endif()
endforeach()
if(wrong)
  message(FATAL_ERROR "${wrong}")
endif()
list(LENGTH reasons count)
if(count LESS 100)
  message(FATAL_ERROR "only ${count} snippets")
endif()
message(STATUS "${count} snippets are refused, each for its reason")
