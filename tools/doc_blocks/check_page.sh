#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Compiles and runs the code blocks of one page, as HACKING.md says ("A code block"):
#   check_page.sh PAGE FOLDER
# PAGE is relative to the tree; FOLDER is emptied. In the environment:
#   TREE, INSTALLED  the tree, and an installed copy
#   BUILD            a build of the tree: build/release of the page's folder
#   CC, CXX, FC      compilers; an empty FC leaves Fortran out
#   SANITIZE         as TARN_SANITIZE; shell and CMake blocks are then only checked
#   LAUNCHER         goes in front of compilations: ccache, or nothing
# Each failure is a line on standard error, and the status is then 1.
set -uo pipefail
export LC_ALL=C.UTF-8
page=$1 folder=$2
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
steps=$folder/steps view=$folder/view said=$folder/said
failures=0
left_out=

fail() {  # LINE TEXT
  echo "$page:$1: $2" >&2
  failures=$((failures + 1))
}

# ---- Where blocks run ---------------------------------------------------------------------------

# A view of a clone: links to what is in the tree, and a build folder of its own.
make_view() {
  mkdir -p "$view/build"
  ln -s "$BUILD" "$view/build/release"
  local entry
  for entry in "$TREE"/*; do
    [[ ${entry##*/} == build* ]] || ln -s "$entry" "$view/"
  done
}

# Runs a command in the view as a user's shell would, its output into a file.
in_view() {  # FILE COMMAND...
  local out=$1
  shift
  (cd "$view" && HOME=$view "$@") >"$out" 2>"$out.err" </dev/null
}

# ---- Programs -----------------------------------------------------------------------------------

flags_of() {  # cpp or c
  local module=tarn_rng
  [ "$1" = cpp ] || module=tarn_statistics
  PKG_CONFIG_PATH=$(dirname "$(find "$INSTALLED" -name "$module.pc")") pkg-config "--$2" "$module"
}

# What compiles a source of this tag into an object.
compiler_of() {
  local sanitize=${SANITIZE:+-fsanitize=$SANITIZE}
  case $1 in
    cpp) echo "$LAUNCHER $CXX -std=c++17 -Wall -Wextra -Wpedantic -Werror -Wno-unused $sanitize" ;;
    c) echo "$LAUNCHER $CC -std=c11 -Wall -Wextra -Wpedantic -Werror -Wno-unused $sanitize" ;;
    fortran) echo "$FC -Wall -Werror $sanitize -J$folder $TREE/statistics/fortran/tarn_rvx.f90" ;;
  esac
}

build_program() {  # TAG SOURCE PROGRAM
  local tag=$1 source=$2 program=$3 library
  library=$(dirname "$(find "$INSTALLED" -name libtarn_core.so)")
  # shellcheck disable=SC2046  # flags are words
  if [ "$tag" = fortran ]; then
    $(compiler_of "$tag") "$source" -o "$program" $(flags_of c libs) "-Wl,-rpath,$library"
  else
    $(compiler_of "$tag") -I"$here" $(flags_of "$tag" cflags) -c "$source" -o "$program.o" &&
      "$CXX" ${SANITIZE:+-fsanitize=$SANITIZE} "$program.o" -o "$program" \
        $(flags_of "$tag" libs) "-Wl,-rpath,$library"
  fi >"$program.log" 2>&1
}

run_program() {  # LINE PROGRAM OUTPUT
  in_view "$3" timeout 60 "$2" || {
    fail "$1" "the program ended with status $?:"
    tail -n 5 "$3" "$3.err" >&2
  }
}

do_program() {  # NUMBER LINE TAG HOW
  local source=$folder/$1.$3
  if [ "$3" = fortran ]; then
    source=$folder/$1.f90
    [ -n "$FC" ] || { left_out="there is no Fortran compiler"; return; }
  fi
  if ! build_program "$3" "$source" "$folder/$1.program"; then
    fail "$2" "does not compile:"
    head -n 20 "$folder/$1.program.log" >&2
  elif [ "$4" = run ]; then
    run_program "$2" "$folder/$1.program" "$said.$2"
  fi
}

# One program of all fragments; what each printed goes into a file of its own.
do_fragments() {  # LINE TAG
  local program=$folder/fragments_$2
  if ! build_program "$2" "$folder/fragments.$2" "$program"; then
    fail "$1" "the fragments do not compile:"
    head -n 20 "$program.log" >&2
    return
  fi
  run_program "$1" "$program" "$folder/fragments_said"
  awk -v said="$said" '/^== block [0-9]+$/ { file = said "." $3; printf "" > file; next }
                       { print > file }' "$folder/fragments_said"
}

# ---- Extracts, files, outputs -------------------------------------------------------------------

do_from() {  # NUMBER LINE FILE
  case $3 in
    examples/*) ;;
    *) fail "$2" "$3 is not in examples/, so no test may run it"; return ;;
  esac
  if [ ! -f "$TREE/$3" ]; then
    fail "$2" "there is no $3"
  elif ! awk -f "$here/extract.awk" "$folder/$1.from" "$TREE/$3"; then
    fail "$2" "does not stand in $3 like this"
  fi
}

do_as() {  # NUMBER LINE NAME
  case $3 in
    /* | *..*) fail "$2" "$3 leaves the page's folder"; return ;;
  esac
  local top=$view/${3%%/*}
  [ ! -L "$top" ] || rm "$top"  # the page's own takes the place of the tree's
  mkdir -p "$(dirname "$view/$3")"
  cp "$folder/$1.as" "$view/$3"
}

# The text, in which ... stands for anything, as a pattern of the shell.
pattern_of() { sed -e 's/[[:space:]]*$//' -e 's/[^[:alnum:][:space:].]/\\&/g' -e 's/\.\.\./*/g' "$1"; }

do_output() {  # NUMBER LINE OWNER
  local wanted got
  [ ! -e "$said.$3.left_out" ] || return 0
  [ -f "$said.$3" ] || { fail "$2" "the block of line $3 has not run"; return; }
  wanted=$(pattern_of "$folder/$1.text")
  got=$(sed -e 's/[[:space:]]*$//' "$said.$3")
  # shellcheck disable=SC2053  # it is a pattern
  [[ $got == $wanted ]] || fail "$2" "the block of line $3 printed instead:
$got"
}

# ---- Shell and CMake ----------------------------------------------------------------------------

do_sh() {  # NUMBER LINE HOW
  bash "$here/check_shell.sh" "$TREE" "$folder/$1.shown" >"$folder/$1.log" ||
    while IFS= read -r text; do fail "$2" "$text"; done <"$folder/$1.log"
  [ "$3" = run ] || return 0
  [ -z "$SANITIZE" ] || { : >"$said.$2.left_out"; return; }
  in_view "$said.$2" env INSTALLED="$INSTALLED" TREE="$TREE" timeout 300 \
    bash -eu "$folder/$1.sh" || {
    fail "$2" "the commands ended with status $?:"
    tail -n 15 "$said.$2" "$said.$2.err" >&2
  }
}

do_cmake() {  # NUMBER LINE HOW
  [ -z "$SANITIZE" ] || { : >"$said.$2.left_out"; return; }
  local project=$folder/cmake_$1
  mkdir -p "$project"
  {
    grep -q '^ *cmake_minimum_required' "$folder/$1.cmake" ||
      echo 'cmake_minimum_required(VERSION 3.25)'
    grep -q '^ *project(' "$folder/$1.cmake" || echo 'project(page LANGUAGES C CXX)'
    cat "$folder/$1.cmake"
  } >"$project/CMakeLists.txt"
  in_view "$said.$2" cmake -S "$project" -B "$project/build" "-DCMAKE_PREFIX_PATH=$INSTALLED" \
    "-DCMAKE_CXX_COMPILER=$CXX" "-DCMAKE_C_COMPILER=$CC" "-DTREE=$TREE" || {
    fail "$2" "CMake does not configure it:"
    tail -n 15 "$said.$2.err" >&2
    return
  }
  [ "$3" = run ] || return 0
  in_view "$said.$2" timeout 300 cmake --build "$project/build" || {
    fail "$2" "does not build:"
    tail -n 15 "$said.$2" >&2
  }
}

rm -rf "$folder"
mkdir -p "$folder"
folder=$(cd "$folder" && pwd)
steps=$folder/steps view=$folder/view said=$folder/said
awk -v page="$page" -v out="$folder" -f "$here/split.awk" "$TREE/$page" || failures=1
[ -s "$steps" ] || { [ "$failures" -eq 0 ]; exit; }
make_view
while read -r what number line how more; do
  [ "$what" != as ] || do_as "$number" "$line" "$how"
done <"$steps"
while read -r what number line how more; do
  case $what in
    program) do_program "$number" "$line" "$how" "$more" ;;
    fragments) do_fragments "$line" "$how" ;;
    from | output | sh | cmake) "do_$what" "$number" "$line" "$how" ;;
  esac
done <"$steps"
[ "$failures" -eq 0 ] || exit 1
echo "$(grep -c . "$steps") steps"
[ -z "$left_out" ] || echo "skipped: $left_out"
