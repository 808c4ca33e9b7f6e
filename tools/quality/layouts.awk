# SPDX-License-Identifier: Apache-2.0
# The rows of layouts.def as a table of the page.
BEGIN {
  FS = "[(,) ]+"
  print "| Engine | Layout | Words between streams | Run |"
  print "|---|---|---|---|"
}
/^TARN_LAYOUT\(/ {
  distance = $4 != "0" ? $4 " * 2^64" : $5 != "0" ? $5 : ""
  run = $6 == "same" ? "equal to `single`" : $6 == "both" ? "short, full" : $6
  print "| `" $2 "` | `" $3 "` | " (distance == "" ? "" : distance " ") "| " run " |"
}
