#include "inspection/DifferenceJSON.h"

#include <utility>

namespace accounts {
namespace {

JSON objectFor(const PropertyChange& change) {
  JSON object = {{"path", change.path}};
  if (change.before) {
    object["before"] = jsonOf(*change.before);
  }
  if (change.after) {
    object["after"] = jsonOf(*change.after);
  }
  return object;
}

JSON objectsFor(const std::vector<PropertyChange>& changes) {
  JSON list = JSON::array();
  for (const PropertyChange& change : changes) {
    list.push_back(objectFor(change));
  }
  return list;
}

JSON placeOf(const std::optional<ListedAccount>& account) {
  if (!account) {
    return nullptr;
  }
  return {{"place", account->place}, {"parent", textOrNull(account->parentIdentifier)}};
}

std::string_view nameOf(const AccountChange& change) {
  if (!change.before) {
    return "added";
  }
  if (!change.after) {
    return "removed";
  }
  return change.hasMoved ? "moved" : "changed";
}

JSON objectFor(const AccountChange& change, const StoreLayout& layout) {
  const ListedAccount& account = change.after ? *change.after : *change.before;
  return {{"change", nameOf(change)},          {"identifier", textOrNull(account.identifier)},
          {"title", titleOf(account, layout)}, {"before", placeOf(change.before)},
          {"after", placeOf(change.after)},    {"properties", objectsFor(change.properties)}};
}

}  // namespace

JSON differenceObject(const StoreDifference& difference, const StoreLayout& layout) {
  JSON list = JSON::array();
  for (const AccountChange& change : difference.accounts) {
    list.push_back(objectFor(change, layout));
  }
  return {{"properties", objectsFor(difference.properties)},
          {"accounts", std::move(list)},
          {"otherOrder", difference.hasOtherOrder}};
}

}  // namespace accounts
