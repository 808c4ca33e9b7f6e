# SPDX-License-Identifier: Apache-2.0
# Run by CPack between the installation into its folder and the making of the packages: what Debian
# asks for and `cmake --install` does not do.
set(release "${CPACK_PACKAGE_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE}")
string(TIMESTAMP date "%a, %d %b %Y %H:%M:%S +0000" UTC)  # SOURCE_DATE_EPOCH, where that is set

file(GLOB papers "${CPACK_TEMPORARY_INSTALL_DIRECTORY}/*/usr/share/doc/*")
foreach(folder IN LISTS papers)
  file(WRITE "${folder}/changelog.Debian" "\
${CPACK_DEBIAN_PACKAGE_SOURCE} (${release}) unstable; urgency=medium

  * Built from the sources; the other changelog tells what is new.

 -- ${CPACK_PACKAGE_CONTACT}  ${date}
")
  execute_process(COMMAND gzip -9n changelog changelog.Debian WORKING_DIRECTORY "${folder}"
                  COMMAND_ERROR_IS_FATAL ANY)
endforeach()

# The loader looks into Debian's folders by itself.
file(GLOB libraries "${CPACK_TEMPORARY_INSTALL_DIRECTORY}/*/usr/lib/*/lib*.so.*")
foreach(library IN LISTS libraries)
  if(NOT IS_SYMLINK "${library}")
    file(RPATH_REMOVE FILE "${library}")
  endif()
endforeach()

list(LENGTH CPACK_TARN_PACKAGES package_count)
list(LENGTH papers paper_count)
if(NOT paper_count EQUAL package_count OR NOT libraries)
  message(FATAL_ERROR "${paper_count} packages, or no library: ${papers}")
endif()
