#pragma once

#include <cstdint>
#include <string_view>

namespace accounts {

/// Which account is meant in what a migration tells of: one of an input file by its place, one that
/// the migration made by a number.
struct AccountOrigin {
  enum class Kind : std::uint8_t { Made, Settings, OutgoingMail, IncomingMail, Exchange };
  Kind kind = Kind::Made;
  /// The index in the file's array, or the number of a made account; 0 for a made one that nothing
  /// else is told of.
  std::uint32_t number = 0;
  bool operator==(const AccountOrigin&) const = default;
  /// Both in one number, to look an account up by.
  [[nodiscard]] std::uint64_t key() const {
    return (static_cast<std::uint64_t>(kind) << 32U) | number;
  }
};

/// What becomes of a top-level account or a legacy description, as far as it does not simply end up
/// among the accounts that are saved. What is told first may be overtaken by what comes later.
enum class ToldFate : std::uint8_t {
  /// Loading or conversion did not take it.
  Refused,
  /// Another description of its store was refused.
  OutWithItsStore,
  /// All accounts of its type were replaced by others.
  RemovedByReplacement,
  RemovedByDeletion,
  /// Another one with its identifier took its place.
  Overwritten,
  /// Another one is to stand for it, too; it may have several such.
  Joined,
  /// It became a child of another one.
  MovedBelow
};

struct AccountEvent {
  AccountOrigin account;
  ToldFate fate = ToldFate::Refused;
  /// The other one, where the fate has one.
  AccountOrigin other = {};
  /// Why, as a clause such as "it has no class"; empty where the fate says it all.
  std::string_view reason = {};
};

}  // namespace accounts
