// Thousands of devices on which nothing is lost, and the same with damage: the ledger has no false
// word about the ones, and names exactly what was lost of the others.

#include <algorithm>
#include <cstdlib>
#include <set>

#include "propertylist/value/Description.h"
#include "tests/fakes/Sanitizers.h"
#include "tests/ledger/OrdinaryDevice.h"

namespace accounts {
namespace {

unsigned deviceCount() {
  const char* const asked = std::getenv("GENERATED_LEDGERS");
  return asked != nullptr  ? static_cast<unsigned>(std::strtoul(asked, nullptr, 10))
         : kWithSanitizers ? 250
                           : 5000;
}
const unsigned kDevices = deviceCount();

std::string describe(const DeviceFiles& files) {
  const auto text = [](const std::optional<PropertyDictionary>& file) {
    return file ? accounts::describe(PropertyValue(*file)) : std::string("none");
  };
  return "settings " + text(files.settings) + "\nmail " + text(files.mail) + "\nexchange " +
         text(files.exchange);
}

TEST(GeneratedLedgers, OfOrdinaryDevicesNothingIsSaidToBeLost) {
  std::size_t accounts = 0;
  for (unsigned seed = 1; seed <= kDevices && !HasFailure(); ++seed) {
    const DeviceFiles files = OrdinaryDevice(seed).make();
    const MigratedInMemory migrated(files);
    EXPECT_THAT(migrated.losses(), testing::IsEmpty()) << "seed " << seed << "\n"
                                                       << describe(files);
    accounts += migrated.ledger().entries.size();
  }
  std::cout << accounts << " accounts of " << kDevices << " devices\n";
}

/// Ways to damage a top-level account of a settings file so that it is lost, and nothing else.
using Damage = PropertyValue (*)(const PropertyDictionary& account);
const std::array<Damage, 6> kDamages = {
    [](const PropertyDictionary&) -> PropertyValue { return "no dictionary"; },
    [](const PropertyDictionary& each) -> PropertyValue {
      return AccountDictionary(each).with(kAccountType, "No");
    },
    [](const PropertyDictionary& each) -> PropertyValue {
      return AccountDictionary(each).without(kAccountType);
    },
    [](const PropertyDictionary& each) -> PropertyValue {
      return AccountDictionary(each).with(kAccountType, 5);
    },
    [](const PropertyDictionary& each) -> PropertyValue {
      return AccountDictionary(each).without(kAccountClass);
    },
    [](const PropertyDictionary& each) -> PropertyValue {
      return AccountDictionary(each).with(kAccountClass, "");
    },
};

/// A device with damage, and the accounts that are lost by it.
struct DamagedDevice {
  DeviceFiles files;
  std::set<std::string> lost;
};

void addChildren(std::set<std::string>& lost, const PropertyValue& element, std::string place) {
  const PropertyDictionary* const account = element.asDictionary();
  const auto children =
      account != nullptr ? account->arrayForKey(kAccountChildAccounts) : std::nullopt;
  for (std::size_t child = 0; children && child < children->size(); ++child) {
    lost.insert(place + ".ChildAccounts[" + std::to_string(child) + "]");
  }
}

void damageSettings(OrdinaryDevice& choices, DamagedDevice& device) {
  PropertyArray accounts = device.files.settings->arrayForKey(kPlistAccountsKey).value();
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    if (choices.chance(30)) {
      accounts.replace(
          index, kDamages[choices.below(kDamages.size())](*accounts.at(index).asDictionary()));
      const std::string place = "Accounts[" + std::to_string(index) + "]";
      device.lost.insert(place);
      addChildren(device.lost, accounts.at(index), place);
    }
  }
  device.files.settings->set(kPlistAccountsKey, accounts);
}

/// One description of a store without a class keeps all of the store out.
void damageStore(OrdinaryDevice& choices, PropertyDictionary& store,
                 const std::vector<std::string_view>& arrays, std::string_view classKey,
                 std::set<std::string>& lost) {
  const std::string_view last = arrays.back();
  PropertyArray descriptions = store.arrayForKey(last).value();
  if (descriptions.empty() || !choices.chance(50)) {
    return;
  }
  const auto index = choices.below(static_cast<unsigned>(descriptions.size()));
  descriptions.replace(index, AccountDictionary(descriptions.at(index)).without(classKey));
  store.set(last, descriptions);
  for (const std::string_view array : arrays) {
    for (std::size_t each = 0; each < store.arrayForKey(array)->size(); ++each) {
      lost.insert(std::string(array) + "[" + std::to_string(each) + "]");
    }
  }
}

DamagedDevice damagedDevice(unsigned seed) {
  OrdinaryDevice choices(seed);
  DamagedDevice device = {choices.make(), {}};
  if (device.files.settings) {
    damageSettings(choices, device);
  }
  if (device.files.mail) {
    damageStore(choices, *device.files.mail, {kLegacyOutgoingAccounts, kLegacyIncomingAccounts},
                kLegacyMailClass, device.lost);
  }
  if (device.files.exchange) {
    damageStore(choices, *device.files.exchange, {kLegacyExchangeAccounts}, kLegacyExchangeClass,
                device.lost);
  }
  return device;
}

TEST(GeneratedLedgers, OfDamagedDevicesExactlyWhatIsDamagedIsSaidToBeLost) {
  std::size_t lost = 0;
  for (unsigned seed = 1; seed <= kDevices && !HasFailure(); ++seed) {
    const DamagedDevice device = damagedDevice(seed);
    const MigratedInMemory migrated(device.files);
    const std::vector<std::string> found = migrated.lost();
    EXPECT_EQ(std::set<std::string>(found.begin(), found.end()), device.lost)
        << "seed " << seed << "\n"
        << describe(device.files) << testing::PrintToString(migrated.losses());
    lost += found.size();
  }
  EXPECT_GT(lost, kDevices / 2);
  std::cout << lost << " accounts of " << kDevices << " devices were lost\n";
}

}  // namespace
}  // namespace accounts
