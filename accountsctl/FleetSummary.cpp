#include "accountsctl/FleetSummary.h"

#include <fmt/format.h>

#include <algorithm>

namespace accounts {
namespace {

/// Counts of texts, the most frequent first.
Counts<std::string> mostFrequentFirst(const std::map<std::string, std::size_t>& counts) {
  Counts<std::string> sorted(counts.begin(), counts.end());
  std::stable_sort(sorted.begin(), sorted.end(),
                   [](const auto& left, const auto& right) { return left.second > right.second; });
  return sorted;
}

}  // namespace

void FleetSummary::expect(const std::vector<std::string>& roots) {
  expected_ = roots;
  expectedRoots_ = {roots.begin(), roots.end()};
}

void FleetSummary::addLine(std::string_view line, const std::optional<std::string>& page) {
  if (line.empty()) {
    return;
  }
  std::optional<RunResult> result = runResultFrom(line);
  if (!result) {
    ++unreadableLines_;
    return;
  }
  result->page = page;
  if (expected_ && !(result->root && expectedRoots_.contains(*result->root))) {
    return;
  }
  ++exitStatuses_[result->exitStatus];
  if (result->root) {
    const auto [known, isNew] = places_.try_emplace(*result->root, results_.size());
    if (!isNew) {
      RunResult& earlier = results_[known->second];
      --exitStatuses_[earlier.exitStatus];
      ++replaced_;
      earlier = *std::move(result);
      return;
    }
  }
  results_.push_back(*std::move(result));
}

std::size_t FleetSummary::countOf(Remedy remedy) const {
  std::size_t sum = 0;
  for (const auto& [exitStatus, count] : exitStatuses_) {
    sum += outcomeOf(exitStatus).remedy == remedy ? count : 0;
  }
  return sum;
}

std::size_t FleetSummary::warningCount() const {
  return static_cast<std::size_t>(
      std::count_if(results_.begin(), results_.end(), [](const RunResult& result) {
        return !result.warnings.empty() && outcomeOf(result.exitStatus).remedy == Remedy::None;
      }));
}

Counts<int> FleetSummary::exitStatuses() const {
  Counts<int> counts;
  for (const auto& [exitStatus, count] : exitStatuses_) {
    // A result that a later one replaced may leave none.
    if (count > 0) {
      counts.emplace_back(exitStatus, count);
    }
  }
  return counts;
}

Counts<std::string> FleetSummary::steps() const {
  std::map<std::string, std::size_t> counts;
  for (const RunResult& result : results_) {
    for (const std::string& step : result.steps) {
      ++counts[step];
    }
  }
  return mostFrequentFirst(counts);
}

Counts<std::string> FleetSummary::errors() const {
  std::map<std::string, std::size_t> counts;
  for (const RunResult& result : results_) {
    if (result.error) {
      ++counts[*result.error];
    }
  }
  return mostFrequentFirst(counts);
}

std::vector<const RunResult*> FleetSummary::resultsWith(Remedy remedy) const {
  std::vector<const RunResult*> found;
  for (const RunResult& result : results_) {
    if (result.root && outcomeOf(result.exitStatus).remedy == remedy) {
      found.push_back(&result);
    }
  }
  return found;
}

std::vector<std::string> FleetSummary::missingRoots() const {
  std::vector<std::string> missing;
  for (const std::string& root : expected_.value_or(std::vector<std::string>())) {
    if (!places_.contains(root)) {
      missing.push_back(root);
    }
  }
  return missing;
}

std::vector<std::string> FleetSummary::rootsWith(Remedy remedy) const {
  std::vector<std::string> roots;
  for (const RunResult* result : resultsWith(remedy)) {
    roots.push_back(*result->root);
  }
  return roots;
}

std::string progressText(const FleetSummary& summary, std::optional<std::size_t> expected) {
  return fmt::format("{}{} {}: {} migrated, {} to retry, {} for a person", summary.imageCount(),
                     expected ? fmt::format(" of {}", *expected) : "",
                     expected.value_or(summary.imageCount()) == 1 ? "image" : "images",
                     summary.countOf(Remedy::None), summary.countOf(Remedy::Retry),
                     summary.countOf(Remedy::Attention));
}

}  // namespace accounts
