# SPDX-License-Identifier: Apache-2.0
# Ends with 0 if the lines of the first file stand one behind the other in the second; blank lines
# and indentation do not count.   awk -f extract.awk <extract> <file>
{
  gsub(/^[ \t]+|[ \t]+$/, "")
  if ($0 == "") next
}
FNR == NR { wanted[n++] = $0; next }
{ lines[m++] = $0 }
END {
  for (i = 0; n > 0 && i + n <= m; i++) {
    for (k = 0; k < n && lines[i + k] == wanted[k]; k++) {}
    if (k == n) exit 0
  }
  exit 1
}
