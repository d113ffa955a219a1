#include "transaction/Transaction.h"

#include <utility>

#include "propertylist/PropertyListFile.h"

namespace accounts {

Transaction::Transaction(const DeviceSnapshot& snapshot, std::string_view home)
    : snapshot_(snapshot) {
  for (const ListedPlace& each : kDevicePlaces) {
    paths_[indexOf(each.place)] = pathOfPlace(each.place, home);
  }
}

std::optional<DevicePlace> Transaction::placeOf(std::string_view path) const {
  for (const ListedPlace& each : kDevicePlaces) {
    if (paths_[indexOf(each.place)] == path) {
      return each.place;
    }
  }
  return std::nullopt;
}

bool Transaction::exists(DevicePlace place) const {
  const Standing& standing = at(place);
  if (std::holds_alternative<AsItWas>(standing)) {
    return snapshot_.at(place).target != EntryKind::Nothing;
  }
  return !std::holds_alternative<Removed>(standing);
}

std::optional<std::string> Transaction::bytesBefore(DevicePlace place) {
  const PlaceState& state = snapshot_.at(place);
  if (state.contents == nullptr) {
    return std::nullopt;
  }
  std::string bytes;
  bytes.reserve(state.identity.size);
  const Result given = state.contents->giveTo([&bytes](std::string_view piece) {
    bytes.append(piece);
    return true;
  });
  if (!given) {
    if (!readFailure_) {
      readFailure_ = given.error();
    }
    return std::nullopt;
  }
  return bytes;
}

std::optional<PropertyDictionary> Transaction::dictionaryBefore(DevicePlace place) {
  Decoded& decoded = decoded_[indexOf(place)];
  if (!decoded.isDecoded) {
    decoded.isDecoded = true;
    if (const std::optional<std::string> bytes = bytesBefore(place)) {
      const auto value = readPropertyList(*bytes);
      const PropertyDictionary* const dictionary = value ? value->asDictionary() : nullptr;
      decoded.dictionary = dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
    }
  }
  return decoded.dictionary;
}

std::optional<PropertyDictionary> Transaction::dictionaryAt(DevicePlace place) {
  const Standing& standing = at(place);
  if (std::holds_alternative<AsItWas>(standing)) {
    return dictionaryBefore(place);
  }
  if (const auto* copy = std::get_if<Copy>(&standing)) {
    return dictionaryBefore(copy->source);
  }
  const auto* const written = std::get_if<List>(&standing);
  const PropertyValue* const value = written != nullptr ? written->list.value() : nullptr;
  const PropertyDictionary* const dictionary = value != nullptr ? value->asDictionary() : nullptr;
  return dictionary != nullptr ? std::optional(*dictionary) : std::nullopt;
}

bool Transaction::hasInformationDirectory() const {
  return madeInformationDirectory_ ||
         snapshot_.at(DevicePlace::InformationDirectory).target == EntryKind::Directory;
}

void Transaction::putInformationFile(std::string name, SerializedPropertyList list) {
  informationFileName_ = std::move(name);
  informationFile_ = std::move(list);
}

std::vector<PlaceChange> Transaction::changes() const {
  std::vector<PlaceChange> changes;
  for (const ListedPlace& each : kDevicePlaces) {
    const Standing& standing = at(each.place);
    if (std::holds_alternative<Removed>(standing)) {
      if (snapshot_.at(each.place).identity.exists()) {
        changes.push_back({each.place, PlaceChange::Removed{}});
      }
    } else if (const auto* written = std::get_if<List>(&standing)) {
      changes.push_back({each.place, written->list, written->owner});
    } else if (std::holds_alternative<Copy>(standing)) {
      changes.push_back({each.place, PlaceChange::CopyOfSettings{}});
    }
    if (each.place == DevicePlace::InformationDirectory) {
      if (informationFile_) {
        changes.push_back({each.place, informationFile_, std::nullopt, informationFileName_});
      } else if (madeInformationDirectory_) {
        changes.push_back({each.place, PlaceChange::EmptyDirectory{}});
      }
    }
  }
  return changes;
}

}  // namespace accounts
