#include "platform/linux/UserLanguages.h"

#include <algorithm>

namespace accounts {
namespace {

constexpr const char* kLocaleVariables[] = {"LC_ALL", "LC_MESSAGES", "LANG"};
constexpr std::string_view kLocalesWithoutLanguage[] = {"", "C", "POSIX"};

// The name becomes a part of a path, so nothing else may pass.
bool isLanguageCharacter(char character) {
  return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
         (character >= '0' && character <= '9') || character == '_' || character == '-';
}

bool namesLanguage(std::string_view name) {
  return std::ranges::find(kLocalesWithoutLanguage, name) == std::end(kLocalesWithoutLanguage) &&
         std::ranges::all_of(name, isLanguageCharacter);
}

void appendOnce(std::vector<std::string>& languages, std::string_view language) {
  if (std::ranges::find(languages, language) == languages.end()) {
    languages.emplace_back(language);
  }
}

}  // namespace

std::vector<std::string> languagesForLocale(std::string_view locale) {
  std::vector<std::string> languages;
  const std::string_view name = locale.substr(0, locale.find_first_of(".@"));
  if (namesLanguage(name)) {
    appendOnce(languages, name);
    appendOnce(languages, name.substr(0, name.find('_')));
  }
  appendOnce(languages, kFallbackLanguage);
  return languages;
}

std::vector<std::string> userLanguages(const EnvironmentLookup& environment) {
  for (const char* variable : kLocaleVariables) {
    const char* locale = environment(variable);
    if (locale != nullptr && *locale != '\0') {
      return languagesForLocale(locale);
    }
  }
  return languagesForLocale("");
}

}  // namespace accounts
