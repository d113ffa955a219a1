#include "accountsctl/RunResult.h"

#include <sysexits.h>

#include <algorithm>
#include <iterator>

#include "inspection/PropertyListJSON.h"

namespace accounts {
namespace {

constexpr std::string_view kAnyRoot = "ROOT";

constexpr Outcome kOutcomes[] = {
    {0, "migrated", "migrated", Remedy::None},
    {1, "failed", "the plug-in reported failure", Remedy::Attention},
    {2, "notVerified", "not verified, nothing changed", Remedy::Attention},
    {3, "notAllCarriedOver", "migrated, but something was not carried over", Remedy::Losses},
    {EX_USAGE, "unusableArguments", "unusable arguments", Remedy::Attention},
    {EX_DATAERR, "malformedInput", "malformed input", Remedy::Attention},
    {EX_NOINPUT, "missingInput", "no such root, description or bundle", Remedy::Attention},
    {EX_SOFTWARE, "pluginEnded", "the plug-in ended by an assertion or a signal",
     Remedy::Attention},
    {EX_CANTCREAT, "cannotCreate", "a file of the host's cannot be created", Remedy::Attention},
    {EX_IOERR, "inputOutputError", "a file cannot be written or read", Remedy::Attention},
    {EX_TEMPFAIL, "mayPass", "something that may pass", Remedy::Retry},
};

constexpr Outcome kOther = {-1, "other", "another exit status", Remedy::Attention};

std::string withoutRoot(std::string text, const std::optional<std::string>& root) {
  // "/" is part of every path, so it tells nothing apart.
  if (!root || root->size() < 2) {
    return text;
  }
  for (std::size_t place = text.find(*root); place != std::string::npos;
       place = text.find(*root, place + kAnyRoot.size())) {
    text.replace(place, root->size(), kAnyRoot);
  }
  return text;
}

std::optional<std::string> textIn(const JSON& object, const char* key) {
  const auto found = object.find(key);
  return found != object.end() && found->is_string() ? std::optional(found->get<std::string>())
                                                     : std::nullopt;
}

std::vector<std::string> textsIn(const JSON& object, const char* key) {
  std::vector<std::string> texts;
  const auto found = object.find(key);
  if (found != object.end() && found->is_array()) {
    for (const JSON& element : *found) {
      if (element.is_string()) {
        texts.push_back(element.get<std::string>());
      }
    }
  }
  return texts;
}

/// How long the stages of a report took together.
std::optional<double> secondsIn(const JSON& object) {
  const auto stages = object.find("stages");
  if (stages == object.end() || !stages->is_array()) {
    return std::nullopt;
  }
  double sum = 0;
  for (const JSON& stage : *stages) {
    const auto seconds = stage.is_object() ? stage.find("seconds") : stage.end();
    sum += seconds != stage.end() && seconds->is_number() ? seconds->get<double>() : 0;
  }
  return sum;
}

/// Whether a value is what a process can end with: no other number may pass for one by being cut.
bool isExitStatus(const JSON& value) {
  constexpr int kLargest = 255;
  return value.is_number_integer() && value >= 0 && value <= kLargest;
}

}  // namespace

std::optional<RunResult> runResultFrom(std::string_view line) {
  const JSON object = JSON::parse(line, nullptr, /*allow_exceptions=*/false);
  if (!object.is_object()) {
    return std::nullopt;
  }
  const auto exitStatus = object.find("exitStatus");
  if (exitStatus == object.end() || !isExitStatus(*exitStatus) || !object.contains("root")) {
    return std::nullopt;
  }
  RunResult result;
  result.root = textIn(object, "root");
  result.exitStatus = exitStatus->get<int>();
  result.steps = textsIn(object, "steps");
  if (std::optional<std::string> error = textIn(object, "error")) {
    result.error = withoutRoot(*std::move(error), result.root);
  }
  result.warnings = textsIn(object, "warnings");
  if (const auto ledger = object.find("ledger"); ledger != object.end() && ledger->is_object()) {
    for (std::string& loss : textsIn(*ledger, "losses")) {
      result.losses.push_back(withoutRoot(std::move(loss), result.root));
    }
  }
  result.seconds = secondsIn(object);
  return result;
}

Outcome outcomeOf(int exitStatus) {
  const auto* const found =
      std::find_if(std::begin(kOutcomes), std::end(kOutcomes),
                   [&](const Outcome& outcome) { return outcome.exitStatus == exitStatus; });
  Outcome outcome = found != std::end(kOutcomes) ? *found : kOther;
  outcome.exitStatus = exitStatus;
  return outcome;
}

}  // namespace accounts
