#include <cstdio>
#include <cstdlib>

#include "platform/AccountFramework.h"

// A framework with everything in it that its author is warned of, and one more symbol than it
// should have. It writes, and can end the process.
extern "C" [[gnu::visibility("default")]] int anotherSymbol() {
  return 1;
}

void RegisterClasses(accounts::ClassRegistry& registry) {
  std::puts("on standard output");
  if (std::getenv("ENDS_THE_PROCESS") != nullptr) {
    std::abort();
  }
  accounts::AccountClass notifier;
  notifier.noteAccountChanges = [](const accounts::PropertyArray&) {};
  registry.registerClass("Notifier", notifier);
  registry.registerClass("Notifier", notifier);
  registry.registerClass("Idle", {});
}
