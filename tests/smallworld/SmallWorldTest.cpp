// Every device up to a small size: each is migrated by the plug-in alone and by a run, planned
// before and migrated again afterwards. Not all are taken unless one asks for it; docs/testing.md
// says how.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <numeric>
#include <set>

#include "propertylist/PropertyListFile.h"
#include "propertylist/value/Description.h"
#include "tests/smallworld/BothWays.h"
#include "vocabulary/AccountClasses.h"
#include "vocabulary/AccountVocabulary.h"
#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {
namespace {

std::optional<PropertyDictionary> dictionaryIn(const Files& files, DevicePlace place) {
  const auto file = files.find(pathOfPlace(place, "/var/mobile"));
  const auto value = readPropertyList(file != files.end() ? file->second : "");
  return value && value->asDictionary() != nullptr ? std::optional(*value->asDictionary())
                                                   : std::nullopt;
}

PropertyArray accountsIn(const Files& files) {
  return dictionaryIn(files, DevicePlace::Settings)
      .value_or(PropertyDictionary())
      .arrayForKey(kPlistAccountsKey)
      .value_or(PropertyArray());
}

/// Everything that a failure has to show of files.
std::string described(const Files& files) {
  std::string text;
  for (const auto& [path, bytes] : files) {
    const auto value = readPropertyList(bytes);
    text.append(path).append(": ").append(value ? describe(*value) : bytes).append("\n");
  }
  return text;
}

/// Whether files are the same; says what differs.
void expectFiles(const Files& found, const Files& expected) {
  if (found != expected) {
    EXPECT_EQ(described(found), described(expected));
    ADD_FAILURE() << "the same values in other bytes, if nothing stands above";
  }
}

/// Lines without the beginning of an error's text, which the fakes of a device and of a snapshot do
/// not share.
std::vector<std::string> withoutBeginningsOfErrors(std::vector<std::string> lines) {
  for (std::string& line : lines) {
    for (const std::string_view beginning : {"Cannot open ", "Cannot remove "}) {
      if (const std::size_t at = line.find(beginning); at != std::string::npos) {
        line.erase(at, beginning.size());
      }
    }
  }
  return lines;
}

/// The run ends as the plug-in alone does, and what is told on the way is the same, line by line.
void expectTheSame(const EndingOfRun& run, const EndingAlone& alone, const Files& before) {
  EXPECT_EQ(run.told.channel, alone.told.channel);
  EXPECT_EQ(withoutBeginningsOfErrors(run.told.console), alone.told.console);
  EXPECT_EQ(run.told.announcements, alone.told.announcements);
  if (!run.conclusion.isCommitted) {
    // A run that cannot be verified changes nothing; the plug-in alone has saved.
    EXPECT_NE(run.conclusion.exitStatus, ExitStatus::Success);
    expectFiles(run.files, before);
    return;
  }
  EXPECT_TRUE(alone.succeeded);
  expectFiles(run.files, alone.files);
}

/// A plan changes nothing and says what the run does.
void expectForetold(const EndingOfRun& plan, const EndingOfRun& run, const Files& before) {
  expectFiles(plan.files, before);
  EXPECT_FALSE(plan.conclusion.isCommitted);
  EXPECT_EQ(plan.conclusion.exitStatus, run.conclusion.exitStatus);
  EXPECT_TRUE(plan.proposal == run.proposal);
  if (!run.conclusion.isCommitted) {
    return;
  }
  Files foretold = before;
  const auto pathOf = [](DevicePlace place) { return pathOfPlace(place, "/var/mobile"); };
  for (const ProposedChange& each : plan.proposal.changes) {
    const std::string bytes = plan.memoryFile.substr(each.offset, each.length);
    const std::string path = pathOf(each.place);
    if (each.place == DevicePlace::CommitRecord ||
        each.action == ProposedChange::Action::MakeDirectory) {
      continue;
    }
    if (each.place == DevicePlace::InformationDirectory) {
      foretold[path + "/" + plan.proposal.informationFileName] = bytes;
    } else if (each.action == ProposedChange::Action::Write) {
      foretold[path] = bytes;
    } else if (each.action == ProposedChange::Action::CopySettings) {
      foretold[path] = before.at(pathOf(DevicePlace::Settings));
    } else {
      foretold.erase(path);
    }
  }
  expectFiles(run.files, foretold);
}

std::size_t countWithChildren(const PropertyArray& accounts) {
  std::size_t count = accounts.size();
  for (const PropertyValue& each : accounts) {
    const PropertyDictionary* const account = each.asDictionary();
    const auto children =
        account != nullptr ? account->arrayForKey(kAccountChildAccounts) : std::nullopt;
    count += children ? children->size() : 0;
  }
  return count;
}

/// Every account of every file has one fate, and every account of the result is one of those or was
/// made by a step.
void expectBalanced(const EndingOfRun& run, const Files& before) {
  if (!run.conclusion.isCommitted) {
    return;
  }
  std::size_t expected = countWithChildren(accountsIn(before));
  for (const auto& [place, key] :
       {std::pair(DevicePlace::LegacyMail, kLegacyIncomingAccounts),
        std::pair(DevicePlace::LegacyMail, kLegacyOutgoingAccounts),
        std::pair(DevicePlace::LegacyExchange, kLegacyExchangeAccounts)}) {
    const auto store = dictionaryIn(before, place).value_or(PropertyDictionary());
    expected += store.arrayForKey(key).value_or(PropertyArray()).size();
  }
  std::set<std::string> places;
  std::set<std::size_t> explained;
  for (const LedgerEntry& entry : run.ledger.entries) {
    const std::string place = std::to_string(static_cast<int>(AccountLedger::fileOf(entry))) +
                              AccountLedger::placeOf(entry);
    EXPECT_TRUE(places.insert(place).second) << place << " is told of twice";
    EXPECT_EQ(entry.fate == AccountFate::NotCarriedOver, !entry.reason.empty()) << place;
    EXPECT_TRUE(entry.fate == AccountFate::NotCarriedOver || !entry.now.empty()) << place;
    for (const LedgerPlace& now : entry.now) {
      EXPECT_EQ(run.ledger.after(now).has_value(), run.ledger.before(entry).has_value()) << place;
      explained.insert(now.index);
    }
  }
  EXPECT_EQ(places.size(), expected);
  EXPECT_THAT(run.ledger.unexplained, testing::IsEmpty());
  EXPECT_EQ(run.conclusion.exitStatus == ExitStatus::Success, run.ledger.isClean());
  for (std::size_t index = 0; index < run.origins.size(); ++index) {
    const AccountOrigin origin = run.origins[index];
    // One that stands in several places, as two accounts with one identifier may, is found at one.
    EXPECT_TRUE(origin.kind == AccountOrigin::Kind::Made ||
                std::ranges::any_of(explained,
                                    [&](std::size_t each) { return run.origins[each] == origin; }))
        << "where does " << describe(accountsIn(run.files).at(index)) << " come from?";
  }
}

/// What a second run does to accounts.
struct LaterChange {
  const char* reason;
  /// Makes the accounts after a first run those after a second one.
  void (*make)(PropertyArray& accounts);
};

bool isOneOf(const PropertyDictionary& account, std::string_view key,
             std::initializer_list<std::string_view> texts) {
  const std::optional<Text> text = account.textForKey(key);
  return text && std::ranges::find(texts, text->view()) != texts.end();
}

/// A mail account whose class is not one of mail's, nor told by a directory of its mail.
bool isMailAccountOfNoClass(const PropertyDictionary& account) {
  return isOneOf(account, kAccountType, {kMailAccountType, kVelmoraAccountType}) &&
         !isOneOf(
             account, kAccountClass,
             {kMarrowAccountClass, kVelmoraAccountClass, kPOPAccountClass, kIMAPAccountClass,
              kAOLAccountClass, kLocalMailAccountClass, kGmailAccountClass, kYahooAccountClass}) &&
         account.textForKey("AccountPath").value_or(Text()).view().find("/Mail/") ==
             std::string_view::npos;
}

constexpr LaterChange kLaterChanges[] = {
    {"A mail account of which no class can be told is written by the run that makes it, so that "
     "nothing is lost by a save; the next loading refuses it.",
     [](PropertyArray& accounts) {
       std::vector<PropertyValue> kept;
       for (const PropertyValue& each : accounts) {
         if (!isMailAccountOfNoClass(*each.asDictionary())) {
           kept.push_back(each);
         }
       }
       accounts = PropertyArray(std::move(kept));
     }},
};

/// A second run changes no account but as listed.
void expectSettled(const EndingOfRun& first, const EndingOfRun& second) {
  if (!first.conclusion.isCommitted) {
    return;
  }
  PropertyArray expected = accountsIn(first.files);
  for (const LaterChange& each : kLaterChanges) {
    each.make(expected);
  }
  const PropertyArray found = accountsIn(second.files);
  EXPECT_TRUE(found == expected) << describe(expected) << "\nbecomes\n" << describe(found);
}

void expectAsRuled(const SmallDevice& device) {
  const Files before = filesOf(device);
  const EndingAlone alone = migratedAlone(device, before, 0);
  const EndingOfRun plan = migrated(device, before, 0, RunPurpose::Plan);
  const EndingOfRun run = migrated(device, before, 0, RunPurpose::Migration);
  const EndingOfRun again = migrated(device, run.files, 1, RunPurpose::Migration);
  expectTheSame(run, alone, before);
  expectForetold(plan, run, before);
  expectBalanced(run, before);
  expectSettled(run, again);
}

constexpr std::uint64_t kShards = 64;
/// As many as a minute is enough for.
constexpr std::uint64_t kDevices = 20'000;

std::uint64_t numberFrom(const char* variable, std::uint64_t otherwise) {
  const char* const text = std::getenv(variable);
  return text != nullptr ? std::strtoull(text, nullptr, 10) : otherwise;
}

/// About the golden section of the world, so that devices so far apart are spread over all of it,
/// however many are taken; and with no divisor in common, so that none is taken twice.
std::uint64_t strideThrough(std::uint64_t size) {
  std::uint64_t stride = size / 1000 * 618;
  while (std::gcd(stride, size) != 1) {
    ++stride;
  }
  return stride;
}

/// Every device of one shard of them.
class SmallWorld : public testing::TestWithParam<std::uint64_t> {};

TEST_P(SmallWorld, IsMigratedAsRuled) {
  const std::uint64_t size = smallWorldSize();
  const std::uint64_t stride = strideThrough(size);
  const std::uint64_t count = std::min(numberFrom("SMALL_WORLD_DEVICES", kDevices), size);
  const std::uint64_t first = numberFrom("SMALL_WORLD_FIRST", 0);
  std::uint64_t tried = 0;
  for (std::uint64_t index = GetParam(); index < count && !HasFailure(); index += kShards) {
    const std::uint64_t number = (first + index * stride) % size;
    const SmallDevice device = smallDevice(number);
    SCOPED_TRACE("SMALL_WORLD_DEVICES=1 SMALL_WORLD_FIRST=" + std::to_string(number) +
                 " makes this device alone:\n" + device.description);
    expectAsRuled(device);
    ++tried;
  }
  std::cout << "small world: " << tried << " of " << size << " devices\n";
}

INSTANTIATE_TEST_SUITE_P(Shard, SmallWorld, testing::Range(std::uint64_t{0}, kShards));

}  // namespace
}  // namespace accounts
