# SPDX-License-Identifier: Apache-2.0
# Proves that the kernels which should run at the speed of memory keep their values in registers:
# those of uniform, closed-form and Box-Muller distributions on the engines whose state travels by
# value. Reads what ptxas said of each kernel (tools/nvcc_log.sh), prints a table, and fails when
# such a kernel spills or when one that should be there is missing for an architecture. A stack
# frame without spills is shown only: it belongs to the reduction of angles far outside of what
# these kernels compute.
#   cmake -DLOGS=<folder of *.log> -DCXXFILT=<c++filt> [-DARCHITECTURES=<list, such as 80;90>]
#         -P cmake/check_cuda_resources.cmake
cmake_minimum_required(VERSION 3.25)

set(engines philox4x32x10 mrg32k3a mcg31m1 mcg59)
set(functors uniform_std exponential_icdf weibull_icdf rayleigh_icdf gumbel_icdf cauchy_icdf
    laplace_icdf gaussian_icdf lognormal_icdf gaussian_box_muller gaussian_box_muller2
    lognormal_box_muller2 bernoulli_icdf geometric_icdf)
set(functors_of_some bits_std uniform_bits_std)  # not every engine has them

set(rows "")
set(found "")
set(architectures "")
set(spilling 0)

# pad(OUT TEXT WIDTH): the text in a column.
function(pad out text width)
  string(LENGTH "${text}" length)
  math(EXPR missing "${width} - ${length}")
  if(missing GREATER 0)
    string(REPEAT " " ${missing} filling)
    string(APPEND text "${filling}")
  endif()
  set(${out} "${text}" PARENT_SCOPE)
endfunction()

# take(): the kernel whose lines have all been read, if there is one and it is one of those.
macro(take)
  string(REGEX REPLACE "(kestrel::tarn::rng|sycl)::([a-z]+_[0-9]+::)?(detail::)?" "" name "${kernel}")
  if(name MATCHES "engine_func(_sub_seq)?<([a-z0-9]+), [^<>]*gpu::([a-z0-9_]+)(<[^<>]*>), (.*)")
    set(mode "${CMAKE_MATCH_1}")
    set(engine "${CMAKE_MATCH_2}")
    set(functor "${CMAKE_MATCH_3}")
    set(types "${CMAKE_MATCH_4}")
    set(form pointer)
    if(CMAKE_MATCH_5 MATCHES "^accessor")
      set(form accessor)
    endif()
    if(engine IN_LIST engines AND (functor IN_LIST functors OR functor IN_LIST functors_of_some))
      list(APPEND found "${engine}${mode} ${functor} ${form} ${architecture}")
      list(APPEND architectures "${architecture}")
      pad(title "${engine}${mode} ${functor}${types} ${form}" 72)
      pad(title "${title} sm_${architecture}" 80)
      pad(title "${title} ${registers}" 91)
      pad(title "${title} ${spilled}" 100)
      list(APPEND rows "${title} ${stack}")
      if(spilled)
        math(EXPR spilling "${spilling} + 1")
      endif()
    endif()
  endif()
endmacro()

set(kernel "")
file(GLOB logs "${LOGS}/*.log")
foreach(log IN LISTS logs)
  execute_process(COMMAND "${CXXFILT}" INPUT_FILE "${log}" OUTPUT_VARIABLE text
                  COMMAND_ERROR_IS_FATAL ANY)
  string(REGEX REPLACE "[][;]" "," text "${text}")  # what lists of CMake trip over
  string(REPLACE "\n" ";" lines "${text}")
  foreach(line IN LISTS lines)
    if(line MATCHES "Compiling entry function '(.*)' for 'sm_([0-9a-z]+)'")
      set(entry "${CMAKE_MATCH_1}")
      set(next_architecture "${CMAKE_MATCH_2}")
      take()  # that before: what it calls is told behind it
      set(kernel "${entry}")
      set(architecture "${next_architecture}")
      set(stack 0)
      set(spilled 0)
    elseif(line MATCHES "([0-9]+) bytes stack frame, ([0-9]+) bytes spill stores, ([0-9]+) bytes spill loads")
      # its own, and those of functions that it calls
      math(EXPR stack "${stack} + ${CMAKE_MATCH_1}")
      math(EXPR spilled "${spilled} + ${CMAKE_MATCH_2} + ${CMAKE_MATCH_3}")
    elseif(line MATCHES "Used ([0-9]+) registers")
      set(registers "${CMAKE_MATCH_1}")
    endif()
  endforeach()
  take()
  set(kernel "")
endforeach()

if(NOT rows)
  message(FATAL_ERROR "no kernel to look at in ${LOGS}")
endif()
list(SORT rows)
list(JOIN rows "\n" rows)
pad(header "kernel" 73)
message("${header}for     registers  spilled  stack (bytes)\n${rows}")

set(missing 0)
if(ARCHITECTURES AND NOT ARCHITECTURES MATCHES "[a-z]")  # native and its kin are no numbers
  list(APPEND architectures ${ARCHITECTURES})
endif()
list(REMOVE_DUPLICATES architectures)
foreach(architecture IN LISTS architectures)
  foreach(engine IN LISTS engines)
    foreach(functor IN LISTS functors)
      foreach(form pointer accessor)
        if(NOT "${engine} ${functor} ${form} ${architecture}" IN_LIST found)
          math(EXPR missing "${missing} + 1")
          message("missing: ${engine} ${functor} ${form} for sm_${architecture}")
        endif()
      endforeach()
    endforeach()
  endforeach()
endforeach()
if(spilling OR missing)
  message(FATAL_ERROR "${spilling} kernels spill, ${missing} are missing")
endif()
