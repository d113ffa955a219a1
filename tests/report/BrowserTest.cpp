#include "tests/report/Browser.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

TEST(BrowserTest, WhatGoesWrongOnAPageIsSeen) {
  const Visit visit = visitPage(R"(<!DOCTYPE html>
    <meta http-equiv="Content-Security-Policy" content="default-src 'none'; script-src 'unsafe-inline'">
    <img src="picture.png">
    <script>console.error("a complaint"); undefinedFunction();</script>)",
                                "");

  EXPECT_THAT(visit.consoleLines, Contains(HasSubstr("a complaint")));
  EXPECT_THAT(visit.consoleLines, Contains(HasSubstr("undefinedFunction is not defined")));
  EXPECT_THAT(visit.consoleLines, Contains(HasSubstr("Content Security Policy")));
}

TEST(BrowserTest, NothingGoesWrongOnAReport) {
  const Visit visit = visitPage(pageOf(sampleReport()), R"js(
    one("#expand").click();
    await pause();
    note("open", all("details").every((part) => part.open));
  )js");

  EXPECT_EQ(visit.noted["open"], true);
  EXPECT_THAT(visit.consoleLines, IsEmpty());
}

}  // namespace
}  // namespace accounts
