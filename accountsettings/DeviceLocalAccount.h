#pragma once

#include "accountsettings/BasicAccount.h"

namespace accounts {

/// The built-in account for data that is kept on the device itself or that comes over a cable from
/// a computer.
class DeviceLocalAccount : public BasicAccount, public FullAccount {
 public:
  /// Makes the class known by its name, as the full-account class of its own type.
  static void registerClass(ClassRegistry& registry);
  /// A new record with the properties of another one; null when they are not accepted.
  static std::shared_ptr<DeviceLocalAccount> accountWithBasicAccount(const AccountRecord& record);

  /// As BasicAccount's operations of these names, giving a DeviceLocalAccount.
  static std::shared_ptr<DeviceLocalAccount> initWithProperties(
      const PropertyDictionary& properties);
  static std::shared_ptr<DeviceLocalAccount> accountWithProperties(
      const PropertyDictionary& properties);

  using BasicAccount::setParentAccount;
  /// As a full account: takes the parent if it is a record of the store.
  void setParentAccount(AccountRecordReference parent) override;

  /// Always "DeviceLocalAccount", whatever the dictionary holds.
  [[nodiscard]] std::optional<Text> identifier() const override;
  [[nodiscard]] std::optional<Text> syncStoreIdentifier() const override;
  /// Always the class's typeString(), whatever the dictionary holds.
  [[nodiscard]] std::optional<Text> displayName() const override;

  /// The account dictionary that a device-local account is made from.
  static PropertyDictionary basicAccountProperties();
  static std::string_view _identifier();
  /// The localised name of the account on this kind of device.
  static std::string typeString();

  /// What the data of a dataclass is synced with over a cable: "Veskar", "Windows", "Handra" for
  /// not at all (also when the pairing service gives no answer), or whatever else the service
  /// answers.
  static std::string tetheredSourceForDataClass(std::string_view dataclass);
  /// Whether that source is a computer.
  static bool isTetheredSyncingDataclass(std::string_view dataclass);
  /// The localised name of that source. The flag tells whether it begins a sentence.
  static std::string localizedSyncSourceStringForDataClass_forBeginningOfSentence(
      std::string_view dataclass, bool beginningOfSentence);
  /// The localised words by which a sentence refers to that source.
  static std::string localizedReferenceToSyncSourceStringForDataClass(std::string_view dataclass);

 private:
  DeviceLocalAccount() = default;
};

}  // namespace accounts
