/* SPDX-License-Identifier: Apache-2.0
   An OpenCL loader from before version 2.0, as far as a program gets that looks for its functions
   by name: it has those of platforms, and ends the program that calls one. */
#include <stdlib.h>

#define SHOWN __attribute__((visibility("default")))

SHOWN int clGetPlatformIDs(unsigned entries, void** platforms, unsigned* count);
int clGetPlatformIDs(unsigned entries, void** platforms, unsigned* count) {
  (void)entries;
  (void)platforms;
  (void)count;
  abort();
}

SHOWN int clGetPlatformInfo(void* platform, unsigned query, size_t size, void* value,
                            size_t* size_ret);
int clGetPlatformInfo(void* platform, unsigned query, size_t size, void* value, size_t* size_ret) {
  (void)platform;
  (void)query;
  (void)size;
  (void)value;
  (void)size_ret;
  abort();
}
