#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/DeviceRoot.h"
#include "platform/linux/PathError.h"

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

  /// The number of a user or group; none, with `error` set, when the device does not know the name.
  [[nodiscard]] std::optional<std::uint32_t> userIdentifier(const std::string& name,
                                                            PathError& error);
  [[nodiscard]] std::optional<std::uint32_t> groupIdentifier(const std::string& name,
                                                             PathError& error);

 private:
  using Found = std::map<std::string, std::uint32_t>;
  template <class LookUp>
  static std::optional<std::uint32_t> rememberedOr(const LookUp& lookUp, const std::string& name,
                                                   Found& found);
  [[nodiscard]] std::optional<std::uint32_t> lookUp(std::string_view databasePath,
                                                    const std::string& name,
                                                    PathError& error) const;

  const DeviceRoot& root_;
  Found users_;
  Found groups_;
};

}  // namespace accounts
