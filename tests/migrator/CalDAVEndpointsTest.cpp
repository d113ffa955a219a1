#include "migrator/CalDAVEndpoints.h"

#include <gtest/gtest.h>

#include <array>

namespace accounts {
namespace {

const CalDAVEndpoint jdoesCalendar = {
    .server = "dav.example", .login = "jdoe", .principalPath = "/jdoe"};
const ExpectedCalDAV jdoe = {.host = "dav.example",
                             .logins = {"jdoe@example", "jdoe"},
                             .principalPaths = {"/jdoe%40example", "/jdoe"}};

TEST(CalDAVMatchTest, ServerLoginAndPathMustBeAsExpected) {
  EXPECT_TRUE(calDAVMatches(jdoesCalendar, jdoe));
}

TEST(CalDAVMatchTest, LoginAndPathMayBeOfDifferentForms) {
  CalDAVEndpoint endpoint = jdoesCalendar;
  endpoint.login = "jdoe@example";

  EXPECT_TRUE(calDAVMatches(endpoint, jdoe));
}

TEST(CalDAVMatchTest, AnyPartThatDiffersIsNoMatch) {
  CalDAVEndpoint endpoint = jdoesCalendar;
  endpoint.server = "Dav.example";
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));

  endpoint = jdoesCalendar;
  endpoint.login = "Jdoe";
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));

  endpoint = jdoesCalendar;
  endpoint.principalPath = "/jdoe/";
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));
}

TEST(CalDAVMatchTest, AMissingPartIsNoMatch) {
  CalDAVEndpoint endpoint = jdoesCalendar;
  endpoint.server.reset();
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));

  endpoint = jdoesCalendar;
  endpoint.login.reset();
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));

  endpoint = jdoesCalendar;
  endpoint.principalPath.reset();
  EXPECT_FALSE(calDAVMatches(endpoint, jdoe));
}

TEST(CalDAVMatchTest, WithoutExpectationsNothingMatches) {
  EXPECT_FALSE(calDAVMatches(jdoesCalendar, ExpectedCalDAV()));
  EXPECT_FALSE(calDAVMatches(CalDAVEndpoint(), ExpectedCalDAV()));
}

// The index against the rule: every endpoint and every expectation that a small alphabet allows.

const std::array<std::optional<Text>, 4> parts = {std::nullopt, Text(""), Text("a"), Text("b")};

std::vector<CalDAVEndpoint> allEndpoints() {
  std::vector<CalDAVEndpoint> endpoints;
  for (const auto& server : parts) {
    for (const auto& login : parts) {
      for (const auto& path : parts) {
        endpoints.push_back({.server = server, .login = login, .principalPath = path});
      }
    }
  }
  return endpoints;
}

std::vector<ExpectedCalDAV> allExpectations() {
  const std::vector<std::vector<std::string>> lists = {
      {}, {""}, {"a"}, {"b"}, {"", "a"}, {"a", ""}, {"a", "b"}, {"b", "a"}, {"a", "c"}};
  const std::vector<std::optional<std::string>> hosts = {std::nullopt, "", "a", "b", "c"};
  std::vector<ExpectedCalDAV> expectations;
  for (const auto& host : hosts) {
    for (const auto& logins : lists) {
      for (const auto& paths : lists) {
        expectations.push_back({.host = host, .logins = logins, .principalPaths = paths});
      }
    }
  }
  return expectations;
}

TEST(CalDAVIndexTest, EveryExpectationFindsWhatAComparisonOfAllPairsFinds) {
  const std::vector<CalDAVEndpoint> endpoints = allEndpoints();
  for (const ExpectedCalDAV& expected : allExpectations()) {
    CalDAVIndex index(endpoints);
    bool anyMatches = false;
    const bool found = index.countMatches(expected);
    for (std::size_t position = 0; position < endpoints.size(); ++position) {
      const bool matches = calDAVMatches(endpoints[position], expected);
      anyMatches = anyMatches || matches;
      ASSERT_EQ(index.timesMatched(position), matches ? 1u : 0u);
    }
    ASSERT_EQ(found, anyMatches);
  }
}

TEST(CalDAVIndexTest, CountsAddUpOverManyExpectations) {
  const std::vector<CalDAVEndpoint> endpoints = allEndpoints();
  const std::vector<ExpectedCalDAV> expectations = allExpectations();
  CalDAVIndex index(endpoints);
  for (const ExpectedCalDAV& expected : expectations) {
    index.countMatches(expected);
  }
  for (std::size_t position = 0; position < endpoints.size(); ++position) {
    std::size_t matches = 0;
    for (const ExpectedCalDAV& expected : expectations) {
      matches += calDAVMatches(endpoints[position], expected) ? 1 : 0;
    }
    ASSERT_EQ(index.timesMatched(position), matches);
  }
}

TEST(CalDAVIndexTest, EqualEndpointsAreAllMatched) {
  CalDAVIndex index({jdoesCalendar, CalDAVEndpoint(), jdoesCalendar});

  EXPECT_TRUE(index.countMatches(jdoe));

  EXPECT_EQ(index.timesMatched(0), 1u);
  EXPECT_EQ(index.timesMatched(1), 0u);
  EXPECT_EQ(index.timesMatched(2), 1u);
}

}  // namespace
}  // namespace accounts
