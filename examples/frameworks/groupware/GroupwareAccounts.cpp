#include "../ExampleAccounts.h"

// The framework of calendars, contacts and bookmarks. Its notifier answers the required operation
// alone.
void RegisterClasses(accounts::ClassRegistry& registry) {
  using namespace accounts::examples;
  for (const char* name :
       {"ExchangeFullAccount", "CalDAVFullAccount", "CardDAVFullAccount", "BookmarkDAVFullAccount",
        "SubscribedCalendarFullAccount", "LDAPFullAccount"}) {
    registerFullAccountClass(registry, name);
  }
  for (const char* name :
       {"ExchangeSyncAccount", "CalDAVSyncAccount", "CardDAVSyncAccount", "BookmarkDAVSyncAccount",
        "SubscribedCalendarSyncAccount", "WebMailSyncAccount"}) {
    registerSyncAccountClass(registry, name);
  }
  const std::string name = "GroupwareAccountNotifier";
  registry.registerClass(name, notifierClass(name));
}
