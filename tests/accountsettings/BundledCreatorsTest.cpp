#include <gtest/gtest.h>

#include <map>

#include "tests/accountsettings/TestRecords.h"

// The account-creation map that the bundle carries.

namespace accounts {
namespace {

/// The entries of a type of the given kind; an entry without kind or description fails the test.
std::vector<PropertyDictionary> descriptions(const PropertyValue& entries, std::string_view kind) {
  std::vector<PropertyDictionary> found;
  for (const PropertyValue& entry : *entries.asArray()) {
    const std::optional<Text> entryKind = entry.asDictionary()->textForKey("Type");
    const auto description = entry.asDictionary()->dictionaryForKey("Description");
    EXPECT_TRUE(entryKind && description) << described(entry);
    if (entryKind == kind && description) {
      found.push_back(*description);
    }
  }
  return found;
}

class BundledCreators : public testing::Test {
 protected:
  FakeProcess device;
  PropertyDictionary creators = device.bundleResources.readPropertyList("AccountCreators").value();
};

TEST_F(BundledCreators, EveryConfiguredTypeHasAnEntryAndNoOtherHas) {
  const PropertyDictionary types =
      device.bundleResources.readPropertyList("AccountTypesProperties").value();
  for (const auto& [type, properties] : types) {
    EXPECT_TRUE(creators.contains(type)) << type.view();
  }
  EXPECT_EQ(creators.size(), types.size());
}

TEST_F(BundledCreators, EveryTypeHasOneFullAccountAndAtMostOneSyncAccount) {
  for (const auto& [type, entries] : creators) {
    EXPECT_EQ(descriptions(entries, "FullAccount").size(), 1U) << type.view();
    EXPECT_LE(descriptions(entries, "SyncAccount").size(), 1U) << type.view();
  }
}

TEST_F(BundledCreators, EveryDescriptionNamesAClassAndAFrameworkBelowTheSystemRoot) {
  for (const auto& [type, entries] : creators) {
    std::size_t known = 0;
    for (const std::string_view kind : {"FullAccount", "SyncAccount", "NotifierAccount"}) {
      for (const PropertyDictionary& description : descriptions(entries, kind)) {
        ++known;
        EXPECT_FALSE(description.textForKey("Class").value_or("").empty()) << type.view();
        EXPECT_TRUE(description.textForKey("Framework").value_or("").view().starts_with("System/"))
            << type.view();
      }
    }
    EXPECT_EQ(known, entries.asArray()->size()) << "entries of an unknown kind: " << type.view();
  }
}

TEST_F(BundledCreators, AClassIsAlwaysInTheSameFramework) {
  std::map<std::string, std::string> frameworks;
  for (const auto& [type, entries] : creators) {
    for (const std::string_view kind : {"FullAccount", "SyncAccount", "NotifierAccount"}) {
      for (const PropertyDictionary& description : descriptions(entries, kind)) {
        const std::string framework = description.textForKey("Framework")->string();
        const auto [known, isNew] =
            frameworks.emplace(description.textForKey("Class")->string(), framework);
        EXPECT_EQ(known->second, framework) << known->first;
      }
    }
  }
}

TEST_F(BundledCreators, EachSupportedDataclassOfATypeHasOneNotifier) {
  for (const auto& [type, entries] : creators) {
    PropertyArray notified;
    for (const PropertyDictionary& description : descriptions(entries, "NotifierAccount")) {
      const PropertyArray dataclasses =
          description.arrayForKey(kAccountSupportedDataclasses).value();
      for (const PropertyValue& dataclass : dataclasses) {
        notified.append(dataclass);
      }
    }
    const auto supported = BasicAccount::supportedDataclassesForAccountType(type);
    EXPECT_EQ(BasicAccount::_orderedDataclasses(notified), supported) << type.view();
    EXPECT_EQ(notified.size(), supported->size()) << type.view();
  }
}

TEST_F(BundledCreators, TheAccountOfTheDeviceIsItsOwnFullAccountAndHasNothingToRefresh) {
  const PropertyValue& entries = *creators.find(kOnMyDeviceAccountType);
  EXPECT_EQ(descriptions(entries, "FullAccount").at(0).textForKey("Class"), "DeviceLocalAccount");
  EXPECT_TRUE(descriptions(entries, "SyncAccount").empty());
}

}  // namespace
}  // namespace accounts
