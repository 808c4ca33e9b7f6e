# SPDX-License-Identifier: Apache-2.0
# What is in the two packages: together what `cmake --install` brings, and Debian's papers; nothing that
# knows where it was built; libraries named as the runtime package is.

# Every file is root's, and nobody else may write.
foreach(package IN LISTS packages)
  run(list dpkg-deb --contents "${package}")
  string(REPLACE "\n" ";" list "${list}")
  foreach(line IN LISTS list)
    if(NOT line MATCHES "^(drwxr-xr-x|-rw-r--r--|lrwxrwxrwx) root/root ")
      message(SEND_ERROR "${package}: ${line}")
    endif()
  endforeach()
endforeach()

# files(OUT FOLDER): the names of all files and links below it, in order.
function(files out folder)
  file(GLOB_RECURSE found RELATIVE "${folder}" "${folder}/*")
  list(SORT found)
  set(${out} "${found}" PARENT_SCOPE)
endfunction()

files(packed "${PREFIX}")
set(papers ${packed})
list(FILTER packed EXCLUDE REGEX "^share/")
list(FILTER papers INCLUDE REGEX "^share/")
files(installed "${INSTALLED}")
list(TRANSFORM installed REPLACE "^${INSTALLED_LIBDIR}/" "${LIBDIR}/")
list(SORT installed)
equal("the packages' files" "${packed}" "${installed}")

set(meant)
foreach(package ${development} ${runtime})
  foreach(paper changelog.Debian.gz changelog.gz copyright)
    list(APPEND meant share/doc/${package}/${paper})
  endforeach()
endforeach()
list(APPEND meant share/lintian/overrides/${development} share/lintian/overrides/${runtime})
list(SORT meant)
equal("the packages' papers" "${papers}" "${meant}")

# The libraries alone in the one, links and texts in the other.
run(list dpkg-deb --contents "${runtime_package}")
string(REGEX MATCHALL "\\./usr/[^\n ]*[^/\n ](\n| ->)" of_runtime "${list}\n")
list(FILTER of_runtime EXCLUDE REGEX "/share/|/${LIBDIR}/libtarn_[a-z]+\\.so\\.[0-9.]+(\n| ->)$")
equal("other files of ${runtime}" "${of_runtime}" "")

execute_process(COMMAND grep -rlF -e "${HOUSE_SOURCE}/" -e "${HOUSE}/" "${SCRATCH}/root"
                RESULT_VARIABLE result OUTPUT_VARIABLE named)
if(NOT result EQUAL 1)
  message(SEND_ERROR "files that know the tree they were built in:\n${named}")
endif()

file(GLOB libraries "${PREFIX}/${LIBDIR}/libtarn_*.so")
list(LENGTH libraries count)
if(count LESS 3)
  message(FATAL_ERROR "${count} libraries: too few")
endif()
foreach(library IN LISTS libraries)
  run(dynamic "${READELF}" -d "${library}")
  cmake_path(GET library FILENAME name)
  if(NOT dynamic MATCHES "SONAME[^\n]*\\[([^]]*)\\]")
    message(SEND_ERROR "${library} has no soname")
  endif()
  equal("soname" "${CMAKE_MATCH_1}" "${name}.${SOVERSION}")
  if(dynamic MATCHES "R(UN)?PATH")
    message(SEND_ERROR "${library} has a search path of its own")
  endif()
endforeach()

# The changelog begins with this version.
file(STRINGS "${HOUSE_SOURCE}/CHANGELOG.md" heads REGEX "^## [0-9]")
list(GET heads 0 head)
if(NOT head MATCHES "^## ${VERSION}( |$)")
  message(SEND_ERROR "CHANGELOG.md begins with '${head}', not with ${VERSION}")
endif()

# The manual names the packages as they are called.
file(READ "${HOUSE_SOURCE}/docs/packages.md" page)
string(REGEX MATCHALL "libtarn[0-9][0-9.]*[0-9]|libtarn-[a-z]+" names "${page}")
list(REMOVE_DUPLICATES names)
equal("packages that the manual names" "${names}" "${runtime};${development}")
