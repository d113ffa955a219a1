#include "migrator/CalDAVEndpoints.h"

#include <algorithm>
#include <utility>

namespace accounts {

namespace {

bool contains(const std::vector<std::string>& texts, const std::optional<Text>& text) {
  return text && std::ranges::find(texts, text->view()) != texts.end();
}

}  // namespace

bool calDAVMatches(const CalDAVEndpoint& endpoint, const ExpectedCalDAV& expected) {
  return endpoint.server && expected.host && endpoint.server->view() == *expected.host &&
         contains(expected.logins, endpoint.login) &&
         contains(expected.principalPaths, endpoint.principalPath);
}

CalDAVIndex::CalDAVIndex(std::vector<CalDAVEndpoint> endpoints) : endpoints_(std::move(endpoints)) {
  for (const CalDAVEndpoint& endpoint : endpoints_) {
    if (const std::optional<Key> key = keyOf(endpoint)) {
      timesMatched_.try_emplace(*key, 0);
    }
  }
}

bool CalDAVIndex::countMatches(const ExpectedCalDAV& expected) {
  if (!expected.host) {
    return false;
  }
  bool found = false;
  for (const std::string& login : expected.logins) {
    for (const std::string& path : expected.principalPaths) {
      const auto place = timesMatched_.find(Key{*expected.host, login, path});
      if (place != timesMatched_.end()) {
        ++place->second;
        found = true;
      }
    }
  }
  return found;
}

std::size_t CalDAVIndex::timesMatched(std::size_t position) const {
  const std::optional<Key> key = keyOf(endpoints_.at(position));
  return key ? timesMatched_.at(*key) : 0;
}

std::optional<CalDAVIndex::Key> CalDAVIndex::keyOf(const CalDAVEndpoint& endpoint) {
  if (!endpoint.server || !endpoint.login || !endpoint.principalPath) {
    return std::nullopt;
  }
  return Key{*endpoint.server, *endpoint.login, *endpoint.principalPath};
}

}  // namespace accounts
