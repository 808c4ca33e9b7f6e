/* SPDX-License-Identifier: Apache-2.0 */
/* An audit library (rtld-audit): the dynamic loader asks it where to look for each object, and
 * finds none of the native drivers' loaders, as on a machine that has none of them. */
#define _GNU_SOURCE
#include <link.h>
#include <stddef.h>
#include <string.h>

#define VISIBLE __attribute__((visibility("default")))

VISIBLE unsigned int la_version(unsigned int version);
VISIBLE char* la_objsearch(const char* name, uintptr_t* cookie, unsigned int flag);

static const char* const hidden[] = {"libOpenCL.so", "libze_loader.so", "libomptarget.so"};

unsigned int la_version(unsigned int version) {
  return version;
}

char* la_objsearch(const char* name, uintptr_t* cookie, unsigned int flag) {
  (void)cookie;
  (void)flag;
  const char* const slash = strrchr(name, '/');
  const char* const file = slash == NULL ? name : slash + 1;
  for (size_t i = 0; i < sizeof hidden / sizeof *hidden; ++i) {
    if (strncmp(file, hidden[i], strlen(hidden[i])) == 0) {
      return NULL;
    }
  }
  return (char*)name;
}
