#include <gtest/gtest.h>

#include <functional>

#include "host/Announcements.h"
#include "host/ToldResult.h"

// What the two processes of a run tell each other. The worker runs what nobody vouches for, so what
// comes from it is taken whole or not at all.

namespace accounts {
namespace {

/// Whether any beginning of some bytes, or they with one byte more, are taken for the whole.
bool takesOthersThan(const std::string& bytes, const std::function<bool(std::string_view)>& take) {
  bool isTaken = take(bytes + '\0');
  for (std::size_t size = 0; size < bytes.size(); ++size) {
    isTaken = isTaken || take(std::string_view(bytes).substr(0, size));
  }
  return isTaken;
}

std::string announcementBytes() {
  return bytesOf(Announcements{{{"com.quarx.accountsettings", "Accounts"}, {"", ""}}, 2});
}

TEST(HandedOver, AnnouncementsArriveAsTheyWereMade) {
  const auto arrived = announcementsFrom(announcementBytes());

  ASSERT_TRUE(arrived);
  ASSERT_EQ(arrived->broadcasts.size(), 2U);
  EXPECT_EQ(arrived->broadcasts[0].application, "com.quarx.accountsettings");
  EXPECT_EQ(arrived->broadcasts[0].key, "Accounts");
  EXPECT_EQ(arrived->broadcasts[1].key, "");
  EXPECT_EQ(arrived->cloudTabs, 2U);
}

TEST(HandedOver, AnnouncementsThatAreNotWholeAreNone) {
  EXPECT_FALSE(takesOthersThan(announcementBytes(), [](std::string_view bytes) {
    return announcementsFrom(bytes).has_value();
  }));
}

TEST(HandedOver, AnAnnouncementIsAtMostFourKibibytesLong) {
  const auto isTaken = [](std::size_t length) {
    const std::string text(length, 'a');
    return announcementsFrom(bytesOf(Announcements{{{text, text}}, 0})).has_value();
  };
  EXPECT_TRUE(isTaken(4096));
  EXPECT_FALSE(isTaken(4097));
}

TEST(HandedOver, MoreAnnouncementsThanThereAreBytesForAreNone) {
  std::string bytes = bytesOf(Announcements());
  // The number of broadcasts is the last of them.
  bytes.replace(bytes.size() - 4, 4, "\xFF\xFF\xFF\xFF");

  EXPECT_FALSE(announcementsFrom(bytes));
}

std::string conclusionBytes() {
  RunConclusion conclusion;
  conclusion.exitStatus = ExitStatus::CannotCreate;
  conclusion.isCommitted = true;
  conclusion.error = ProgramError{ExitStatus::CannotCreate, "Why"};
  conclusion.keptFolder = "/kept";
  conclusion.warnings = {"One", ""};
  conclusion.earlierFolders = {"/earlier"};
  return bytesOf(conclusion);
}

TEST(HandedOver, TheConclusionArrivesAsItWas) {
  const auto arrived = conclusionFrom(conclusionBytes());

  ASSERT_TRUE(arrived);
  EXPECT_EQ(arrived->exitStatus, ExitStatus::CannotCreate);
  EXPECT_TRUE(arrived->isCommitted);
  ASSERT_TRUE(arrived->error);
  EXPECT_EQ(arrived->error->exitStatus, ExitStatus::CannotCreate);
  EXPECT_EQ(arrived->error->message, "Why");
  EXPECT_EQ(arrived->keptFolder, "/kept");
  EXPECT_EQ(arrived->warnings, (std::vector<std::string>{"One", ""}));
  EXPECT_EQ(arrived->earlierFolders, (std::vector<std::string>{"/earlier"}));
}

TEST(HandedOver, AConclusionThatIsNotWholeIsNone) {
  EXPECT_FALSE(takesOthersThan(
      conclusionBytes(), [](std::string_view bytes) { return conclusionFrom(bytes).has_value(); }));
}

std::string resultBytes() {
  return bytesOf(ToldResult{{"A warning"}, "An error", "A result\n"});
}

TEST(HandedOver, WhatPeopleAreToldArrivesAsItWasSaid) {
  const auto arrived = toldResultFrom(resultBytes());

  ASSERT_TRUE(arrived);
  EXPECT_EQ(arrived->warnings, (std::vector<std::string>{"A warning"}));
  EXPECT_EQ(arrived->error, "An error");
  EXPECT_EQ(arrived->result, "A result\n");
}

TEST(HandedOver, WhatPeopleAreToldThatIsNotWholeIsNone) {
  EXPECT_FALSE(takesOthersThan(
      resultBytes(), [](std::string_view bytes) { return toldResultFrom(bytes).has_value(); }));
}

TEST(HandedOver, WhyAReportCouldNotBeWrittenArrivesAndNothingStandsForNoError) {
  const auto arrived = writingFrom(bytesOfWriting(ProgramError{ExitStatus::CannotCreate, "Full"}));

  ASSERT_FALSE(arrived);
  EXPECT_EQ(arrived.error().exitStatus, ExitStatus::CannotCreate);
  EXPECT_EQ(arrived.error().message, "Full");
  EXPECT_TRUE(writingFrom(bytesOfWriting({})));
}

}  // namespace
}  // namespace accounts
