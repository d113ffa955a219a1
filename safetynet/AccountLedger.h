#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/AccountFate.h"
#include "propertylist/value/PropertyValue.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// What became of an account of an input, as far as its values bear it out.
enum class AccountFate : std::uint8_t {
  Kept,
  /// The rules changed values of it.
  Changed,
  /// It has another identifier.
  Renamed,
  /// It was the description of a legacy store and is an account now.
  Converted,
  /// It is a child of a parent that was made from it.
  MovedBelow,
  /// It was a child and is the child of another parent.
  MovedToOtherParent,
  /// Other accounts stand for it.
  Joined,
  /// It was made anew in its place.
  Rebuilt,
  /// An earlier run, which did not get to its end, had carried its store over.
  CarriedOverEarlier,
  NotCarriedOver
};
inline constexpr std::array kAccountFates = {
    AccountFate::Kept,          AccountFate::Changed,    AccountFate::Renamed,
    AccountFate::Converted,     AccountFate::MovedBelow, AccountFate::MovedToOtherParent,
    AccountFate::Joined,        AccountFate::Rebuilt,    AccountFate::CarriedOverEarlier,
    AccountFate::NotCarriedOver};

/// A fate as one word for programs, such as "movedBelow", and as words for people.
std::string_view identifierOf(AccountFate fate);
std::string_view wordsOf(AccountFate fate);

/// An account of the settings file after the migration: a top-level one or a child of it.
struct LedgerPlace {
  std::uint32_t index = 0;
  std::optional<std::uint32_t> child = {};
  bool operator==(const LedgerPlace&) const = default;
};

/// An account of an input and its fate.
struct LedgerEntry {
  /// The top-level account or the description.
  AccountOrigin account;
  /// Which of its children is meant; none for itself.
  std::optional<std::uint32_t> child = {};
  AccountFate fate = AccountFate::NotCarriedOver;
  /// Where it is now; several when it was joined into several.
  std::vector<LedgerPlace> now = {};
  /// Why it was not carried over, as a clause.
  std::string reason = {};
};

/// Every account of every input of one migration, with its fate.
class AccountLedger {
 public:
  /// Contents of an input that no account can be told from.
  struct LostFile {
    DevicePlace place = DevicePlace::Settings;
    std::string reason;
  };
  /// Something else that an input held and that is not in the settings file.
  struct LeftBehind {
    DevicePlace place = DevicePlace::Settings;
    std::string key;
  };

  std::vector<LedgerEntry> entries;
  std::vector<LostFile> lostFiles;
  std::vector<LeftBehind> leftBehind;
  /// Accounts of the result that nothing says where they come from.
  std::vector<LedgerPlace> unexplained;
  /// The accounts of the inputs by kind of origin, and those of the result.
  std::array<PropertyArray, 5> inputs;
  PropertyArray result;
  /// The paths of the places.
  std::array<std::string, kDevicePlaceCount> paths;

  /// Whether everything was carried over.
  [[nodiscard]] bool isClean() const;
  [[nodiscard]] std::size_t countOf(AccountFate fate) const;
  /// Where an account stood, such as "Accounts[2].ChildAccounts[0]".
  [[nodiscard]] static std::string placeOf(const LedgerEntry& entry);
  [[nodiscard]] static std::string placeOf(const LedgerPlace& place);
  /// The file in which it stood.
  [[nodiscard]] static DevicePlace fileOf(const LedgerEntry& entry);
  /// The account as it was; none for an element that is no dictionary.
  [[nodiscard]] std::optional<PropertyDictionary> before(const LedgerEntry& entry) const;
  [[nodiscard]] std::optional<PropertyDictionary> after(const LedgerPlace& place) const;
  /// What was not carried over, one line each without a full stop: the account, where it stood, and
  /// why.
  [[nodiscard]] std::vector<std::string> losses() const;
};

/// The keys under which the descriptions of a kind of origin had their class, name and identifier;
/// those of today for accounts of the settings file.
struct OriginKeys {
  std::string_view accountClass;
  std::string_view displayName;
  std::string_view identifier;
};
OriginKeys keysOf(AccountOrigin::Kind kind);
/// The key of the array in which the accounts of a kind stand, and the file.
std::string_view arrayKeyOf(AccountOrigin::Kind kind);
DevicePlace fileOf(AccountOrigin::Kind kind);

}  // namespace accounts
