#include <cstdlib>
#include <stdexcept>
#include <string_view>

#include "platform/AccountFramework.h"

// A framework that throws when it is told to, by THROWS_WHILE, and a notifier that does.
namespace {

void throwIfItIs(std::string_view when) {
  const char* const wanted = std::getenv("THROWS_WHILE");
  if (wanted != nullptr && wanted == when) {
    throw std::runtime_error("no\nservice");
  }
  if (wanted != nullptr && std::string_view(wanted) == "without words") {
    throw 7;
  }
}

}  // namespace

void RegisterClasses(accounts::ClassRegistry& registry) {
  throwIfItIs("registering");
  accounts::AccountClass notifier;
  notifier.noteAccountChanges = [](const accounts::PropertyArray&) { throwIfItIs("notified"); };
  notifier.accountWillChange_forDataclass = [](std::string_view, std::string_view) {
    throwIfItIs("announced");
  };
  registry.registerClass("MailAccountNotifier", std::move(notifier));
}
