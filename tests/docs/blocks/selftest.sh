#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Sees that the check of pages passes a good page, and tells each thing that is wrong with bad ones:
#   selftest.sh CHECK_PAGE FOLDER      (the environment is that of check_page.sh)
set -uo pipefail
checker=$1 folder=$2
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
real=$TREE
export TREE=$folder/tree
rm -rf "$folder"
mkdir -p "$TREE/examples"
ln -s "$real/run" "$real/CMakePresets.json" "$real/statistics" "$TREE/"
cp "$here/selftest_example.c" "$TREE/examples/example.c"
wrong=0

# page FILE STATUS: checks it, into $said.
page() {
  cp "$here/$1" "$TREE/page.md"
  said=$(bash "$checker" page.md "$folder/page" 2>&1)
  local status=$?
  [ $status -eq "$2" ] || {
    echo "$1: status $status, said: $said" >&2
    wrong=1
  }
}

# A page with all kinds of blocks, each of them right.
page selftest_good.txt 0
# Every block but the last of each kind is run: what they wrote is there.
for proof in first_program fragment shell cmake; do
  [ -e "$folder/page/view/$proof.proof" ] || [ -n "$SANITIZE" ] || {
    echo "selftest_good.txt: $proof has not run: $said" >&2
    wrong=1
  }
done

# Pages of which each wrong line is told: the line that begins with "wanted:" above a fault is in
# what the check says, with the number of the line in which the fault's fence stands.
for bad in selftest_bad_fences.txt selftest_bad_c.txt selftest_bad_cpp.txt selftest_bad_shell.txt; do
  page "$bad" 1
  expected=0 missed=0
  while IFS=: read -r at _ text; do
    text=${text# }
    [[ $text != *' (builds)' || -z $SANITIZE ]] || continue  # sanitized builds run no commands
    text=${text% (builds)}
    expected=$((expected + 1))
    grep -qF -- "$text" <<<"$said" || {
      echo "$bad:$at: not told: $text" >&2
      wrong=1 missed=1
    }
  done < <(grep -n '^wanted:' "$TREE/page.md")
  [ $missed -eq 0 ] || echo "said: $said" >&2
  [ $expected -gt 0 ] || wrong=1
done
exit $wrong
