# SPDX-License-Identifier: Apache-2.0
# cmake -DPTX=<file> -P check_engine_stores.cmake: each kernel stores its four results at once where
# they are aligned, and one by one in two places: where they are not, and at the end of the output.
file(READ "${PTX}" text)
string(REGEX MATCHALL "\\.entry " kernels "${text}")
list(LENGTH kernels count)
if(NOT count EQUAL 2)
  message(FATAL_ERROR "${count} kernels instead of 2 in ${PTX}")
endif()
string(REGEX MATCHALL "st\\.global\\.v4\\.f32" found "${text}")
list(LENGTH found number)
if(NOT number EQUAL count)
  message(FATAL_ERROR "${number} stores of 16 bytes in ${count} kernels of ${PTX}")
endif()
if(text MATCHES "\\.local")
  message(FATAL_ERROR "values leave the registers in ${PTX}")
endif()
