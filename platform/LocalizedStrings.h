#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// The texts of the plug-in's resources in the user's language.
class LocalizedStrings {
 public:
  virtual ~LocalizedStrings() = default;

  /// The text of a key in a string table. Where the user's language lacks it, English is tried;
  /// where that lacks it too, `defaultValue` is the result, or the key itself when `defaultValue`
  /// is empty.
  virtual std::string localizedString(std::string_view key, std::string_view defaultValue,
                                      std::string_view table) = 0;
};

}  // namespace accounts
