#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// What becomes of what a finding is about.
enum class Effect : std::uint8_t {
  /// Loading leaves it out, and the next save removes it from the file.
  Dropped,
  /// Loading changes it, and the next save writes the change.
  Repaired,
  /// It stays in the file but counts for nothing.
  Ignored,
  /// It cannot be converted, and so none of its legacy store is carried over.
  Refused,
  /// It is as it should not be, or soon will not be, and is left as it is.
  Noted
};

std::string_view nameOf(Effect effect);

/// Something in a file that does not come through as it stands.
struct Finding {
  Effect effect = Effect::Noted;
  /// One word for programs, such as "unknownType".
  std::string_view code;
  /// Of an account, "3" or "3.1" for a child; empty for the file as a whole.
  std::string place = {};
  /// Of an account.
  std::string title = {};
  std::optional<Text> identifier = {};
  /// What it is and why, in words for people.
  std::string text = {};
};

}  // namespace accounts
