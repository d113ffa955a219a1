#pragma once

#include <array>
#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/value/Text.h"

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

/// Endpoints, to be matched against expectations: an endpoint matches when its server is the host,
/// its login one of the logins and its path one of the paths, all exactly. Linear for many of both,
/// because an expectation is looked up by its few combinations instead of being compared with each
/// endpoint.
class CalDAVIndex {
 public:
  explicit CalDAVIndex(std::vector<CalDAVEndpoint> endpoints);

  /// The endpoints that an expectation matches, each once: their positions, ascending, in the list
  /// that the index was made from. Linear in their number.
  [[nodiscard]] std::vector<std::size_t> matches(const ExpectedCalDAV& expected) const;

 private:
  /// Server, login and path, as views of the endpoints' texts.
  using Key = std::array<std::string_view, 3>;
  static std::optional<Key> keyOf(const CalDAVEndpoint& endpoint);

  std::vector<CalDAVEndpoint> endpoints_;
  /// For each place that an endpoint names, the endpoints that name it, ascending.
  std::map<Key, std::vector<std::size_t>> positions_;
};

}  // namespace accounts
