#include "transaction/TransactionFileSystem.h"

#include <cerrno>
#include <cstdlib>
#include <system_error>
#include <utility>

namespace accounts {
namespace {

/// Where temporary files seem to be. No place of a device has such a path.
constexpr std::string_view kTemporaryFiles = "/transaction/";

Result failure(std::string_view operation, std::string_view path, int number) {
  std::string text = "Cannot ";
  return Failure{.text = text.append(operation).append(" ").append(path).append(": ").append(
                     std::generic_category().message(number))};
}

Result resultOf(const std::optional<Failure>& whyNot) {
  return whyNot ? Result(*whyNot) : Result();
}

}  // namespace

DevicePlace TransactionFileSystem::placeOf(std::string_view path) const {
  const std::optional<DevicePlace> place = transaction_.placeOf(path);
  if (!place) {
    foreignPath_(path);
    std::abort();
  }
  return *place;
}

Result TransactionFileSystem::canPut(DevicePlace place) const {
  return resultOf(transaction_.snapshot().at(place).whyNotReplaced);
}

bool TransactionFileSystem::fileExists(std::string_view path) {
  if (temporaryFiles_.contains(path)) {
    return true;
  }
  const DevicePlace place = placeOf(path);
  return transaction_.exists(place) ||
         (place == DevicePlace::InformationDirectory && transaction_.hasInformationDirectory());
}

bool TransactionFileSystem::isDirectory(std::string_view path) {
  const DevicePlace place = placeOf(path);
  return place == DevicePlace::InformationDirectory
             ? transaction_.hasInformationDirectory()
             : std::holds_alternative<Transaction::AsItWas>(transaction_.at(place)) &&
                   transaction_.snapshot().at(place).target == EntryKind::Directory;
}

Result TransactionFileSystem::copyFile(std::string_view source, std::string_view destination) {
  const DevicePlace from = placeOf(source);
  const DevicePlace to = placeOf(destination);
  if (from != DevicePlace::Settings) {
    // Nothing else is ever copied, and whoever commits knows of no other copies.
    return failure("copy", source, EOPNOTSUPP);
  }
  const Transaction::Standing standing = transaction_.at(from);
  if (std::holds_alternative<Transaction::Removed>(standing)) {
    return failure("open", source, ENOENT);
  }
  const bool isAsItWas = std::holds_alternative<Transaction::AsItWas>(standing);
  const PlaceState& original = transaction_.snapshot().at(from);
  if (isAsItWas && original.whyNotRead) {
    return resultOf(original.whyNotRead);
  }
  const bool isTaken = std::holds_alternative<Transaction::AsItWas>(transaction_.at(to))
                           ? transaction_.snapshot().at(to).identity.exists()
                           : transaction_.exists(to);
  if (isTaken) {
    return failure("create", destination, EEXIST);
  }
  Result allowed = canPut(to);
  if (allowed) {
    transaction_.put(to, isAsItWas ? Transaction::Standing(Transaction::Copy{from}) : standing);
  }
  return allowed;
}

Result TransactionFileSystem::removeFile(std::string_view path) {
  if (const auto temporary = temporaryFiles_.find(path); temporary != temporaryFiles_.end()) {
    temporaryFiles_.erase(temporary);
    return {};
  }
  const DevicePlace place = placeOf(path);
  const Transaction::Standing& standing = transaction_.at(place);
  if (std::holds_alternative<Transaction::Removed>(standing)) {
    return failure("remove", path, ENOENT);
  }
  if (std::holds_alternative<Transaction::AsItWas>(standing)) {
    if (const auto& whyNot = transaction_.snapshot().at(place).whyNotRemoved) {
      return resultOf(whyNot);
    }
  }
  transaction_.put(place, Transaction::Removed{});
  return {};
}

Result TransactionFileSystem::createFile(std::string_view path, std::string_view contents) {
  const DevicePlace place = placeOf(path);
  Result allowed = canPut(place);
  if (allowed) {
    transaction_.put(place, Transaction::Text{std::string(contents)});
  }
  return allowed;
}

Result TransactionFileSystem::createDirectoryWithIntermediates(std::string_view path,
                                                               unsigned /*permissions*/) {
  const DevicePlace place = placeOf(path);
  const PlaceState& state = transaction_.snapshot().at(place);
  if (state.identity.exists() || transaction_.hasInformationDirectory()) {
    return failure("create the directory", path, EEXIST);
  }
  Result allowed = resultOf(state.whyNotMade);
  if (allowed) {
    transaction_.makeInformationDirectory();
  }
  return allowed;
}

std::optional<std::string> TransactionFileSystem::makeTemporaryFile() {
  // A save has begun; unless the rename comes, it failed.
  transaction_.noteSave(LastSave::Failed);
  std::string path(kTemporaryFiles);
  path += std::to_string(++temporaryFileCount_);
  temporaryFiles_.insert_or_assign(path, Transaction::List{});
  return path;
}

Result TransactionFileSystem::writeFile(std::string_view path,
                                        const SerializedPropertyList& contents) {
  const auto temporary = temporaryFiles_.find(path);
  if (temporary == temporaryFiles_.end()) {
    return writeFileAtomically(path, contents);
  }
  temporary->second.list = contents;
  return {};
}

Result TransactionFileSystem::writeFileAtomically(std::string_view path,
                                                  const SerializedPropertyList& contents) {
  const PlaceState& directory = transaction_.snapshot().at(DevicePlace::InformationDirectory);
  if (path.starts_with(directory.path + "/")) {
    if (!transaction_.hasInformationDirectory()) {
      return failure("open", directory.path, ENOENT);
    }
    Result allowed = resultOf(directory.whyNotReplaced);
    if (allowed) {
      transaction_.putInformationFile(std::string(path.substr(directory.path.size() + 1)),
                                      contents);
    }
    return allowed;
  }
  const DevicePlace place = placeOf(path);
  Result allowed = canPut(place);
  if (allowed) {
    transaction_.put(place, Transaction::List{contents, std::nullopt});
  }
  return allowed;
}

Result TransactionFileSystem::setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                                               std::string_view groupName) {
  const auto temporary = temporaryFiles_.find(path);
  if (temporary == temporaryFiles_.end()) {
    // The system gives away only what it is about to put in place.
    return failure("set the owner of", path, ENOENT);
  }
  const auto owner = ownership_.ownerNamed(ownerName, groupName);
  if (!owner) {
    return ofSave(owner.error());
  }
  temporary->second.owner = *owner;
  return {};
}

Result TransactionFileSystem::renameFile(std::string_view source, std::string_view destination) {
  const auto temporary = temporaryFiles_.find(source);
  if (temporary == temporaryFiles_.end()) {
    return failure("open", source, ENOENT);
  }
  const DevicePlace place = placeOf(destination);
  Result allowed = canPut(place);
  if (!allowed) {
    return ofSave(std::move(allowed));
  }
  transaction_.put(place, std::move(temporary->second));
  temporaryFiles_.erase(temporary);
  if (place == DevicePlace::Settings) {
    transaction_.noteSave(LastSave::Written);
  }
  return {};
}

Result TransactionFileSystem::ofSave(Result result) {
  if (!result) {
    transaction_.noteSaveFailure(result.error().text);
  }
  return result;
}

}  // namespace accounts
