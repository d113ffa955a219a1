#include "platform/linux/DescribedPairingValueStore.h"

namespace accounts {
namespace {

class Connection final : public PairingConnection {
 public:
  explicit Connection(const PropertyDictionary& domains) : domains_(domains) {}

  std::optional<PropertyValue> copyValue(std::string_view domain,
                                         std::optional<std::string_view> key) override {
    const auto values = domains_.dictionaryForKey(domain);
    if (!values) {
      return std::nullopt;
    }
    if (!key) {
      return *values;
    }
    const PropertyValue* value = values->find(*key);
    return value != nullptr ? std::optional(*value) : std::nullopt;
  }

 private:
  const PropertyDictionary& domains_;
};

}  // namespace

std::unique_ptr<PairingConnection> DescribedPairingValueStore::connect() {
  return description_.pairingValues ? std::make_unique<Connection>(*description_.pairingValues)
                                    : nullptr;
}

}  // namespace accounts
