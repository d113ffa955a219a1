#include "accountsctl/CheckCommand.h"

#include <fmt/format.h>

#include <memory>

#include "accountsctl/DevicePlatform.h"
#include "accountsctl/JSONText.h"
#include "accountsctl/LegacyFindings.h"
#include "accountsctl/PropertyListInput.h"
#include "accountsctl/Rehearsal.h"
#include "accountsctl/SettingsFindings.h"
#include "accountsctl/TextTable.h"
#include "commandline/BundleLocation.h"
#include "inspection/StoreLayout.h"

namespace accounts {
namespace {

struct CheckedKind {
  FileKind kind;
  std::vector<Finding> (*findings)(const PropertyDictionary& root);
};

constexpr CheckedKind kCheckedKinds[] = {
    {FileKind::AccountSettings, findingsInSettings},
    {FileKind::MailStore, findingsInMailStore},
    {FileKind::ExchangeStore, findingsInExchangeStore},
};

const CheckedKind* checkedKind(FileKind kind) {
  for (const CheckedKind& checked : kCheckedKinds) {
    if (checked.kind == kind) {
      return &checked;
    }
  }
  return nullptr;
}

LinuxPlatformOptions platformOptions(const CheckOptions& options) {
  LinuxPlatformOptions result;
  // The running device's: of a root nothing is read but the device description.
  result.rootDirectory = "/";
  result.deviceDescriptionFile = options.device;
  if (options.bundle) {
    result.bundleResourcesDirectory = resourcesOfBundle(*options.bundle).string();
  }
  return result;
}

std::string textOf(const std::vector<Finding>& findings, const std::string& losses,
                   const Terminal& terminal) {
  if (findings.empty()) {
    return losses.empty() ? "Nothing found\n" : losses;
  }
  TextTable table({"Place", "Account", "Effect", "Finding"});
  for (const Finding& finding : findings) {
    table.addRow({finding.place.empty() ? "file" : finding.place, finding.title,
                  std::string(nameOf(finding.effect)), finding.text});
  }
  return table.text(terminal) + losses;
}

JSON objectFor(const Finding& finding) {
  const bool isOfAccount = !finding.place.empty();
  return {{"effect", nameOf(finding.effect)},
          {"code", finding.code},
          {"place", isOfAccount ? JSON(finding.place) : JSON(nullptr)},
          {"title", isOfAccount ? JSON(finding.title) : JSON(nullptr)},
          {"identifier", finding.identifier ? JSON(finding.identifier->string()) : JSON(nullptr)},
          {"text", finding.text}};
}

std::string objectLine(const CheckOptions& options, FileKind kind,
                       const std::vector<Finding>& findings, const Rehearsed& rehearsed,
                       ExitStatus exitStatus) {
  JSON list = JSON::array();
  for (const Finding& finding : findings) {
    list.push_back(objectFor(finding));
  }
  JSON object = reportObject("check");
  object["file"] = options.file;
  object["kind"] = identifierOf(kind);
  object["findings"] = std::move(list);
  object["ledger"] = ledgerObject(rehearsed);
  return lineOf(std::move(object), exitStatus);
}

}  // namespace

CommandResult check(const CheckOptions& options, const Terminal& terminal,
                    const CommandWorker& worker) {
  const auto opened = DevicePlatform::open(platformOptions(options));
  if (!opened) {
    return opened.error();
  }
  DevicePlatform& platform = **opened;
  const auto input = readPropertyListInputs({options.file}, worker);
  if (!input) {
    return input.error();
  }
  const PropertyValue& content = input->front();
  const FileKind kind = kindOf(content);
  const CheckedKind* checked = checkedKind(kind);
  if (checked == nullptr) {
    return ProgramError{ExitStatus::MalformedInput,
                        fmt::format("Neither account settings nor a legacy store: {} ({})",
                                    options.file, nameOf(kind))};
  }
  if (const auto decoded = platform.decode(); !decoded) {
    return decoded.error();
  }
  const std::vector<Finding> findings = checked->findings(*content.asDictionary());
  const Rehearsed rehearsed = rehearseFile(platform, kind, content, options.file);
  const std::string losses = linesOf(rehearsed);
  const bool isGood = findings.empty() && losses.empty();
  const ExitStatus exitStatus = isGood ? ExitStatus::Success : ExitStatus::Attention;
  return CommandReport{options.reportsJSON
                           ? objectLine(options, kind, findings, rehearsed, exitStatus)
                           : textOf(findings, losses, terminal),
                       exitStatus};
}

}  // namespace accounts
