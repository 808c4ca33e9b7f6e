# SPDX-License-Identifier: Apache-2.0
# The packages in an empty Debian 12, which debootstrap makes from the mirror that this machine uses:
# apt-get installs them with what they depend on, and the user's project is built and run in there.
# Only in long runs, and as root.
if(NOT "$ENV{TARN_LONG_TESTS}")
  message(STATUS "skipped: for long runs")
  return()
endif()
find_program(debootstrap debootstrap PATHS /usr/sbin)
run(user id -u)
if(NOT debootstrap OR NOT user EQUAL 0)
  message(STATUS "skipped: this takes debootstrap and root")
  return()
endif()

set(debian "${SCRATCH}/debian")
file(REMOVE_RECURSE "${debian}")
run(mirrors apt-get indextargets --format "$(REPO_URI)" "Created-By: Packages" "Codename: bookworm")
string(REGEX MATCH "^[^\n]+" mirror "${mirrors}")
execute_process(COMMAND "${debootstrap}" --variant=minbase bookworm "${debian}" "${mirror}"
                RESULT_VARIABLE result OUTPUT_VARIABLE said ERROR_VARIABLE said)
if(NOT result EQUAL 0)
  message(STATUS "skipped: debootstrap makes no Debian from '${mirror}':\n${said}")
  return()
endif()

# inside(OUT COMMAND...): run() in the new system, without this machine's environment.
function(inside out)
  run(said env -i PATH=/usr/sbin:/usr/bin DEBIAN_FRONTEND=noninteractive chroot "${debian}" ${ARGN})
  set(${out} "${said}" PARENT_SCOPE)
endfunction()

file(COPY /etc/resolv.conf DESTINATION "${debian}/etc")
file(COPY ${packages} DESTINATION "${debian}/packages")
file(COPY "${CMAKE_CURRENT_LIST_DIR}/project" DESTINATION "${debian}")
inside(ignored apt-get -q -y update)
list(TRANSFORM packages REPLACE ".*/" "/packages/" OUTPUT_VARIABLE names)
inside(ignored apt-get -q -y install --no-install-recommends ${names} g++ cmake make pkg-config)
inside(ignored apt-get -q -y check)

inside(ignored cmake -S /project -B /built -DCMAKE_BUILD_TYPE=Release)
inside(ignored cmake --build /built)
inside(by_cmake /built/consumer)
inside(in_c /built/consumer_c)
inside(ignored sh -c
       "g++ -std=c++17 /project/consumer.cpp -o /built/by_hand $(pkg-config --cflags --libs tarn_rng)")
inside(by_hand /built/by_hand)
if(NOT by_cmake MATCHES "^0 0x1\\..*mean 0\\.[0-9]+$")
  message(SEND_ERROR "the program printed '${by_cmake}'")
endif()
equal("the C program" "${in_c}" "${by_cmake}")
equal("the program built by pkg-config" "${by_hand}" "${by_cmake}")

# Taken away again, nothing of them is left.
inside(ignored apt-get -q -y purge ${runtime} ${development})
execute_process(COMMAND find "${debian}/usr" -name "*tarn*" OUTPUT_VARIABLE left)
equal("left after purge" "${left}" "")
file(REMOVE_RECURSE "${debian}")
