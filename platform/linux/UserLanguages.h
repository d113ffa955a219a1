#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace accounts {

/// The language whose texts stand in for missing ones.
inline constexpr std::string_view kFallbackLanguage = "en";

/// The value of an environment variable, null when it is not set.
using EnvironmentLookup = std::function<const char*(const char* variable)>;

/// The languages to look for, the best first, for a locale's name: "de_DE.UTF-8" gives "de_DE",
/// "de" and the fallback. Encoding and modifier do not matter; a name that is none for a language
/// ("C", "POSIX", a path) gives the fallback alone.
std::vector<std::string> languagesForLocale(std::string_view locale);

/// The languages of the user's locale for messages: of LC_ALL, LC_MESSAGES and LANG the first one
/// that is set and not empty.
std::vector<std::string> userLanguages(const EnvironmentLookup& environment);

}  // namespace accounts
