// Preloaded into melt by the bridge's tests: every "running" set to 1 (the avformat consumer's
// own, once it has made its thread) is held up for a moment, as a busy machine can hold up the
// thread that starts the consumer.
#define _GNU_SOURCE
#include <dlfcn.h>
#include <string.h>
#include <unistd.h>

typedef int (*SetInt)(void* properties, const char* name, int value);

int mlt_properties_set_int(void* properties, const char* name, int value) {
  static SetInt set;
  if (!set) *(void**)&set = dlsym(RTLD_NEXT, "mlt_properties_set_int");
  // Far longer than the consumer's thread takes to open its output and look at "running".
  if (value == 1 && name && strcmp(name, "running") == 0) usleep(300 * 1000);
  return set(properties, name, value);
}
