#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Checks commands without running them: what is no command, no command of ./run, no preset, or no
# file of the tree is told, a line for each; the status is then 1.
#   check_shell.sh TREE FILE
set -uo pipefail
tree=$1 file=$2
wrong=0

tell() {
  echo "$1"
  wrong=1
}

# Programs that a page may name though this machine has them not.
elsewhere=' sudo nvcc acpp gfortran mpirun dieharder docker '

check_command() {  # WORD...
  while [[ ${1:-} == export || ${1:-} =~ ^[A-Za-z_]+= ]]; do shift; done
  [ $# -gt 0 ] || return 0
  case $1 in
    ./run)
      [ "${2:-}" = help ] || "$tree/run" help | grep -Eq "^  ${2:-none}( |$)" || tell "./run has no command '${2:-}'"
      ;;
    ./* | */*) ;;  # a path: below
    *)
      [[ $elsewhere == *" $1 "* ]] || command -v "$1" >/dev/null || tell "no command: $1"
      ;;
  esac
  local word before=
  for word; do
    if [ "$before" = --preset ]; then
      grep -q "\"name\": \"$word\"" "$tree/CMakePresets.json" || tell "no preset: $word"
    fi
    before=$word
    # A path into the tree; what a build makes is not there yet.
    word=${word#./}
    [[ $word == */* && -e $tree/${word%%/*} && $word != build/* && $word != *'$'* ]] || continue
    [ -e "$tree/$word" ] || tell "the tree has no $word"
  done
}

bash -n "$file" 2>&1 || wrong=1
# One simple command a line: joined where a line goes on, cut where a shell would, without comments,
# quotes and the text of here-documents.
# shellcheck disable=SC2016  # the dollars are those of the file
while read -r -a words; do
  [ ${#words[@]} -eq 0 ] || check_command "${words[@]}"
done < <(sed -e ':join' -e '/\\$/{N;s/\\\n/ /;b join' -e '}' "$file" |
  sed -E -e "/<<-? *'?[A-Z]+'?/,/^[A-Z]+\$/{/<</!d}" -e 's/<<.*//' -e 's/(^|[[:space:]])#.*//' \
    -e 's/\$\(/ $( ; /g' -e "s/[\"']//g" -e 's/ *(&&|\|\||[;|&]) */\n/g' | sed -E -e 's/\)$//')
exit "$wrong"
