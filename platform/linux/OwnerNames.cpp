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
OrFailure<std::uint32_t> askNameService(LookUp lookUp, Number Entry::*number,
                                        std::string_view database, const std::string& name) {
  for (std::size_t size = kFirstBufferSize; size <= kLargestBufferSize; size *= 2) {
    std::vector<char> buffer(size);
    Entry entry = {};
    Entry* found = nullptr;
    const int failure = lookUp(name.c_str(), &entry, buffer.data(), buffer.size(), &found);
    if (failure == ERANGE) {
      continue;
    }
    if (found == nullptr) {
      return unknownName(database, name);
    }
    return entry.*number;
  }
  return pathFailure("read the entry \"" + name + "\" of", database, ERANGE);
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
    static_cast<void>(userIdentifier(name));
    static_cast<void>(groupIdentifier(name));
    isNameServiceAsked_ = true;
    return;
  }
  for (const std::string_view path : {kUserDatabase, kGroupDatabase}) {
    databases_.insert_or_assign(std::string(path), root_.readFile(path));
  }
}

OrFailure<std::string> OwnerNames::databaseAt(std::string_view path) const {
  const auto database = databases_.find(path);
  return database == databases_.end() ? root_.readFile(path) : database->second;
}

OrFailure<std::uint32_t> OwnerNames::numberInDatabase(std::string_view databasePath,
                                                      const std::string& name) const {
  const auto database = databaseAt(databasePath);
  if (!database) {
    return database.error();
  }
  const auto identifier = identifierInDatabase(*database, name);
  if (!identifier) {
    return unknownName(databasePath, name);
  }
  return *identifier;
}

template <class Entry, class LookUp, class Number>
OrFailure<std::uint32_t> OwnerNames::askIfPossible(LookUp lookUp, Number Entry::*number,
                                                   std::string_view database,
                                                   const std::string& name) const {
  if (isNameServiceAsked_) {
    return unknownName(database, name);
  }
  return askNameService<Entry>(lookUp, number, database, name);
}

template <class LookUp>
OrFailure<std::uint32_t> OwnerNames::rememberedOr(const LookUp& lookUp, const std::string& name,
                                                  Found& found) {
  if (const auto known = found.find(name); known != found.end()) {
    return known->second;
  }
  const OrFailure<std::uint32_t> identifier = lookUp();
  if (identifier) {
    found.emplace(name, *identifier);
  }
  return identifier;
}

OrFailure<std::uint32_t> OwnerNames::userIdentifier(const std::string& name) {
  const auto lookUpUser = [&] {
    return root_.isSystemRoot()
               ? askIfPossible<passwd>(::getpwnam_r, &passwd::pw_uid, kUserDatabase, name)
               : numberInDatabase(kUserDatabase, name);
  };
  return rememberedOr(lookUpUser, name, users_);
}

OrFailure<std::uint32_t> OwnerNames::groupIdentifier(const std::string& name) {
  const auto lookUpGroup = [&] {
    return root_.isSystemRoot()
               ? askIfPossible<group>(::getgrnam_r, &group::gr_gid, kGroupDatabase, name)
               : numberInDatabase(kGroupDatabase, name);
  };
  return rememberedOr(lookUpGroup, name, groups_);
}

}  // namespace accounts
