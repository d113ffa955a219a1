#include "safetynet/Proposal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <limits>
#include <vector>

#include "safetynet/FlatBytes.h"

namespace accounts {
namespace {

using Action = ProposedChange::Action;

constexpr std::uint64_t kMemoryFileSize = 1000;

/// One that has everything a proposal can have.
Proposal wholeProposal() {
  Proposal proposal;
  proposal.keepsFiles = true;
  proposal.informationFileName = "AccountMigrationInformation-2012-9-19-17-9-4.3.txt";
  proposal.changes = {
      {.place = DevicePlace::Settings,
       .action = Action::Write,
       .offset = 0,
       .length = 900,
       .owner = FileOwner{501, 502}},
      {.place = DevicePlace::LegacyMail, .action = Action::Remove},
      {.place = DevicePlace::CopyAside, .action = Action::CopySettings},
      {.place = DevicePlace::InformationDirectory,
       .action = Action::Write,
       .offset = 900,
       .length = 60},
      {.place = DevicePlace::CommitRecord, .action = Action::Write, .offset = 960, .length = 40}};
  return proposal;
}

std::optional<Proposal> sent(const Proposal& proposal) {
  return proposalFrom(bytesOf(proposal), kMemoryFileSize);
}

TEST(ProposalTest, BytesSayWhatTheyWereMadeOf) {
  EXPECT_EQ(sent(wholeProposal()), wholeProposal());
  EXPECT_EQ(sent(Proposal()), Proposal());
  Proposal other;
  other.status = ExitStatus::NotVerified;
  other.recordStays = true;
  EXPECT_EQ(sent(other), other);
}

TEST(ProposalTest, AnInformationDirectoryWithoutAFileHasNoNameOfOne) {
  Proposal proposal;
  proposal.changes = {
      {.place = DevicePlace::InformationDirectory, .action = Action::MakeDirectory}};
  EXPECT_EQ(sent(proposal), proposal);
  proposal.informationFileName = "AccountMigrationInformation-1.txt";
  EXPECT_EQ(sent(proposal), std::nullopt);
}

TEST(ProposalTest, AnInformationFilesNameHasLettersDigitsHyphensAndDotsAlone) {
  Proposal proposal;
  proposal.changes = {{.place = DevicePlace::InformationDirectory, .action = Action::Write}};
  for (const char each : {'0', '9', 'A', 'Z', 'a', 'z', '-', '.'}) {
    proposal.informationFileName = "AccountMigrationInformation-" + std::string(1, each) + ".txt";
    EXPECT_EQ(sent(proposal), proposal) << each;
  }
  for (const char each : {'/', ':', '@', '[', '`', '{', ',', '\0', '\xE4'}) {
    proposal.informationFileName = "AccountMigrationInformation-" + std::string(1, each) + ".txt";
    EXPECT_EQ(sent(proposal), std::nullopt) << each;
  }
}

TEST(ProposalTest, APartOfTheBytesIsNoProposal) {
  const std::string bytes = bytesOf(wholeProposal());
  for (std::size_t size = 0; size < bytes.size(); ++size) {
    EXPECT_FALSE(proposalFrom(bytes.substr(0, size), kMemoryFileSize)) << size;
  }
}

TEST(ProposalTest, BytesBehindTheMarkAreNoProposal) {
  EXPECT_FALSE(proposalFrom(bytesOf(wholeProposal()) + '\0', kMemoryFileSize));
}

/// Whether a proposal is one that a migration may make, told in another way than reading it does.
void expectAllowed(const Proposal& proposal) {
  std::vector<DevicePlace> seen;
  bool hasInformation = false;
  for (const ProposedChange& each : proposal.changes) {
    EXPECT_EQ(std::count(seen.begin(), seen.end(), each.place), 0);
    seen.push_back(each.place);
    EXPECT_LE(each.offset, kMemoryFileSize);
    EXPECT_LE(each.offset + each.length, kMemoryFileSize);
    EXPECT_TRUE(!each.owner || each.place == DevicePlace::Settings);
    hasInformation = hasInformation || (each.place == DevicePlace::InformationDirectory &&
                                        each.action == Action::Write);
    switch (each.place) {
      case DevicePlace::Settings:
        EXPECT_EQ(each.action, Action::Write);
        break;
      case DevicePlace::InformationDirectory:
        EXPECT_TRUE(each.action == Action::Write || each.action == Action::MakeDirectory);
        break;
      case DevicePlace::CopyAside:
        EXPECT_TRUE(each.action == Action::CopySettings || each.action == Action::Remove);
        break;
      case DevicePlace::CommitRecord:
        EXPECT_TRUE(each.action == Action::Write || each.action == Action::Remove);
        break;
      case DevicePlace::LoggingPreferences:
        ADD_FAILURE() << "nothing writes these";
        break;
      default:
        EXPECT_EQ(each.action, Action::Remove);
    }
  }
  EXPECT_EQ(hasInformation, !proposal.informationFileName.empty());
  EXPECT_EQ(proposal.informationFileName.find('/'), std::string::npos);
  EXPECT_EQ(proposal.informationFileName.find('\0'), std::string::npos);
}

TEST(ProposalTest, EveryByteThatIsChangedIsRefusedOrMeansSomethingAllowed) {
  const std::string right = bytesOf(wholeProposal());
  std::size_t refused = 0;
  for (std::size_t position = 0; position < right.size(); ++position) {
    for (int difference = 1; difference < 256; ++difference) {
      std::string bytes = right;
      bytes[position] = static_cast<char>(bytes[position] ^ difference);
      const auto read = proposalFrom(bytes, kMemoryFileSize);
      if (read) {
        expectAllowed(*read);
        EXPECT_NE(read, wholeProposal());
      } else {
        ++refused;
      }
    }
  }
  EXPECT_GT(refused, right.size() * 255 / 2);
}

struct Lie {
  const char* name;
  std::function<void(Proposal&)> tell;
};

void PrintTo(const Lie& lie, std::ostream* stream) {
  *stream << lie.name;
}

class ProposalLieTest : public testing::TestWithParam<Lie> {};

TEST_P(ProposalLieTest, IsRefused) {
  Proposal proposal = wholeProposal();
  GetParam().tell(proposal);
  EXPECT_FALSE(sent(proposal));
}

const Lie kLies[] = {
    {"APlaceTwice", [](Proposal& proposal) { proposal.changes.push_back(proposal.changes.at(1)); }},
    {"APlaceThatIsNone",
     [](Proposal& proposal) {
       proposal.changes.at(1).place = static_cast<DevicePlace>(kDevicePlaceCount);
     }},
    {"AnActionThatIsNone",
     [](Proposal& proposal) { proposal.changes.at(1).action = static_cast<Action>(3); }},
    {"AStoreWithNewContents",
     [](Proposal& proposal) { proposal.changes.at(1).action = Action::Write; }},
    {"NoSettingsFile", [](Proposal& proposal) { proposal.changes.at(0).action = Action::Remove; }},
    {"NewContentsAside", [](Proposal& proposal) { proposal.changes.at(2).action = Action::Write; }},
    {"OtherPreferences",
     [](Proposal& proposal) { proposal.changes.at(1).place = DevicePlace::LoggingPreferences; }},
    {"ContentsBehindTheMemoryFile",
     [](Proposal& proposal) { proposal.changes.at(0).offset = kMemoryFileSize + 1; }},
    {"ContentsBeyondTheMemoryFile",
     [](Proposal& proposal) { proposal.changes.at(0).length = kMemoryFileSize + 1; }},
    {"ContentsWhoseEndIsTooLargeANumber",
     [](Proposal& proposal) {
       proposal.changes.at(0).offset = 2;
       proposal.changes.at(0).length = std::numeric_limits<std::uint64_t>::max() - 1;
     }},
    {"ARecordOfSomebodyElse",
     [](Proposal& proposal) {
       proposal.changes.at(4).owner = FileOwner{1, 1};
     }},
    {"NoNameForTheInformationFile",
     [](Proposal& proposal) { proposal.informationFileName.clear(); }},
    {"ANameWithoutAnInformationFile",
     [](Proposal& proposal) { proposal.changes.erase(proposal.changes.begin() + 3); }},
    {"ANameThatLeadsElsewhere",
     [](Proposal& proposal) {
       proposal.informationFileName = "AccountMigrationInformation-/../../x.txt";
     }},
    {"ANameThatEndsEarly",
     [](Proposal& proposal) {
       proposal.informationFileName = std::string("AccountMigrationInformation-\0.txt", 33);
     }},
    {"ANameOfAnotherFile", [](Proposal& proposal) { proposal.informationFileName = "name.txt"; }},
    {"ANameThatIsTooLong", [](Proposal& proposal) {
       proposal.informationFileName =
           "AccountMigrationInformation-" + std::string(100, '1') + ".txt";
     }}};

INSTANTIATE_TEST_SUITE_P(Lies, ProposalLieTest, testing::ValuesIn(kLies),
                         [](const testing::TestParamInfo<Lie>& lie) { return lie.param.name; });

TEST(ProposalTest, AFlagThatIsNeitherIsRefused) {
  std::string bytes = bytesOf(wholeProposal());
  constexpr std::size_t kKeepsFiles = 5;
  bytes[kKeepsFiles] = 2;
  EXPECT_FALSE(proposalFrom(bytes, kMemoryFileSize));
}

TEST(ProposalTest, AStatusThatNoMigrationEndsWithIsRefused) {
  std::string bytes = bytesOf(Proposal());
  constexpr std::size_t kStatus = 4;
  std::vector<int> accepted;
  for (int status = 0; status < 256; ++status) {
    bytes[kStatus] = static_cast<char>(status);
    if (proposalFrom(bytes, kMemoryFileSize)) {
      accepted.push_back(status);
    }
  }
  EXPECT_EQ(accepted, (std::vector<int>{0, 1, 2, 3, 66, 70, 73, 74, 75}));
}

TEST(ProposalTest, TheChangeOfAPlaceIsFound) {
  const Proposal proposal = wholeProposal();
  ASSERT_NE(proposal.changeOf(DevicePlace::CopyAside), nullptr);
  EXPECT_EQ(proposal.changeOf(DevicePlace::CopyAside)->action, Action::CopySettings);
  EXPECT_EQ(proposal.changeOf(DevicePlace::AutoFetchEnabled), nullptr);
}

TEST(FlatBytesTest, WhatIsWrittenIsRead) {
  FlatWriter writer;
  writer.add(std::uint64_t{7});
  writer.addText("text");
  const std::string bytes = writer.take();
  FlatReader reader(bytes);
  EXPECT_EQ(reader.take<std::uint64_t>(), 7u);
  EXPECT_EQ(reader.takeText(4), "text");
  EXPECT_TRUE(reader.isGood());
  EXPECT_TRUE(reader.isAtEnd());
}

TEST(FlatBytesTest, ATextThatIsTooLongOrNotThereIsRefused) {
  FlatWriter writer;
  writer.addText("text");
  const std::string bytes = writer.take();
  FlatReader tooLong(bytes);
  EXPECT_EQ(tooLong.takeText(3), "");
  EXPECT_FALSE(tooLong.isGood());
  FlatReader notThere(std::string_view(bytes).substr(0, bytes.size() - 1));
  EXPECT_EQ(notThere.takeText(4), "");
  EXPECT_FALSE(notThere.isGood());
}

TEST(FlatBytesTest, AfterTheFirstThatIsMissingThereIsNothing) {
  FlatReader reader("\x01\x01\x01");
  EXPECT_EQ(reader.take<std::uint32_t>(), 0u);
  EXPECT_EQ(reader.take<std::uint8_t>(), 0u);
  EXPECT_FALSE(reader.isGood());
}

}  // namespace
}  // namespace accounts
