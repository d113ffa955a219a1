#include "platform/linux/OwnerNames.h"

#include <grp.h>
#include <pwd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <limits>
#include <vector>

namespace accounts {
namespace {

constexpr std::string_view kUserDatabase = "/etc/passwd";
constexpr std::string_view kGroupDatabase = "/etc/group";

// The largest number means "leave as it is" to chown, so that no user or group can have it.
constexpr std::uint32_t kNoIdentifier = std::numeric_limits<std::uint32_t>::max();

// Larger than any entry that a person maintains; a group's entry lists its members.
constexpr std::size_t kFirstBufferSize = 4096;
constexpr std::size_t kLargestBufferSize = std::size_t{16} << 20;

std::string_view takeUpTo(std::string_view& rest, char separator) {
  const std::string_view taken = rest.substr(0, rest.find(separator));
  rest.remove_prefix(std::min(rest.size(), taken.size() + 1));
  return taken;
}

std::optional<std::uint32_t> parseIdentifier(std::string_view text) {
  std::uint32_t number = 0;
  const char* end = text.data() + text.size();
  const auto result = std::from_chars(text.data(), end, number);
  if (result.ec != std::errc() || result.ptr != end || number == kNoIdentifier) {
    return std::nullopt;
  }
  return number;
}

Failure unknownName(std::string_view database, std::string_view name) {
  return pathFailure(std::string("find \"").append(name).append("\" in"), database,
                     "There is no usable entry");
}

// Asks one of the C library's two lookups, which share their shape, with a buffer that grows until
// the entry fits.
template <class Entry, class LookUp, class Number>
std::optional<std::uint32_t> askNameService(LookUp lookUp, Number Entry::*number,
                                            std::string_view database, const std::string& name,
                                            Failure& error) {
  for (std::size_t size = kFirstBufferSize; size <= kLargestBufferSize; size *= 2) {
    std::vector<char> buffer(size);
    Entry entry = {};
    Entry* found = nullptr;
    const int failure = lookUp(name.c_str(), &entry, buffer.data(), buffer.size(), &found);
    if (failure == ERANGE) {
      continue;
    }
    if (found == nullptr) {
      error = unknownName(database, name);
      return std::nullopt;
    }
    return entry.*number;
  }
  error = pathFailure("read the entry \"" + name + "\" of", database, ERANGE);
  return std::nullopt;
}

}  // namespace

std::optional<std::uint32_t> identifierInDatabase(std::string_view database,
                                                  std::string_view name) {
  while (!name.empty() && !database.empty()) {
    std::string_view line = takeUpTo(database, '\n');
    if (takeUpTo(line, ':') != name) {
      continue;
    }
    takeUpTo(line, ':');  // the password
    if (const auto identifier = parseIdentifier(takeUpTo(line, ':'))) {
      return identifier;
    }
  }
  return std::nullopt;
}

void OwnerNames::readAhead(const std::string& name) {
  if (root_.isSystemRoot()) {
    // The name service keeps no promise of what it opens; its numbers are remembered.
    Failure error;
    static_cast<void>(userIdentifier(name, error));
    static_cast<void>(groupIdentifier(name, error));
    isNameServiceAsked_ = true;
    return;
  }
  for (const std::string_view path : {kUserDatabase, kGroupDatabase}) {
    Database database;
    database.bytes = root_.readFile(path, database.error);
    databases_.insert_or_assign(std::string(path), std::move(database));
  }
}

std::optional<std::string> OwnerNames::databaseAt(std::string_view path, Failure& error) const {
  const auto database = databases_.find(path);
  if (database == databases_.end()) {
    return root_.readFile(path, error);
  }
  if (!database->second.bytes) {
    error = database->second.error;
  }
  return database->second.bytes;
}

std::optional<std::uint32_t> OwnerNames::numberInDatabase(std::string_view databasePath,
                                                          const std::string& name,
                                                          Failure& error) const {
  const auto database = databaseAt(databasePath, error);
  if (!database) {
    return std::nullopt;
  }
  const auto identifier = identifierInDatabase(*database, name);
  if (!identifier) {
    error = unknownName(databasePath, name);
  }
  return identifier;
}

template <class Entry, class LookUp, class Number>
std::optional<std::uint32_t> OwnerNames::askIfPossible(LookUp lookUp, Number Entry::*number,
                                                       std::string_view database,
                                                       const std::string& name,
                                                       Failure& error) const {
  if (isNameServiceAsked_) {
    error = unknownName(database, name);
    return std::nullopt;
  }
  return askNameService<Entry>(lookUp, number, database, name, error);
}

template <class LookUp>
std::optional<std::uint32_t> OwnerNames::rememberedOr(const LookUp& lookUp, const std::string& name,
                                                      Found& found) {
  if (const auto known = found.find(name); known != found.end()) {
    return known->second;
  }
  const std::optional<std::uint32_t> identifier = lookUp();
  if (identifier) {
    found.emplace(name, *identifier);
  }
  return identifier;
}

std::optional<std::uint32_t> OwnerNames::userIdentifier(const std::string& name, Failure& error) {
  const auto lookUpUser = [&] {
    return root_.isSystemRoot()
               ? askIfPossible<passwd>(::getpwnam_r, &passwd::pw_uid, kUserDatabase, name, error)
               : numberInDatabase(kUserDatabase, name, error);
  };
  return rememberedOr(lookUpUser, name, users_);
}

std::optional<std::uint32_t> OwnerNames::groupIdentifier(const std::string& name, Failure& error) {
  const auto lookUpGroup = [&] {
    return root_.isSystemRoot()
               ? askIfPossible<group>(::getgrnam_r, &group::gr_gid, kGroupDatabase, name, error)
               : numberInDatabase(kGroupDatabase, name, error);
  };
  return rememberedOr(lookUpGroup, name, groups_);
}

}  // namespace accounts
