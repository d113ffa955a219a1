#pragma once

#include "platform/PropertyLists.h"
#include "transaction/Transaction.h"

namespace accounts {

/// The property-list files of a migration in memory.
class TransactionPropertyLists final : public PropertyLists {
 public:
  /// The arguments must outlive this. `serializer` says which values can be written.
  TransactionPropertyLists(Transaction& transaction, PropertyLists& serializer)
      : transaction_(transaction), serializer_(serializer) {}

  /// None also for a path that is not listed: no file is there for a migration.
  std::optional<PropertyDictionary> readDictionary(std::string_view path) override {
    const std::optional<DevicePlace> place = transaction_.placeOf(path);
    return place ? transaction_.dictionaryAt(*place) : std::nullopt;
  }
  OrFailure<SerializedPropertyList> serializeBinary(const PropertyValue& value) override {
    return serializer_.serializeBinary(value);
  }

 private:
  Transaction& transaction_;
  PropertyLists& serializer_;
};

}  // namespace accounts
