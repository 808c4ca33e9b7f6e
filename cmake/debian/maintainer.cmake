# SPDX-License-Identifier: Apache-2.0
# Who answers for the packages, as `maintainer`: "Name <address>" as in Debian's control files, or
# nothing where nobody is known, which cpack refuses. Whoever makes packages is asked as by Debian's own
# tools, then git is. Nothing is kept from one configuration to the next but what the user set.
set(TARN_MAINTAINER "" CACHE STRING
    "Who answers for the packages: Name <address>; if empty, DEBFULLNAME and DEBEMAIL, then git's user")

# asked(OUT VARIABLE KEY): a variable of the environment, else what git has under a key.
function(asked out variable key)
  set(value "$ENV{${variable}}")
  if(value STREQUAL "")
    execute_process(COMMAND git config ${key} WORKING_DIRECTORY "${PROJECT_SOURCE_DIR}"
                    OUTPUT_VARIABLE value ERROR_QUIET OUTPUT_STRIP_TRAILING_WHITESPACE)
  endif()
  set(${out} "${value}" PARENT_SCOPE)
endfunction()

set(maintainer "${TARN_MAINTAINER}")
if(maintainer STREQUAL "")
  asked(name DEBFULLNAME user.name)
  asked(address DEBEMAIL user.email)
  if(name AND address)
    set(maintainer "${name} <${address}>")
  endif()
endif()
