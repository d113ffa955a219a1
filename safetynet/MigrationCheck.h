#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "platform/PropertyLists.h"
#include "safetynet/AccountFiles.h"
#include "safetynet/SettingsSaves.h"

namespace accounts {

/// Why the settings file is not what a migration leaves, as a clause such as "the settings file was
/// not written"; none when it is: the last save, if there was one, was written, and the file is a
/// property list of the current version.
std::optional<std::string> whyNotMigrated(PropertyLists& propertyLists, const std::string& settings,
                                          LastSave lastSave);

/// Reads an input, by its path, as it was before the migration; none when it is no property list.
using ReadInput = std::function<std::optional<PropertyDictionary>(const std::string& path)>;

/// What a verified migration may not have carried over, one sentence each without a full stop, in
/// order: an input that is no property list; a legacy store with an account that is not in the
/// settings file; a settings file that had accounts and has none of them. `inputs` are the paths of
/// those that there were, in the order of AccountFiles. None of these is an error of the migration,
/// whose rules drop what they cannot read.
std::vector<std::string> whatMayBeMissing(PropertyLists& propertyLists, const AccountFiles& files,
                                          const std::vector<std::string>& inputs,
                                          const ReadInput& readInput);

}  // namespace accounts
