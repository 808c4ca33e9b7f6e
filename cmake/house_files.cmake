# SPDX-License-Identifier: Apache-2.0
# The files of the house, for the checks that walk over all of them. Build folders and hidden
# folders are left out by never being entered.

# house_folders(ROOT OUT): the top-level folders that can hold sources, as names.
function(house_folders root out)
  file(GLOB entries RELATIVE "${root}" "${root}/*")
  set(folders "")
  foreach(entry IN LISTS entries)
    if(IS_DIRECTORY "${root}/${entry}" AND NOT entry MATCHES "^(build.*|\\..*)$")
      list(APPEND folders "${entry}")
    endif()
  endforeach()
  set(${out} "${folders}" PARENT_SCOPE)
endfunction()

# house_files(ROOT OUT ENDING...): the files below the house's folders with one of the endings
# (such as *.hpp), as paths relative to ROOT.
function(house_files root out)
  house_folders("${root}" folders)
  set(found "")
  foreach(folder IN LISTS folders)
    list(TRANSFORM ARGN PREPEND "${root}/${folder}/" OUTPUT_VARIABLE patterns)
    file(GLOB_RECURSE files RELATIVE "${root}" ${patterns})
    list(APPEND found ${files})
  endforeach()
  list(SORT found)
  set(${out} "${found}" PARENT_SCOPE)
endfunction()

set(HOUSE_CODE *.h *.hpp *.hh *.inc *.c *.cc *.cpp *.cu *.cuh *.def)
