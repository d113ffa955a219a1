#include "migrator/CalDAVEndpoints.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>

namespace accounts {
namespace {

const CalDAVEndpoint jdoesCalendar = {
    .server = "dav.example", .login = "jdoe", .principalPath = "/jdoe"};
const ExpectedCalDAV jdoe = {.host = "dav.example",
                             .logins = {"jdoe@example", "jdoe"},
                             .principalPaths = {"/jdoe%40example", "/jdoe"}};

// The index against the rule, pair by pair: every endpoint and every expectation that a small
// alphabet allows.

bool contains(const std::vector<std::string>& texts, const std::optional<Text>& text) {
  return text && std::ranges::find(texts, text->view()) != texts.end();
}

bool areMatching(const CalDAVEndpoint& endpoint, const ExpectedCalDAV& expected) {
  return endpoint.server && expected.host && endpoint.server->view() == *expected.host &&
         contains(expected.logins, endpoint.login) &&
         contains(expected.principalPaths, endpoint.principalPath);
}

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

TEST(CalDAVIndexTest, EveryExpectationFindsWhatAComparisonOfAllPairsFindsInOrder) {
  const std::vector<CalDAVEndpoint> endpoints = allEndpoints();
  const CalDAVIndex index(endpoints);
  for (const ExpectedCalDAV& expected : allExpectations()) {
    std::vector<std::size_t> positions;
    for (std::size_t position = 0; position < endpoints.size(); ++position) {
      if (areMatching(endpoints[position], expected)) {
        positions.push_back(position);
      }
    }
    ASSERT_EQ(index.matches(expected), positions);
  }
}

TEST(CalDAVIndexTest, EqualEndpointsAreAllFound) {
  const CalDAVIndex index({jdoesCalendar, CalDAVEndpoint(), jdoesCalendar});

  EXPECT_EQ(index.matches(jdoe), (std::vector<std::size_t>{0, 2}));
}

}  // namespace
}  // namespace accounts
