#include <fmt/format.h>

#include "accountsctl/AccountFindings.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

struct DataclassProblem {
  std::string_view code;
  /// With a place for the dataclass.
  std::string_view text;
};

constexpr DataclassProblem kUnknown = {"unknownDataclass", "The dataclass '{}' is unknown"};
constexpr DataclassProblem kUnsupported = {"unsupportedDataclass",
                                           "The type does not support the dataclass '{}'"};
constexpr DataclassProblem kRestricted = {
    "restrictedDataclass", "The dataclass '{}' is enabled, but a profile does not allow it"};
constexpr DataclassProblem kUnprovisioned = {"unprovisionedDataclass",
                                             "The dataclass '{}' is enabled but not provisioned"};

/// The problem of a dataclass that is not among those that the account is provisioned for.
const DataclassProblem& problemOf(std::string_view dataclass, const PropertyArray& supported) {
  if (!supported.containsText(dataclass)) {
    return BasicAccount::allSupportedDataclasses().containsText(dataclass) ? kUnsupported
                                                                           : kUnknown;
  }
  return BasicAccount::_profileRestrictedDataclasses().containsText(dataclass) ? kRestricted
                                                                               : kUnprovisioned;
}

/// Looks at the dataclasses of one list that are not in another, which is short.
class ListFindings {
 public:
  ListFindings(const Finding& about, std::vector<Finding>& findings)
      : about_(about), findings_(findings) {}

  void addOthersThan(const PropertyArray& effective, std::string_view key,
                     const PropertyArray& list, const PropertyArray& supported) {
    for (const PropertyValue& member : list) {
      const Text* dataclass = member.asText();
      if (dataclass == nullptr) {
        addFinding(findings_, about_, Effect::Ignored, "noDataclass",
                   fmt::format("'{}' has a member that is no text: {}", key, describe(member)));
      } else if (!effective.containsText(*dataclass)) {
        const DataclassProblem& problem = problemOf(*dataclass, supported);
        addFinding(findings_, about_, Effect::Ignored, problem.code,
                   fmt::format("{} ('{}')",
                               fmt::format(fmt::runtime(problem.text), dataclass->view()), key));
      }
    }
  }

 private:
  const Finding& about_;
  std::vector<Finding>& findings_;
};

}  // namespace

void addDataclassFindings(const BasicAccount& record, const Finding& about,
                          std::vector<Finding>& findings) {
  const PropertyDictionary& own = record.properties();
  const PropertyArray supported = record.supportedDataclasses();
  ListFindings lists(about, findings);
  if (const std::optional<PropertyArray> provisioned =
          own.arrayForKey(kAccountProvisionedDataclasses)) {
    lists.addOthersThan(supported, kAccountProvisionedDataclasses, *provisioned, supported);
  }
  const std::optional<PropertyArray> enabled = own.arrayForKey(kAccountEnabledDataclasses);
  if (!enabled) {
    return;
  }
  const BasicAccountReference& parent = record.parentAccount();
  const PropertyArray ofParent =
      parent ? parent->enabledDataclasses().value_or(PropertyArray()) : PropertyArray();
  if (!ofParent.empty()) {
    addFinding(findings, about, Effect::Ignored, "overruledDataclasses",
               fmt::format("'{}' does not count, since the parent has enabled dataclasses",
                           kAccountEnabledDataclasses));
    return;
  }
  lists.addOthersThan(record.provisionedDataclasses(), kAccountEnabledDataclasses, *enabled,
                      supported);
}

}  // namespace accounts
