#pragma once

#include <optional>
#include <set>
#include <string>
#include <string_view>

#include "propertylist/value/PropertyValue.h"
#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// The dictionary that a property list's bytes stand for; none for other bytes.
std::optional<PropertyDictionary> dictionaryIn(const std::string& bytes);

/// The bytes of a property list.
std::string propertyListOf(const PropertyDictionary& dictionary);

/// The identifiers of all accounts in a settings file or legacy store, at any depth; of no bytes,
/// or of bytes that stand for nothing, none.
std::set<std::string> identifiersOf(const std::optional<std::string>& bytes);

/// Whether two top-level accounts of a settings file have one identifier.
bool hasDuplicates(const PropertyDictionary& settings);

/// A settings file with one more account, as a program of the device writes it that has read the
/// bytes of the file before: a new one of the current version where these stand for nothing.
std::string withFurtherAccount(const std::optional<std::string>& settings,
                               std::string_view identifier);

/// The texts in all property lists on a disk.
std::set<std::string> textsOn(const SimulatedDisk& disk);

/// Those that are in both.
std::set<std::string> intersection(const std::set<std::string>& one,
                                   const std::set<std::string>& other);

/// Whether a path names a temporary file of a migration.
bool isTemporary(std::string_view path);

/// The paths of all temporary files on a disk.
std::vector<std::string> temporaryFiles(const SimulatedDisk& disk);

}  // namespace accounts
