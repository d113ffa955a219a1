#include "report/ReportText.h"

#include <fmt/format.h>

#include "inspection/DifferenceText.h"
#include "propertylist/value/Description.h"

namespace accounts {
namespace {

constexpr std::string_view kIndentation = "    ";

std::string textIn(const JSON& object, const char* key) {
  const auto found = object.find(key);
  return found != object.end() && found->is_string() ? escapedText(found->get<std::string>()) : "";
}

std::string versionIn(const JSON& versions, const char* key) {
  const JSON& version = versions[key];
  return version.is_null() ? "none" : escapedText(lineOf(version));
}

std::size_t countAccounts(const JSON& accounts) {
  std::size_t count = 0;
  for (const JSON& account : accounts) {
    count += 1 + account["children"].size();
  }
  return count;
}

std::string heading(const JSON& report) {
  const bool isPlan = textIn(report, "command") == "plan";
  // Something is migrated with the status of losses, too.
  const bool isGood = report["exitStatus"] == 0 || report["exitStatus"] == 3;
  const std::string root = textIn(report, "root");
  std::string what = isPlan ? (isGood ? "Would migrate " : "Would fail to migrate ")
                            : (isGood ? "Migrated " : "Failed to migrate ");
  return what + root;
}

/// What was, or would be, not carried over; empty for nothing.
std::string lossesText(const JSON& report, const Terminal& terminal) {
  const auto ledger = report.find("ledger");
  std::string text;
  if (ledger != report.end() && ledger->is_object()) {
    for (const JSON& loss : (*ledger)["losses"]) {
      text += emphasized(terminal, Emphasis::Warning,
                         "Not carried over: " + escapedText(loss.get<std::string>())) +
              "\n";
    }
  }
  return text;
}

std::string fileLine(const JSON& file) {
  const std::string error = textIn(file, "error");
  return fmt::format("{}{}{} {}{}\n", kIndentation, error.empty() ? "" : "not ",
                     textIn(file, "action"), textIn(file, "path"),
                     error.empty() ? "" : ": " + error);
}

std::string stageText(const JSON& stage, const Terminal& terminal) {
  const bool hasEnded = stage.contains("succeeded");
  const bool hasFailed = hasEnded && stage["succeeded"] == false;
  std::string line = textIn(stage, "title");
  if (const std::string name = textIn(stage, "name"); !name.empty()) {
    line += " (" + name + ")";
  }
  if (!hasEnded && stage["name"].is_string()) {
    line += ": did not end";
  } else if (hasFailed) {
    line += ": failed";
  }
  std::string text =
      emphasized(terminal, hasFailed ? Emphasis::Warning : Emphasis::Heading, line) + "\n";
  text += differenceText({{"properties", stage["otherProperties"]},
                          {"accounts", stage["accounts"]},
                          {"otherOrder", stage.value("otherOrder", false)}},
                         terminal, kIndentation);
  for (const JSON& file : stage["files"]) {
    text += fileLine(file);
  }
  for (const JSON& logged : stage["log"]) {
    text += fmt::format("{}> {}\n", kIndentation, textIn(logged, "text"));
  }
  return text;
}

}  // namespace

std::string reportText(const JSON& report, const Terminal& terminal) {
  if (report["dataClassName"].is_null()) {
    return "";
  }
  std::string text = emphasized(terminal, Emphasis::Heading, heading(report)) + "\n";
  text +=
      fmt::format("{}version {} to {}, {} accounts to {}\n", kIndentation,
                  versionIn(report["versions"], "before"), versionIn(report["versions"], "after"),
                  countAccounts(report["accountsBefore"]), countAccounts(report["accountsAfter"]));
  text += lossesText(report, terminal);
  for (const JSON& warning : report["warnings"]) {
    text += emphasized(terminal, Emphasis::Warning,
                       "Warning: " + escapedText(warning.get<std::string>())) +
            "\n";
  }
  for (const JSON& stage : report["stages"]) {
    text += stageText(stage, terminal);
  }
  for (const JSON& broadcast : report["broadcasts"]) {
    text += fmt::format("Tells {} that its {} changed\n", textIn(broadcast, "application"),
                        textIn(broadcast, "key"));
  }
  if (const auto count = report.value("cloudTabAnnouncements", 0); count > 0) {
    text += fmt::format("Announces cloud tabs, {} {}\n", count, count == 1 ? "time" : "times");
  }
  return text;
}

}  // namespace accounts
