#include "inspection/PropertyDifference.h"

#include "propertylist/value/HiddenSecrets.h"

namespace accounts {
namespace {

class Comparison {
 public:
  explicit Comparison(Secrets secrets) : secrets_(secrets) {}

  void compare(const PropertyDictionary& before, const PropertyDictionary& after,
               const std::string& prefix) {
    if (before.isSameAs(after)) {
      return;
    }
    auto left = before.begin();
    auto right = after.begin();
    while (left != before.end() || right != after.end()) {
      const bool takesLeft =
          right == after.end() || (left != before.end() && left->key <= right->key);
      const bool takesRight =
          left == before.end() || (right != after.end() && right->key <= left->key);
      const Text& key = takesLeft ? left->key : right->key;
      compareValues(key, takesLeft ? &left->value : nullptr, takesRight ? &right->value : nullptr,
                    prefix + key.string());
      left += takesLeft ? 1 : 0;
      right += takesRight ? 1 : 0;
    }
  }

  std::vector<PropertyChange> take() { return std::move(changes_); }

 private:
  /// One of the values may be null.
  void compareValues(std::string_view key, const PropertyValue* before, const PropertyValue* after,
                     const std::string& path) {
    if (before != nullptr && after != nullptr) {
      if (*before == *after) {
        return;
      }
      const PropertyDictionary* left = before->asDictionary();
      const PropertyDictionary* right = after->asDictionary();
      if (left != nullptr && right != nullptr && !isSecretKey(key)) {
        return compare(*left, *right, path + "/");
      }
    }
    changes_.push_back({path, shown(key, before), shown(key, after)});
  }

  std::optional<PropertyValue> shown(std::string_view key, const PropertyValue* value) const {
    if (value == nullptr) {
      return std::nullopt;
    }
    return secrets_ == Secrets::Hide ? withSecretsHidden(key, *value) : *value;
  }

  Secrets secrets_;
  std::vector<PropertyChange> changes_;
};

}  // namespace

std::vector<PropertyChange> propertyChanges(const PropertyDictionary& before,
                                            const PropertyDictionary& after, Secrets secrets) {
  Comparison comparison(secrets);
  comparison.compare(before, after, "");
  return comparison.take();
}

}  // namespace accounts
