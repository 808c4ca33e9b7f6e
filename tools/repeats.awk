# SPDX-License-Identifier: Apache-2.0
# Counts places that repeat: runs of six or more equal lines that stand in two places. White space
# is folded; blank lines, comments, includes and lone punctuation do not count as lines.

FNR == 1 { recent = 0 }
{
  line = $0
  gsub(/[[:space:]]+/, " ", line)
  sub(/^ /, "", line)
  if (line == "" || line ~ /^(\/\/|\/\*|\*|#)/ || line !~ /[[:alnum:]]/) next
  ++recent
  window[recent % 6] = line
  if (recent < 6) next
  text = ""
  for (i = recent - 5; i <= recent; ++i) text = text "\n" window[i % 6]
  # A run of seven equal lines makes two windows; only the first of touching ones is counted.
  if (text in seen) {
    if (last_file != FILENAME || last != recent - 1) ++places
    last_file = FILENAME
    last = recent
  } else {
    seen[text] = 1
  }
}
END { print places + 0 }
