#include "report/MigrationRecorder.h"

#include <unordered_map>
#include <utility>

#include "inspection/AccountTree.h"
#include "inspection/DifferenceJSON.h"
#include "propertylist/value/GeneralisedUTF8.h"
#include "report/RecordedEvents.h"
#include "safetynet/AccountLedger.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/ElementName.h"

namespace accounts {
namespace {

/// More than a line about an account of any device has. One can be as long as all that a file
/// stands for, and there are many.
constexpr std::size_t kLongestLogLine = std::size_t{16} << 10;

/// A line, or as much of it as a report needs and how much it does not have.
std::string shortened(std::string_view line) {
  if (line.size() <= kLongestLogLine) {
    return std::string(line);
  }
  const std::string_view beginning = wholeCodePoints(line, kLongestLogLine);
  return std::string(beginning) + "… (" + std::to_string(line.size() - beginning.size()) +
         " bytes more)";
}

JSON versionOf(const PropertyDictionary& settings) {
  const PropertyValue* const version = settings.find(kPlistVersionKey);
  return version != nullptr ? jsonOf(*version) : JSON(nullptr);
}

/// The accounts of a settings file as nobody has changed them.
std::vector<AccountOrigin> originsIn(const PropertyDictionary& settings) {
  std::vector<AccountOrigin> origins(
      settings.arrayForKey(kPlistAccountsKey).value_or(PropertyArray()).size());
  for (std::uint32_t index = 0; index < origins.size(); ++index) {
    origins[index] = {AccountOrigin::Kind::Settings, index};
  }
  return origins;
}

/// Of each account the place where it stood before.
Partners partnersOf(const std::vector<AccountOrigin>& accounts,
                    const std::vector<AccountOrigin>& before) {
  std::unordered_map<std::uint64_t, std::size_t> places;
  for (std::size_t index = 0; index < before.size(); ++index) {
    // Of made accounts that nothing is told of there may be several.
    if (before[index] != AccountOrigin()) {
      places.emplace(before[index].key(), index);
    }
  }
  Partners partners(accounts.size());
  for (std::size_t index = 0; index < accounts.size(); ++index) {
    if (const auto found = places.find(accounts[index].key()); found != places.end()) {
      partners[index] = found->second;
    }
  }
  return partners;
}

/// Which account a change is of; a made one where that is not told, as of children.
AccountOrigin originOf(const AccountChange& change, const std::vector<AccountOrigin>& before,
                       const std::vector<AccountOrigin>& after) {
  const auto at = [](const std::optional<ListedAccount>& account,
                     const std::vector<AccountOrigin>& origins) {
    return account && !account->isChild && account->index < origins.size() ? origins[account->index]
                                                                           : AccountOrigin();
  };
  const AccountOrigin origin = at(change.before, before);
  return origin != AccountOrigin() ? origin : at(change.after, after);
}

}  // namespace

void MigrationRecorder::write(std::string_view event, JSON content) {
  const std::string line = lineOf(JSON{{event, std::move(content)}});
  const std::lock_guard guard(mutex_);
  writeLine_(line);
}

void MigrationRecorder::recordBefore(const std::vector<StoreFile>& stores) {
  JSON accounts = JSON::array();
  JSON version = nullptr;
  for (const StoreFile& store : stores) {
    appendAccountTree(accounts, store.content, store.kind, secrets_);
    if (store.kind == FileKind::AccountSettings) {
      accounts_ = {store.content, originsIn(store.content)};
      version = versionOf(store.content);
    }
  }
  write(events::kBefore,
        {{events::kVersion, std::move(version)}, {events::kAccounts, std::move(accounts)}});
}

void MigrationRecorder::recordAfter(const std::optional<PropertyDictionary>& settings) {
  JSON accounts = JSON::array();
  JSON version = nullptr;
  if (settings) {
    appendAccountTree(accounts, *settings, FileKind::AccountSettings, secrets_);
    version = versionOf(*settings);
  }
  write(events::kAfter,
        {{events::kVersion, std::move(version)}, {events::kAccounts, std::move(accounts)}});
}

void MigrationRecorder::recordFile(std::string_view action, std::string_view path,
                                   const std::optional<std::string>& error) {
  JSON file = {{"action", action}, {"path", path}};
  if (error) {
    file["error"] = *error;
  }
  write(events::kFile, std::move(file));
}

void MigrationRecorder::recordLogLine(LogKind kind, std::string_view line) {
  write(events::kLog,
        {{"to", kind == LogKind::Console ? "console" : "channel"}, {"text", shortened(line)}});
}

void MigrationRecorder::stageBegan(std::string_view operation, std::string_view purpose) {
  write(events::kBegan, {{"name", operation}, {"title", purpose}});
  stageBegin_ = std::chrono::steady_clock::now();
}

void MigrationRecorder::stageEnded(bool succeeded,
                                   const std::optional<AccountsInMemory>& accounts) {
  const std::chrono::duration<double> duration = std::chrono::steady_clock::now() - stageBegin_;
  JSON ended = {{"succeeded", succeeded}, {"seconds", duration.count()}};
  if (accounts) {
    const StoreDifference difference =
        differenceBetween(accounts_.settings, accounts->settings, FileKind::AccountSettings,
                          secrets_, partnersOf(accounts->origins, accounts_.origins));
    ended.update(differenceObject(difference, *layoutOf(FileKind::AccountSettings)));
    for (std::size_t index = 0; index < difference.accounts.size(); ++index) {
      const AccountOrigin origin =
          originOf(difference.accounts[index], accounts_.origins, accounts->origins);
      if (origin.kind != AccountOrigin::Kind::Made) {
        ended["accounts"][index]["account"] = elementName(arrayKeyOf(origin.kind), origin.number);
      }
    }
    accounts_ = *accounts;
  }
  write(events::kEnded, std::move(ended));
}

}  // namespace accounts
