#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Prints docs/quality.md: page.sh [RESULTS]. The text is page.txt; a line @part@ of it stands for
# what judge.awk says about the results, or layouts.awk about the layouts.
set -euo pipefail
here=$(dirname "$(readlink -f "${BASH_SOURCE[0]}")")
results=${1:-$here/results.txt}
while IFS= read -r line; do
  case $line in
    @layouts@) awk -f "$here/layouts.awk" "$here/layouts.def" ;;
    @*@)
      part=${line//@/}
      awk -v part="$part" -f "$here/bounds.awk" -f "$here/judge.awk" "$here/known.txt" "$results"
      ;;
    *) printf '%s\n' "$line" ;;
  esac
done <"$here/page.txt"
