#include "accountsctl/DiffCommand.h"

#include <fmt/format.h>

#include <vector>

#include "accountsctl/JSONText.h"
#include "accountsctl/PropertyListInput.h"
#include "inspection/DifferenceJSON.h"
#include "inspection/DifferenceText.h"
#include "inspection/StoreDifference.h"

namespace accounts {
namespace {

/// A store in both files: the whole files, or a part of two migration-information files.
struct ComparedPart {
  /// The key of the part; empty for whole files.
  std::string_view key;
  bool isEmpty = true;
  /// For programs.
  JSON difference;
};

ComparedPart comparedPart(std::string_view key, FileKind kind, const PropertyDictionary& before,
                          const PropertyDictionary& after, Secrets secrets) {
  const StoreDifference difference = differenceBetween(before, after, kind, secrets);
  return {key, difference.isEmpty(),
          differenceObject(difference, layoutOf(kind).value_or(StoreLayout()))};
}

PropertyDictionary rootOf(const PropertyValue& value) {
  const PropertyDictionary* root = value.asDictionary();
  // A property list that is one value without keys is compared as one under the empty key.
  return root != nullptr ? *root : PropertyDictionary{{"", value}};
}

std::vector<ComparedPart> comparedParts(PropertyDictionary before, PropertyDictionary after,
                                        FileKind kind, Secrets secrets) {
  std::vector<ComparedPart> parts;
  if (kind == FileKind::MigrationInformation) {
    for (const InformationPart& part : informationParts()) {
      const std::optional<PropertyDictionary> left = before.dictionaryForKey(part.key);
      const std::optional<PropertyDictionary> right = after.dictionaryForKey(part.key);
      if (left && right) {
        parts.push_back(comparedPart(part.key, part.kind, *left, *right, secrets));
        before.remove(part.key);
        after.remove(part.key);
      }
    }
  }
  parts.insert(parts.begin(), comparedPart("", kind, before, after, secrets));
  return parts;
}

CommandReport textReport(const std::vector<ComparedPart>& parts, const Terminal& terminal) {
  CommandReport report;
  for (const ComparedPart& part : parts) {
    const std::string text = differenceText(part.difference, terminal);
    if (!text.empty() && !part.key.empty()) {
      report.text += emphasized(terminal, Emphasis::Heading, part.key) + "\n";
    }
    report.text += text;
  }
  return report;
}

CommandReport jsonReport(const std::vector<ComparedPart>& parts, const DiffOptions& options,
                         FileKind kind, ExitStatus exitStatus) {
  JSON list = JSON::array();
  for (const ComparedPart& part : parts) {
    JSON object = {{"part", part.key.empty() ? JSON(nullptr) : JSON(part.key)}};
    object.update(part.difference);
    list.push_back(std::move(object));
  }
  JSON object = reportObject("diff");
  object["before"] = options.before;
  object["after"] = options.after;
  object["kind"] = identifierOf(kind);
  object["same"] = exitStatus == ExitStatus::Success;
  object["parts"] = std::move(list);
  return CommandReport{lineOf(std::move(object), exitStatus)};
}

}  // namespace

CommandResult diff(const DiffOptions& options, const Terminal& terminal,
                   const CommandWorker& worker) {
  const auto inputs = readPropertyListInputs({options.before, options.after}, worker);
  if (!inputs) {
    return inputs.error();
  }
  const auto& values = *inputs;
  const PropertyValue& left = values[0];
  const PropertyValue& right = values[1];
  const FileKind kind = kindOf(left);
  if (kindOf(right) != kind) {
    return ProgramError{
        ExitStatus::MalformedInput,
        fmt::format("The files are of different kinds: {} ({}), {} ({})", options.before,
                    nameOf(kind), options.after, nameOf(kindOf(right)))};
  }
  const std::vector<ComparedPart> parts =
      comparedParts(rootOf(left), rootOf(right), kind, options.secrets);
  bool isSame = true;
  for (const ComparedPart& part : parts) {
    isSame = isSame && part.isEmpty;
  }
  const ExitStatus exitStatus = isSame ? ExitStatus::Success : ExitStatus::Attention;
  CommandReport report = options.reportsJSON ? jsonReport(parts, options, kind, exitStatus)
                                             : textReport(parts, terminal);
  report.exitStatus = exitStatus;
  return report;
}

}  // namespace accounts
