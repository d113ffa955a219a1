#pragma once

#include <optional>
#include <string>
#include <vector>

#include "transaction/Transaction.h"

namespace accounts {

/// Whether a settings file is there, can be read and has the current version.
bool isMigrated(const std::optional<PropertyDictionary>& settings);

/// The identifiers of accounts that one settings file has and another one had not, no more than
/// `most`; the device's own account, which any program may make, is not among them.
std::vector<std::string> accountsBrought(const std::optional<PropertyDictionary>& before,
                                         const std::optional<PropertyDictionary>& after,
                                         std::size_t most);
/// Whether a settings file has an account with any of these identifiers.
bool hasAnyAccount(const std::optional<PropertyDictionary>& settings,
                   const std::vector<std::string>& identifiers);

/// Why the settings file in memory is not what a migration leaves, as a clause such as "the
/// settings file was not written"; none when it is: the last save, if there was one, was written,
/// and the file is a property list of the current version.
std::optional<std::string> whyNotMigrated(Transaction& transaction);

}  // namespace accounts
