#pragma once

#include <optional>
#include <string_view>

#include "platform/AccountFramework.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

// Keys of a creator entry in the account-creation map, and of its description.
inline constexpr std::string_view kCreatorTypeKey = "Type";
inline constexpr std::string_view kCreatorDescriptionKey = "Description";
inline constexpr std::string_view kCreatorFrameworkKey = "Framework";
inline constexpr std::string_view kCreatorClassKey = "Class";

/// The creator entries of an account type in the account-creation map. No type and a type without
/// an entry are fatal assertions in the given operation and source file.
PropertyArray creatorEntriesForType(const std::optional<Text>& type, std::string_view operation,
                                    std::string_view sourceFile);

/// Loads the framework at a path beneath the system root, so that the class of a creator or
/// notifier can be found by name. A framework that cannot be loaded is a fatal assertion in the
/// given operation and source file.
void loadCreatorFramework(std::string_view relativePath, std::string_view operation,
                          std::string_view sourceFile);

/// Ends the process by a fatal assertion that says what a class of a framework threw, in the words
/// of the exception that is being handled. Want of memory goes on to where it is dealt with.
[[noreturn]] void failOnException(const std::optional<Text>& className, std::string_view operation,
                                  std::string_view sourceFile);

/// What a class of a framework answers to a call. An exception never leaves its framework.
template <class Call>
auto answerOf(const std::optional<Text>& className, std::string_view operation,
              std::string_view sourceFile, const Call& call) {
  try {
    return call();
  } catch (...) {
    failOnException(className, operation, sourceFile);
  }
}

/// The class of a creator or notifier that the loaded frameworks, or the system itself, made known
/// under a name; null for none.
const AccountClass* creatorClassNamed(std::string_view name);

}  // namespace accounts
