#include <array>
#include <vector>

#include "accountsettings/BasicAccount.h"
#include "accountsettings/DataclassOrder.h"
#include "accountsettings/Process.h"

namespace accounts {

namespace {

struct Restriction {
  RestrictedFeature feature;
  std::vector<std::string_view> hiddenDataclasses;
};

/// What each feature hides when profiles do not allow it, in the order in which they are asked.
const std::array<Restriction, 5>& restrictions() {
  static const std::array<Restriction, 5> table = {{
      {RestrictedFeature::CloudDocumentSync,
       {kAccountDataclassUbiquity, kAccountDataclassKeyValue}},
      {RestrictedFeature::PhotoStream, {kAccountDataclassMediaStream}},
      {RestrictedFeature::SharedPhotoStreams, {kAccountDataclassSharedStreams}},
      {RestrictedFeature::CloudBackup, {kAccountDataclassBackup}},
      {RestrictedFeature::CardsAndPassesWhileLocked, {kAccountDataclassShoebox}},
  }};
  return table;
}

/// What each account type supports, in canonical order. Asked for several times for each account.
PropertyDictionary orderedSupportedDataclasses() {
  std::vector<KeyedValue> byType;
  for (const Text& type : BasicAccount::knownAccountTypes()) {
    byType.push_back({type, BasicAccount::_orderedDataclasses(
                                BasicAccount::supportedDataclassesForAccountType(type))});
  }
  return PropertyDictionary(std::move(byType));
}

}  // namespace

PropertyArray BasicAccount::supportedDataclasses() const {
  const PropertyDictionary& byType =
      Process::current().orderedSupportedDataclasses.get(orderedSupportedDataclasses);
  const std::optional<Text> ownType = type();
  return ownType ? byType.arrayForKey(*ownType).value_or(PropertyArray()) : PropertyArray();
}

PropertyArray BasicAccount::provisionedDataclasses() const {
  const PropertyArray supported = supportedDataclasses();
  const PropertyArray provisioned =
      arrayPropertyForKey(kAccountProvisionedDataclasses).value_or(supported);
  return dataclassesWithout(dataclassesInBoth(supported, provisioned),
                            _profileRestrictedDataclasses());
}

std::optional<PropertyArray> BasicAccount::enabledDataclasses() const {
  if (_parentAccount) {
    const std::optional<PropertyArray> ofParent = _parentAccount->enabledDataclasses();
    // Kept on purpose: the child's own list is not looked at, not even to narrow the parent's.
    if (ofParent && !ofParent->empty()) {
      return ofParent;
    }
  }
  const std::optional<PropertyArray> enabled = arrayPropertyForKey(kAccountEnabledDataclasses);
  if (!enabled) {
    return std::nullopt;
  }
  return dataclassesInBoth(provisionedDataclasses(), *enabled);
}

bool BasicAccount::isEnabledForDataclass(std::string_view dataclass) const {
  // Without a parent they are among the stored ones, which are read more quickly than narrowed.
  if (!_parentAccount) {
    const PropertyValue* stored = valueForKey(kAccountEnabledDataclasses);
    if (stored == nullptr || stored->asArray() == nullptr ||
        !stored->asArray()->containsText(dataclass)) {
      return false;
    }
  }
  const std::optional<PropertyArray> enabled = enabledDataclasses();
  return enabled && enabled->containsText(dataclass);
}

void BasicAccount::setEnabled_forDataclass(bool enabled, std::string_view dataclass) {
  if (supportedDataclasses().containsText(dataclass)) {
    _forcedSetEnabled_forDataclass(enabled, dataclass);
  }
}

void BasicAccount::setEnabledForDataclasses(const PropertyArray& dataclasses) {
  removeAccountPropertyForKey(kAccountEnabledDataclasses);
  for (const PropertyValue& dataclass : dataclasses) {
    if (const Text* text = dataclass.asText()) {
      setEnabled_forDataclass(/*enabled=*/true, *text);
    }
  }
}

void BasicAccount::_forcedSetEnabled_forDataclass(bool enabled, std::string_view dataclass) {
  const PropertyArray stored =
      _properties.arrayForKey(kAccountEnabledDataclasses).value_or(PropertyArray());
  setAccountProperty_forKey(
      dataclassSetWith(stored, dataclass, enabled ? DataclassSwitch::On : DataclassSwitch::Off),
      kAccountEnabledDataclasses);
}

PropertyArray BasicAccount::_orderedDataclasses(const std::optional<PropertyArray>& dataclasses) {
  return orderedDataclasses(dataclasses.value_or(PropertyArray()), allSupportedDataclasses());
}

PropertyArray BasicAccount::_profileRestrictedDataclasses() {
  ProfileRestrictions& profileRestrictions = Process::current().platform.profileRestrictions;
  PropertyArray hidden;
  for (const Restriction& restriction : restrictions()) {
    if (profileRestrictions.answerForFeature(restriction.feature) ==
        RestrictionAnswer::ExplicitlyNotAllowed) {
      for (const std::string_view dataclass : restriction.hiddenDataclasses) {
        hidden.append(dataclass);
      }
    }
  }
  return hidden;
}

}  // namespace accounts
