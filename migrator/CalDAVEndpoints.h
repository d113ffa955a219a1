#pragma once

#include <array>
#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/Text.h"

namespace accounts {

/// Where a stand-alone CalDAV account keeps its calendars; a part that the account lacks is none.
struct CalDAVEndpoint {
  std::optional<Text> server;
  std::optional<Text> login;
  std::optional<Text> principalPath;
};

/// Where a mail account's calendars are expected: at its service's host, under one of these logins
/// and one of these paths, in any combination. Logins differ from each other, as do paths.
struct ExpectedCalDAV {
  std::optional<std::string> host;
  std::vector<std::string> logins;
  std::vector<std::string> principalPaths;
};

/// Whether an endpoint is where calendars are expected. All parts are compared exactly.
bool calDAVMatches(const CalDAVEndpoint& endpoint, const ExpectedCalDAV& expected);

/// Many endpoints, to be matched against many expectations in linear time: an expectation is looked
/// up by its few combinations instead of being compared with each endpoint. The outcome is that of
/// calDAVMatches() for every pair.
class CalDAVIndex {
 public:
  explicit CalDAVIndex(std::vector<CalDAVEndpoint> endpoints);

  /// Matches an expectation against all endpoints and counts the match for each that it matches.
  /// True when there is one.
  bool countMatches(const ExpectedCalDAV& expected);
  /// How many of the expectations so far matched the endpoint at a position of the list that the
  /// index was made from.
  [[nodiscard]] std::size_t timesMatched(std::size_t position) const;

 private:
  /// Server, login and path, as views of the endpoints' texts.
  using Key = std::array<std::string_view, 3>;
  static std::optional<Key> keyOf(const CalDAVEndpoint& endpoint);

  std::vector<CalDAVEndpoint> endpoints_;
  /// For each place that an endpoint names, how many expectations matched it.
  std::map<Key, std::size_t> timesMatched_;
};

}  // namespace accounts
