#include "migrator/CalDAVEndpoints.h"

#include <algorithm>
#include <utility>

namespace accounts {

CalDAVIndex::CalDAVIndex(std::vector<CalDAVEndpoint> endpoints) : endpoints_(std::move(endpoints)) {
  for (std::size_t position = 0; position < endpoints_.size(); ++position) {
    if (const std::optional<Key> key = keyOf(endpoints_[position])) {
      positions_[*key].push_back(position);
    }
  }
}

std::vector<std::size_t> CalDAVIndex::matches(const ExpectedCalDAV& expected) const {
  std::vector<std::size_t> found;
  if (!expected.host) {
    return found;
  }
  for (const std::string& login : expected.logins) {
    for (const std::string& path : expected.principalPaths) {
      const auto place = positions_.find(Key{*expected.host, login, path});
      if (place != positions_.end()) {
        const auto foundBefore = static_cast<std::ptrdiff_t>(found.size());
        found.insert(found.end(), place->second.begin(), place->second.end());
        std::inplace_merge(found.begin(), found.begin() + foundBefore, found.end());
      }
    }
  }
  return found;
}

std::optional<CalDAVIndex::Key> CalDAVIndex::keyOf(const CalDAVEndpoint& endpoint) {
  if (!endpoint.server || !endpoint.login || !endpoint.principalPath) {
    return std::nullopt;
  }
  return Key{*endpoint.server, *endpoint.login, *endpoint.principalPath};
}

}  // namespace accounts
