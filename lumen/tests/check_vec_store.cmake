# SPDX-License-Identifier: Apache-2.0
# cmake -DPTX=<file> -P check_vec_store.cmake: vecs of 16 bytes move in one instruction, those of 32
# in two, and none element by element.
file(READ "${PTX}" text)

# count(<instruction> <times>): how often it stands in the text.
function(count instruction times)
  string(REGEX MATCHALL "${instruction}" found "${text}")
  list(LENGTH found number)
  if(NOT number EQUAL times)
    message(FATAL_ERROR "${instruction}: ${number} times instead of ${times} in ${PTX}")
  endif()
endfunction()

count("st\\.global\\.v4\\.[fub]32" 2)
count("ld\\.global\\.v4\\.[fub]32" 1)
count("st\\.global\\.v2\\.[fub]64" 2)
count("(st|ld)\\.global\\.[fub]" 0)
