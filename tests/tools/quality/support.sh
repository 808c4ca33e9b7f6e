# SPDX-License-Identifier: Apache-2.0
# For the scripts of this folder, which are called with the folder of the driver and that of the
# programs: a scratch folder, and expectations that count.
set -uo pipefail
driver=$1
programs=$2
here=$(dirname "$(readlink -f "$0")")
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
wrong=0
held=0

# expect WHAT SEEN WANTED
expect() {
  if [ "$2" = "$3" ]; then
    held=$((held + 1))
  else
    wrong=$((wrong + 1))
    printf '%s:\n%s\ninstead of:\n%s\n' "$1" "$2" "$3"
  fi
}

# expect_part WHAT SEEN PART
expect_part() {
  case $2 in
    *"$3"*) held=$((held + 1)) ;;
    *)
      wrong=$((wrong + 1))
      printf '%s:\n%s\nwithout:\n%s\n' "$1" "$2" "$3"
      ;;
  esac
}

# finish COUNT: all expectations were met, and there were so many.
finish() {
  [ $wrong -eq 0 ] && [ $held -eq "$1" ] && return
  echo "$wrong expectations were not met, $held of $1 were"
  exit 1
}
