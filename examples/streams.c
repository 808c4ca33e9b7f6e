/* SPDX-License-Identifier: Apache-2.0
 * Streams in C, without any SYCL: independent workers in three ways, a saved stream that goes on,
 * and a quasi-random estimate of pi.
 *
 * Build: cc streams.c $(pkg-config --cflags --libs tarn_statistics) -o streams
 */
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <tarn_rvx.h>

enum { workers = 4, words_per_worker = 5 };

/* Every function returns a status; a bad argument is also told on standard error. */
static void check(int status, const char* what) {
  if (status != RVX_STATUS_OK) {
    fprintf(stderr, "%s: status %d\n", what, status);
    exit(1);
  }
}

static void print_words(const char* label, int worker, rvx_stream stream) {
  uint32_t words[words_per_worker];
  check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, words_per_worker, words), "words");
  printf("  %s %d:", label, worker);
  for (int i = 0; i < words_per_worker; ++i)
    printf(" %08X", (unsigned)words[i]);
  printf("\n");
}

/* One sequence in blocks: worker w starts w * 10^12 words further on. */
static void blocks(void) {
  printf("Blocks of one sequence (skip-ahead, philox4x32x10)\n");
  for (int w = 0; w < workers; ++w) {
    rvx_stream stream = NULL;
    check(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 2026), "new stream");
    check(rvxSkipAheadStream(stream, w * INT64_C(1000000000000)), "skip");
    print_words("worker", w, stream);
    check(rvxDeleteStream(&stream), "delete");
  }
}

/* One sequence dealt out like cards: worker w receives words w, w + workers, ... */
static void cards(void) {
  printf("One sequence dealt out (leapfrog, mcg31m1)\n");
  for (int w = 0; w < workers; ++w) {
    rvx_stream stream = NULL;
    check(rvxNewStream(&stream, RVX_BRNG_MCG31, 2026), "new stream");
    check(rvxLeapfrogStream(stream, w, workers), "leapfrog");
    print_words("worker", w, stream);
    check(rvxDeleteStream(&stream), "delete");
  }
}

/* A generator of its own for each worker: members of a family. */
static void family(void) {
  printf("A family of generators (mt2203)\n");
  for (int w = 0; w < workers; ++w) {
    rvx_stream stream = NULL;
    check(rvxNewStream(&stream, RVX_BRNG_MT2203 + w, 2026), "new stream");
    print_words("member", w, stream);
    check(rvxDeleteStream(&stream), "delete");
  }
}

/* A stream that was saved goes on where it stood. */
static void saved(void) {
  rvx_stream stream = NULL, loaded = NULL;
  uint32_t skipped[1000];
  uint8_t* image;
  printf("Saved and loaded (mt19937)\n");
  check(rvxNewStream(&stream, RVX_BRNG_MT19937, 5489), "new stream");
  check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, 1000, skipped), "words");
  image = malloc((size_t)rvxGetStreamSize(stream));
  if (image == NULL)
    exit(1);
  check(rvxSaveStreamM(stream, image), "save");
  check(rvxLoadStreamM(&loaded, image), "load");
  print_words("saved ", 0, stream);
  print_words("loaded", 0, loaded);
  free(image);
  check(rvxDeleteStream(&stream), "delete");
  check(rvxDeleteStream(&loaded), "delete");
}

/* Points of the unit square by sobol: the share that lies in the quarter of a circle. */
static void pi(void) {
  enum { points = 1 << 16 };
  static uint32_t words[2 * points];
  rvx_stream stream = NULL;
  long inside = 0;
  check(rvxNewStream(&stream, RVX_BRNG_SOBOL, 2), "new stream");
  check(rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, 2 * points, words), "words");
  for (int i = 0; i < points; ++i) {
    const double x = words[2 * i] / 4294967296.0, y = words[2 * i + 1] / 4294967296.0;
    inside += x * x + y * y < 1;
  }
  printf("pi by %d points of sobol: %.5f\n", points, 4.0 * (double)inside / points);
  check(rvxDeleteStream(&stream), "delete");
}

int main(void) {
  blocks();
  cards();
  family();
  saved();
  pi();
  return 0;
}
