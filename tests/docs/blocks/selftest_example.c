// SPDX-License-Identifier: Apache-2.0
// The file that the pages of the self-test quote.
#include <stdio.h>

int main(void) {
  const int answer = 6 * 7;
  printf("%d\n", answer);
  return 0;
}
