#include "safetynet/LedgerMaking.h"

#include <algorithm>
#include <unordered_map>
#include <utility>

#include "safetynet/AccountComparison.h"
#include "safetynet/ConvertedDescription.h"
#include "safetynet/EarlierRun.h"
#include "safetynet/SharedIdentifiers.h"
#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/MigrationStages.h"

namespace accounts {
namespace {

using Kind = AccountOrigin::Kind;

constexpr std::array kInputKinds = {Kind::Exchange, Kind::OutgoingMail, Kind::IncomingMail,
                                    Kind::Settings};

const PropertyDictionary* dictionaryAt(const PropertyArray& accounts, std::size_t index) {
  return index < accounts.size() ? accounts.at(index).asDictionary() : nullptr;
}

PropertyArray childrenOf(const PropertyDictionary& account) {
  return account.arrayForKey(kAccountChildAccounts).value_or(PropertyArray());
}

class LedgerMaker {
 public:
  LedgerMaker(Transaction& transaction, const ToldFates& told, const DeviceFacts& facts)
      : transaction_(transaction), told_(told), changedKeys_(told, facts) {
    for (const ListedPlace& each : kDevicePlaces) {
      ledger_.paths[indexOf(each.place)] = transaction.snapshot().at(each.place).path;
    }
    takeResult();
  }

  void takeInput(DevicePlace place) {
    const std::optional<PropertyDictionary> contents = transaction_.dictionaryBefore(place);
    if (!contents) {
      ledger_.lostFiles.push_back({place, "could not be read as a property list"});
      return;
    }
    std::vector<std::string_view> known;
    for (const Kind kind : kInputKinds) {
      if (fileOf(kind) == place) {
        known.push_back(arrayKeyOf(kind));
        takeArray(place, *contents, kind);
      }
    }
    if (place == DevicePlace::Settings) {
      known.push_back(kPlistVersionKey);
    }
    for (const auto& entry : *contents) {
      if (std::ranges::find(known, entry.key.view()) == known.end()) {
        ledger_.leftBehind.push_back({place, entry.key.string()});
      }
    }
  }

  /// The accounts of an input, as the migration says that it treated them.
  void accountFor(DevicePlace place) {
    for (const Kind kind : kInputKinds) {
      if (fileOf(kind) == place) {
        const PropertyArray& accounts = inputsOf(kind);
        for (std::size_t index = 0; index < accounts.size(); ++index) {
          accountFor({kind, static_cast<std::uint32_t>(index)}, accounts.at(index));
        }
      }
    }
  }

  /// The accounts of a legacy store that an earlier run carried over. With a record that is proved;
  /// otherwise they are looked for.
  void accountForEarlier(DevicePlace place, bool isProved) {
    std::optional<AccountsOfEarlierRun> earlier;
    for (const Kind kind : kInputKinds) {
      const PropertyArray accounts = fileOf(kind) == place ? inputsOf(kind) : PropertyArray();
      for (std::size_t index = 0; index < accounts.size(); ++index) {
        LedgerEntry entry = {{kind, static_cast<std::uint32_t>(index)}};
        if (!earlier) {
          earlier.emplace(ledger_.result);
        }
        if (const auto found = earlier->find(accounts.at(index), kind)) {
          entry.now.push_back(*found);
        }
        if (isProved || !entry.now.empty()) {
          entry.fate = AccountFate::CarriedOverEarlier;
        } else {
          entry.reason =
              "its store was removed, as an earlier run had begun to, but it is not in the "
              "settings file";
        }
        ledger_.entries.push_back(std::move(entry));
      }
    }
  }

  /// The accounts of a settings file that no store was opened for.
  void accountForUntouched() {
    const PropertyArray& accounts = inputsOf(Kind::Settings);
    for (std::size_t index = 0; index < accounts.size(); ++index) {
      const auto number = static_cast<std::uint32_t>(index);
      now_[AccountOrigin{Kind::Settings, number}.key()] = number;
    }
    accountFor(DevicePlace::Settings);
  }

  void explainResult() {
    if (!told_.saved() || told_.saved()->size() != ledger_.result.size()) {
      return;
    }
    for (std::size_t index = 0; index < told_.saved()->size(); ++index) {
      const AccountOrigin origin = (*told_.saved())[index];
      const bool isExplained = origin.kind == Kind::Made
                                   ? origin.number != 0
                                   : origin.number < inputsOf(origin.kind).size();
      if (!isExplained) {
        ledger_.unexplained.push_back({static_cast<std::uint32_t>(index)});
      }
    }
  }

  void forgetLostFiles() { ledger_.lostFiles.clear(); }

  AccountLedger take() { return std::move(ledger_); }

 private:
  [[nodiscard]] const PropertyArray& inputsOf(Kind kind) const {
    return ledger_.inputs[static_cast<std::size_t>(kind)];
  }

  void takeResult() {
    const auto settings = transaction_.dictionaryAt(DevicePlace::Settings);
    ledger_.result = settings.value_or(PropertyDictionary())
                         .arrayForKey(kPlistAccountsKey)
                         .value_or(PropertyArray());
    // An order of another length than the file's says nothing.
    if (told_.saved() && told_.saved()->size() == ledger_.result.size()) {
      now_.reserve(told_.saved()->size());
      for (std::size_t index = 0; index < told_.saved()->size(); ++index) {
        now_.emplace((*told_.saved())[index].key(), static_cast<std::uint32_t>(index));
      }
    }
    for (const KeptEvent& event : told_.events()) {
      events_[event.account.key()].push_back(&event);
    }
  }

  void takeArray(DevicePlace place, const PropertyDictionary& contents, Kind kind) {
    const PropertyValue* const value = contents.find(arrayKeyOf(kind));
    if (value != nullptr && value->asArray() == nullptr) {
      ledger_.lostFiles.push_back({place, "holds accounts in an unknown form: its \"" +
                                              std::string(arrayKeyOf(kind)) + "\" is no array"});
    }
    ledger_.inputs[static_cast<std::size_t>(kind)] =
        contents.arrayForKey(arrayKeyOf(kind)).value_or(PropertyArray());
  }

  [[nodiscard]] std::optional<std::uint32_t> placeNow(AccountOrigin origin) const {
    const auto found = now_.find(origin.key());
    return found != now_.end() ? std::optional(found->second) : std::nullopt;
  }

  [[nodiscard]] std::span<const KeptEvent* const> eventsOf(AccountOrigin origin) const {
    const auto found = events_.find(origin.key());
    return found != events_.end() ? std::span<const KeptEvent* const>(found->second)
                                  : std::span<const KeptEvent* const>();
  }

  void accountFor(AccountOrigin origin, const PropertyValue& element) {
    const PropertyDictionary* const account = element.asDictionary();
    LedgerEntry entry = {origin};
    std::vector<LedgerEntry> children;
    if (const auto place = placeNow(origin); place && account != nullptr) {
      compare(entry, *account, *place, children);
    } else if (const auto events = eventsOf(origin); !events.empty()) {
      settle(entry, account, events, children);
    } else {
      entry.reason = "nothing says what became of it";
    }
    const bool isLost = entry.fate == AccountFate::NotCarriedOver;
    ledger_.entries.push_back(std::move(entry));
    if (children.empty() && account != nullptr) {
      // Only what has no place any more takes its children along.
      loseChildren(origin, *account, isLost);
    }
    std::ranges::move(children, std::back_inserter(ledger_.entries));
  }

  void loseChildren(AccountOrigin origin, const PropertyDictionary& account, bool isLost) {
    const std::size_t count = childrenOf(account).size();
    for (std::size_t child = 0; child < count; ++child) {
      ledger_.entries.push_back({.account = origin,
                                 .child = static_cast<std::uint32_t>(child),
                                 .reason = isLost ? "its parent was not carried over"
                                                  : "its parent was joined into another account"});
    }
  }

  /// An account that is at a place now.
  void compare(LedgerEntry& entry, const PropertyDictionary& account, std::uint32_t place,
               std::vector<LedgerEntry>& children) {
    entry.now.push_back({place});
    const PropertyDictionary* const after = dictionaryAt(ledger_.result, place);
    if (after == nullptr) {
      entry.reason = "what stands in its place is no account";
      return;
    }
    const Kind kind = entry.account.kind;
    if (kind != Kind::Settings) {
      const ConvertedDescription converted = convertedDescription(account, kind);
      entry.reason = converted.loss;
      comparison_.compare(entry, converted.account, *after, isAfterConversion(), children);
      if (entry.reason.empty()) {
        entry.fate = AccountFate::Converted;
      }
    } else {
      comparison_.compare(entry, account, *after, isAfterConversion(), children);
    }
    if (!entry.reason.empty()) {
      entry.fate = AccountFate::NotCarriedOver;
      noteSharedIdentifier(entry, account);
    }
  }

  /// The usual cause of a value that gave way.
  void noteSharedIdentifier(LedgerEntry& entry, const PropertyDictionary& account) {
    if (!identifiers_) {
      identifiers_.emplace(ledger_.inputs);
    }
    const auto identifier = account.textForKey(keysOf(entry.account.kind).identifier);
    if (!successor_ && identifier && identifiers_->isShared(*identifier)) {
      entry.reason += "; another account has its identifier";
    }
  }

  /// An account that is at no place of its own any more.
  void settle(LedgerEntry& entry, const PropertyDictionary* account,
              std::span<const KeptEvent* const> events, std::vector<LedgerEntry>& children) {
    const KeptEvent& last = *events.back();
    const auto isJoining = [](const KeptEvent* event) { return event->fate == ToldFate::Joined; };
    if (account == nullptr || last.fate == ToldFate::Refused) {
      entry.reason = last.reason.empty() ? "it was refused" : last.reason;
    } else if (last.fate == ToldFate::MovedBelow) {
      settleMoved(entry, *account, events, children);
    } else if (last.fate == ToldFate::Overwritten) {
      settleOverwritten(entry, *account, last, children);
    } else if (std::ranges::any_of(events, isJoining)) {
      settleJoined(entry, *account, events);
    } else if (last.fate == ToldFate::OutWithItsStore) {
      entry.reason = "another account of its store was refused, so the store stays out as a whole";
    } else if (last.fate == ToldFate::RemovedByReplacement) {
      entry.reason = "all accounts of its type gave way to others (" + last.stage + ")";
    } else {
      entry.reason = "it was deleted (" + last.stage + ")";
    }
  }

  void settleOverwritten(LedgerEntry& entry, const PropertyDictionary& account,
                         const KeptEvent& event, std::vector<LedgerEntry>& children) {
    // One that took its place may have lost it to the next.
    AccountOrigin other = event.other;
    std::optional<std::uint32_t> place = placeNow(other);
    for (std::size_t turn = 0; !place && turn < told_.events().size(); ++turn) {
      const auto events = eventsOf(other);
      if (events.empty() || events.back()->fate != ToldFate::Overwritten) {
        break;
      }
      other = events.back()->other;
      place = placeNow(other);
    }
    if (place) {
      successor_ = other;
      compare(entry, account, *place, children);
      successor_.reset();
    }
    if (!place || entry.fate == AccountFate::NotCarriedOver) {
      entry.reason = "another account with its identifier took its place" +
                     (entry.reason.empty() ? "" : ": " + entry.reason);
    } else if (other.kind == Kind::Made) {
      entry.fate = AccountFate::Rebuilt;
    }
  }

  void settleJoined(LedgerEntry& entry, const PropertyDictionary& account,
                    std::span<const KeptEvent* const> events) {
    for (const KeptEvent* const event : events) {
      const auto place = event->fate == ToldFate::Joined ? placeNow(event->other) : std::nullopt;
      const PropertyDictionary* const other =
          place ? dictionaryAt(ledger_.result, *place) : nullptr;
      const auto enabled =
          other != nullptr ? other->arrayForKey(kAccountEnabledDataclasses) : std::nullopt;
      if (enabled && enabled->containsText(kAccountDataclassCalendars)) {
        entry.now.push_back({*place});
      }
    }
    const ConvertedDescription converted = convertedDescription(account, entry.account.kind);
    const bool isCalendars =
        converted.account.textForKey(kAccountClass) == std::optional<Text>(kCalDAVAccountClass);
    if (entry.now.empty() || !isCalendars || !told_.hasRun(kStep7A242)) {
      entry.reason = "it was deleted, and the account that it was joined into has no calendars";
    } else {
      entry.fate = AccountFate::Joined;
    }
  }

  /// A hosted mail account: what it gave to its new parent must be there, everything else below it.
  void settleMoved(LedgerEntry& entry, const PropertyDictionary& account,
                   std::span<const KeptEvent* const> events, std::vector<LedgerEntry>& children) {
    const ConvertedDescription converted = convertedDescription(account, entry.account.kind);
    entry.reason = "the parent account that it was moved below is gone";
    for (const KeptEvent* const event : events) {
      const auto place =
          event->fate == ToldFate::MovedBelow ? placeNow(event->other) : std::nullopt;
      const PropertyDictionary* const parent =
          place ? dictionaryAt(ledger_.result, *place) : nullptr;
      if (parent == nullptr) {
        continue;
      }
      const PropertyArray siblings = childrenOf(*parent);
      const PropertyDictionary* const now =
          siblings.empty() ? nullptr : dictionaryAt(siblings, siblings.size() - 1);
      if (now == nullptr) {
        entry.reason = "it is not below the parent account that was made from it";
        continue;
      }
      entry.now = {{*place, static_cast<std::uint32_t>(siblings.size() - 1)}};
      entry.reason = converted.loss;
      comparison_.compareMoved(entry, converted.account, *parent, *now, children);
      if (entry.reason.empty()) {
        entry.fate = AccountFate::MovedBelow;
        return;
      }
    }
  }

  [[nodiscard]] bool isAfterConversion() const {
    return successor_ && successor_->kind != Kind::Settings && successor_->kind != Kind::Made;
  }

  Transaction& transaction_;
  const ToldFates& told_;
  const ChangedKeys changedKeys_;
  const AccountComparison comparison_{changedKeys_};
  AccountLedger ledger_;
  /// What took the place of the account that is compared.
  std::optional<AccountOrigin> successor_;
  /// Made when first needed.
  std::optional<SharedIdentifiers> identifiers_;
  std::unordered_map<std::uint64_t, std::uint32_t> now_;
  std::unordered_map<std::uint64_t, std::vector<const KeptEvent*>> events_;
};

}  // namespace

AccountLedger makeLedger(Transaction& transaction, const std::vector<DevicePlace>& inputs,
                         const CommitRecord& carriedOver, const ToldFates& told,
                         const DeviceFacts& facts) {
  LedgerMaker maker(transaction, told, facts);
  std::vector<DevicePlace> earlier;
  for (const CommitRecord::Store& each : carriedOver.stores) {
    if (transaction.snapshot().at(each.place).contents != nullptr) {
      earlier.push_back(each.place);
    }
  }
  // All of them first: an account is compared with what the other files hold, too.
  const auto take = [&maker](DevicePlace place) { maker.takeInput(place); };
  std::ranges::for_each(earlier, take);
  // What could not be read of them was told of by the run that carried them over.
  maker.forgetLostFiles();
  std::ranges::for_each(inputs, take);
  for (const DevicePlace place : earlier) {
    maker.accountForEarlier(place, true);
  }
  for (const DevicePlace place : inputs) {
    if (told.saved()) {
      maker.accountFor(place);
    } else if (place == DevicePlace::Settings) {
      maker.accountForUntouched();
    } else if (!transaction.exists(place)) {
      maker.accountForEarlier(place, false);
    }
  }
  maker.explainResult();
  return maker.take();
}

}  // namespace accounts
