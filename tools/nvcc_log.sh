#!/bin/sh
# SPDX-License-Identifier: Apache-2.0
# A launcher for nvcc: nvcc_log.sh FOLDER COMMAND... runs the command and keeps what ptxas says of
# each kernel (options -Xptxas -v) in FOLDER/<source>.log, away from the warnings, which go on to
# the caller. The status is the command's; a command that fails leaves no log.
set -u
folder=$1
shift

unit=
source_next=
for argument; do
  if [ -n "$source_next" ]; then
    unit=$(basename "$argument")
    unit=${unit%.*}
  fi
  source_next=
  [ "$argument" = -c ] && source_next=yes
done
# nothing is compiled: it links, or tells its version
[ -n "$unit" ] || exec "$@"

mkdir -p "$folder"
log=$folder/$unit.log
said=$log.said
"$@" 2> "$said"
status=$?
# the line of stack and spills carries no name of its program
ptxas='^ptxas info|^ *[0-9]+ bytes stack frame'
if [ "$status" -eq 0 ]; then
  grep -E "$ptxas" "$said" > "$log"
else
  rm -f "$log"
fi
grep -Ev "$ptxas" "$said" >&2
rm -f "$said"
exit "$status"
