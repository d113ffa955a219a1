#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>

// What every run of the host pays before the migration does anything: it is linked with all that
// the host is linked with, opens the plug-in named by its only argument as the host does, binding
// all of its symbols, finds the entry point, and ends without calling it.

int main(int argumentCount, char** arguments) {
  if (argumentCount != 2) {
    std::fputs("Usage: empty-process PLUGIN\n", stderr);
    return EXIT_FAILURE;
  }
  void* const library = dlopen(arguments[1], RTLD_NOW | RTLD_LOCAL);
  if (library == nullptr || dlsym(library, "CreateMigrationPlugin") == nullptr) {
    std::fprintf(stderr, "empty-process: %s\n", dlerror());
    return EXIT_FAILURE;
  }
  return EXIT_SUCCESS;
}
