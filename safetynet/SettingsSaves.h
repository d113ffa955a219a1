#pragma once

#include <cstdint>

namespace accounts {

/// What became of the newest save of the settings file that the plug-in ran.
enum class LastSave : std::uint8_t {
  /// It ran none.
  None,
  Failed,
  Written
};

/// What the plug-in did to the settings file.
struct SettingsSaves {
  LastSave last = LastSave::None;
  /// Whether any save went as far as replacing the file.
  bool replacedFile = false;
};

}  // namespace accounts
