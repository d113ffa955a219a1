#include "accountsctl/FleetSummary.h"

#include <gtest/gtest.h>

namespace accounts {
namespace {

using Roots = std::vector<std::string>;

std::string line(const std::string& root, int exitStatus, const std::string& more = "") {
  return R"({"root":")" + root + R"(","exitStatus":)" + std::to_string(exitStatus) + more + "}";
}

FleetSummary summaryOf(const std::vector<std::string>& lines) {
  FleetSummary summary;
  for (const std::string& each : lines) {
    summary.addLine(each);
  }
  return summary;
}

TEST(FleetSummary, ImagesAreCountedByExitStatus) {
  const FleetSummary summary = summaryOf({line("/a", 0), line("/b", 75), line("/c", 0)});
  EXPECT_EQ(summary.imageCount(), 3U);
  EXPECT_EQ(summary.exitStatuses(), (Counts<int>{{0, 2}, {75, 1}}));
}

TEST(FleetSummary, AnImageCountsWithItsLastResultAlone) {
  const FleetSummary summary = summaryOf({line("/a", 75, R"(,"error":"No space")"), line("/a", 0)});
  EXPECT_EQ(summary.imageCount(), 1U);
  EXPECT_EQ(summary.exitStatuses(), (Counts<int>{{0, 1}}));
  EXPECT_EQ(summary.errors(), Counts<std::string>{});
  EXPECT_EQ(summary.replacedCount(), 1U);
}

TEST(FleetSummary, AResultWithoutARootReplacesNone) {
  const std::string usage = R"({"root":null,"exitStatus":64,"error":"Unknown option"})";
  const FleetSummary summary = summaryOf({usage, usage});
  EXPECT_EQ(summary.imageCount(), 2U);
  EXPECT_EQ(summary.rootsWith(Remedy::Attention), Roots{});
}

TEST(FleetSummary, OnlyWhatMayPassIsToRetry) {
  std::vector<std::string> lines;
  for (const int exitStatus : {0, 1, 2, 64, 65, 66, 70, 73, 74, 75, 99}) {
    lines.push_back(line("/" + std::to_string(exitStatus), exitStatus));
  }
  const FleetSummary summary = summaryOf(lines);
  EXPECT_EQ(summary.rootsWith(Remedy::Retry), Roots{"/75"});
  EXPECT_EQ(summary.rootsWith(Remedy::None), Roots{"/0"});
  EXPECT_EQ(summary.countOf(Remedy::Attention), 9U);
}

TEST(FleetSummary, RootsAreInTheOrderOfTheirFirstResults) {
  const FleetSummary summary =
      summaryOf({line("/b", 75), line("/a", 75), line("/c", 0), line("/b", 75)});
  EXPECT_EQ(summary.rootsWith(Remedy::Retry), (Roots{"/b", "/a"}));
}

TEST(FleetSummary, AnErrorOfManyImagesIsOneError) {
  const FleetSummary summary =
      summaryOf({line("/i/1", 66, R"(,"error":"Cannot open /i/1: No such file")"),
                 line("/i/2", 66, R"(,"error":"Cannot open /i/2: No such file")"),
                 line("/i/3", 70, R"(,"error":"The plug-in ended")")});
  EXPECT_EQ(summary.errors(),
            (Counts<std::string>{{"Cannot open ROOT: No such file", 2}, {"The plug-in ended", 1}}));
}

TEST(FleetSummary, TheRootOfARunningDeviceIsNotTakenForEverySlash) {
  const FleetSummary summary = summaryOf({line("/", 66, R"(,"error":"Cannot open /etc/x")")});
  EXPECT_EQ(summary.errors(), (Counts<std::string>{{"Cannot open /etc/x", 1}}));
}

TEST(FleetSummary, StepsAreCountedTheMostFrequentFirst) {
  const FleetSummary summary = summaryOf({line("/a", 0, R"(,"steps":["upgrade","save"])"),
                                          line("/b", 0), line("/c", 0, R"(,"steps":["save"])")});
  EXPECT_EQ(summary.steps(), (Counts<std::string>{{"save", 2}, {"upgrade", 1}}));
}

TEST(FleetSummary, WarningsCountOnlyWhereTheImageIsMigrated) {
  const FleetSummary summary =
      summaryOf({line("/a", 0, R"(,"warnings":["Kept"])"), line("/b", 1, R"(,"warnings":["Kept"])"),
                 line("/c", 0, R"(,"warnings":[])")});
  EXPECT_EQ(summary.warningCount(), 1U);
}

TEST(FleetSummary, WhatIsNoResultIsCountedAsALine) {
  const FleetSummary summary =
      summaryOf({R"({"root":"/a","exitSta)", "[]", "text", R"({"exitStatus":0})",
                 R"({"root":"/a"})", R"({"root":"/a","exitStatus":"0"})", ""});
  EXPECT_EQ(summary.unreadableLineCount(), 6U);
  EXPECT_EQ(summary.imageCount(), 0U);
}

TEST(FleetSummary, ANumberThatNoProcessEndsWithIsNoExitStatus) {
  // Cut to 32 bits, the last one would be a success.
  const FleetSummary summary =
      summaryOf({R"({"root":"/a","exitStatus":-1})", R"({"root":"/b","exitStatus":256})",
                 R"({"root":"/c","exitStatus":4294967296})"});
  EXPECT_EQ(summary.unreadableLineCount(), 3U);
  EXPECT_EQ(summary.imageCount(), 0U);
}

TEST(FleetSummary, ProgressSaysHowManyOfHowMany) {
  const FleetSummary summary = summaryOf({line("/a", 0), line("/b", 75), line("/c", 70)});
  EXPECT_EQ(progressText(summary, 5), "3 of 5 images: 1 migrated, 1 to retry, 1 for a person");
  EXPECT_EQ(progressText(summary, std::nullopt),
            "3 images: 1 migrated, 1 to retry, 1 for a person");
}

}  // namespace
}  // namespace accounts
