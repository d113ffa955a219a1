#include "../ExampleAccounts.h"

// The smallest framework: one class of each kind, for the cloud accounts. The device-local
// account's class is the system's own; this framework is only where the account-creation map says
// that it lives.
void RegisterClasses(accounts::ClassRegistry& registry) {
  using namespace accounts;
  using namespace accounts::examples;

  // A full-account class of the second kind: it makes the account from the record.
  AccountClass fullAccount;
  fullAccount.accountWithBasicAccount = [](const AccountRecordReference& record) {
    return std::make_shared<ExampleFullAccount>(record->properties());
  };
  registry.registerClass("CloudFullAccount", std::move(fullAccount));

  registerSyncAccountClass(registry, "CloudSyncAccount");
  registry.registerClass("CloudAccountNotifier", notifierClass("CloudAccountNotifier"));
}
