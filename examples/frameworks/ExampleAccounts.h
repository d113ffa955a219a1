#pragma once

#include <cstdio>
#include <memory>
#include <string>
#include <utility>

#include "platform/AccountFramework.h"
#include "propertylist/value/Description.h"

// What the example frameworks share. A real framework has its protocols in the place of these
// classes.
namespace accounts::examples {

/// A full account that speaks to no server: it keeps what it was made from.
class ExampleFullAccount : public FullAccount {
 public:
  explicit ExampleFullAccount(PropertyDictionary properties) : properties_(std::move(properties)) {}

  void setParentAccount(AccountRecordReference parent) override { parent_ = std::move(parent); }
  [[nodiscard]] const PropertyDictionary& properties() const { return properties_; }

 private:
  PropertyDictionary properties_;
  AccountRecordReference parent_;
};

/// A sync account that refreshes nothing: each refresh gives back a sentence that says what was
/// asked.
class ExampleSyncAccount : public SyncAccount {
 public:
  explicit ExampleSyncAccount(const AccountRecordReference& record) : record_(record) {}

  std::optional<PropertyValue> refreshContainerWithIdentifier_forDataclass_isUserRequested(
      std::string_view identifier, std::string_view dataclass, bool isUserRequested) override {
    return sentence("container " + std::string(identifier), dataclass, isUserRequested);
  }
  std::optional<PropertyValue> refreshContainerListForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) override {
    return sentence("container list", dataclass, isUserRequested);
  }
  std::optional<PropertyValue> refreshContainersForDataclass_isUserRequested(
      std::string_view dataclass, bool isUserRequested) override {
    return sentence("containers", dataclass, isUserRequested);
  }

 private:
  [[nodiscard]] PropertyValue sentence(std::string_view what, std::string_view dataclass,
                                       bool isUserRequested) const {
    const AccountRecordReference record = record_.lock();
    std::string text = (record ? record->identifier() : std::nullopt).value_or(Text()).string();
    text.append(": ").append(what).append(" of ").append(dataclass);
    text.append(isUserRequested ? ", asked for by the user" : ", asked for by the system");
    return PropertyValue(text);
  }

  // Weak, because the record owns this object.
  std::weak_ptr<AccountRecord> record_;
};

/// A full-account class that instantiates itself for every account type.
inline void registerFullAccountClass(ClassRegistry& registry, const std::string& name) {
  AccountClass fullAccount;
  fullAccount.classForAccountType = [&registry, name](std::string_view) {
    return registry.classNamed(name);
  };
  fullAccount.initWithProperties = [](const PropertyDictionary& properties) {
    return std::make_shared<ExampleFullAccount>(properties);
  };
  registry.registerClass(name, std::move(fullAccount));
}

inline void registerSyncAccountClass(ClassRegistry& registry, const std::string& name) {
  AccountClass syncAccount;
  syncAccount.accountToRefreshForBasicAccount = [](const AccountRecordReference& record) {
    return std::make_shared<ExampleSyncAccount>(record);
  };
  registry.registerClass(name, std::move(syncAccount));
}

/// Prints one line about an event that a notifier was told of.
inline void printEvent(std::string_view notifier, std::string_view event,
                       const PropertyValue& details) {
  std::string line(notifier);
  line.append(" ").append(event).append(" ");
  appendDescription(line, details);
  std::puts(line.c_str());
  std::fflush(stdout);
}

/// A notifier class with the required operation alone.
inline AccountClass notifierClass(const std::string& name) {
  AccountClass notifier;
  notifier.noteAccountChanges = [name](const PropertyArray& changes) {
    printEvent(name, "noteAccountChanges:", changes);
  };
  return notifier;
}

}  // namespace accounts::examples
