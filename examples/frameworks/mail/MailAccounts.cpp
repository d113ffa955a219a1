#include "../ExampleAccounts.h"

// The framework of the mail account types. Its notifier answers the optional operations too.
void RegisterClasses(accounts::ClassRegistry& registry) {
  using namespace accounts::examples;
  for (const char* name : {"MailFullAccount", "IMAPNotesFullAccount", "DeliveryFullAccount"}) {
    registerFullAccountClass(registry, name);
  }
  for (const char* name : {"MailSyncAccount", "IMAPNotesSyncAccount"}) {
    registerSyncAccountClass(registry, name);
  }
  const std::string name = "MailAccountNotifier";
  accounts::AccountClass notifier = notifierClass(name);
  notifier.accountWillChange_forDataclass = [name](std::string_view identifier,
                                                   std::string_view dataclass) {
    printEvent(name,
               "accountWillChange:forDataclass:", accounts::PropertyArray{identifier, dataclass});
  };
  notifier.accountDidChange_forDataclass = [name](std::string_view identifier,
                                                  std::string_view dataclass) {
    printEvent(name,
               "accountDidChange:forDataclass:", accounts::PropertyArray{identifier, dataclass});
  };
  registry.registerClass(name, std::move(notifier));
}
