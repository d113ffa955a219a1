#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/PathFailure.h"

namespace accounts {

/// The number that a user or group database in the format of /etc/passwd and /etc/group gives for a
/// name; of several lines for a name the first usable one holds. None when there is none.
std::optional<std::uint32_t> identifierInDatabase(std::string_view database, std::string_view name);

/// Turns the account names of users and groups into the numbers that files carry: by the running
/// system's name service when the device root is "/", otherwise by the root's own /etc/passwd and
/// /etc/group. A number that was found is kept: the databases are asked for each name once, however
/// many files are given away. `root` must outlive this.
class OwnerNames {
 public:
  explicit OwnerNames(const DeviceRoot& root) : root_(root) {}

  /// Opens now whatever tells of `name`, so that nothing needs to be opened to look it up; no other
  /// name is known afterwards. The root's databases are read, but not looked into.
  void readAhead(const std::string& name);

  /// The number of a user or group; a failure when the device does not know the name.
  [[nodiscard]] OrFailure<std::uint32_t> userIdentifier(const std::string& name);
  [[nodiscard]] OrFailure<std::uint32_t> groupIdentifier(const std::string& name);

 private:
  using Found = std::map<std::string, std::uint32_t>;
  template <class Entry, class LookUp, class Number>
  [[nodiscard]] OrFailure<std::uint32_t> askIfPossible(LookUp lookUp, Number Entry::*number,
                                                       std::string_view database,
                                                       const std::string& name) const;
  template <class LookUp>
  static OrFailure<std::uint32_t> rememberedOr(const LookUp& lookUp, const std::string& name,
                                               Found& found);
  [[nodiscard]] OrFailure<std::uint32_t> numberInDatabase(std::string_view databasePath,
                                                          const std::string& name) const;

  /// The bytes of a database, read ahead or now.
  [[nodiscard]] OrFailure<std::string> databaseAt(std::string_view path) const;

  const DeviceRoot& root_;
  /// Whether the running system's name service has been asked for the last time.
  bool isNameServiceAsked_ = false;
  /// Of a root that is not "/", by path, once they are read ahead.
  std::map<std::string, OrFailure<std::string>, std::less<>> databases_;
  Found users_;
  Found groups_;
};

}  // namespace accounts
