# SPDX-License-Identifier: Apache-2.0
# The table of runtimes that are bound late.

# A runtime, its list of functions, and what callers meet.
function(table_runtimes out)
  head(table "Runtime" "Functions" "When it is missing" "Lock")
  foreach(runtime IN ITEMS
          "OpenCL|opencl||silence|yes"
          "Level Zero|level_zero|, `zeInit` called at once|one line on standard error, which says \
what is missing|none: two first callers may both bind, with the same result"
          "OpenMP offload|openmp||silence|yes")
    fields("${runtime}" name list note missing lock)
    file(STRINGS "${ROOT}/service/${list}_functions.def" functions REGEX "^TARN_[A-Z_]+_FUNCTION\\(")
    list(LENGTH functions count)
    line(table "${name}" "${count}${note}" "${missing}" "${lock}")
  endforeach()
  set(${out} "${table}" PARENT_SCOPE)
endfunction()
