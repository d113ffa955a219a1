#pragma once

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

#include "accountsctl/RunResult.h"

namespace accounts {

/// How often something occurs.
template <class What>
using Counts = std::vector<std::pair<What, std::size_t>>;

/// The results of runs on many images, counted. An image that was run several times counts with
/// its last result alone.
class FleetSummary {
 public:
  /// Says which images there are, each once; results of others do not count. To be called before
  /// lines are added.
  void expect(const std::vector<std::string>& roots);
  /// Adds a line of output; an empty one is nothing. `page` is the page of the report that the line
  /// is, if there is one.
  void addLine(std::string_view line, const std::optional<std::string>& page = std::nullopt);

  /// How many images there are results of.
  [[nodiscard]] std::size_t imageCount() const { return results_.size(); }
  /// How many of them ended with a remedy.
  [[nodiscard]] std::size_t countOf(Remedy remedy) const;
  /// How many lines are no results.
  [[nodiscard]] std::size_t unreadableLineCount() const { return unreadableLines_; }
  /// How many results a later one of the same image replaced.
  [[nodiscard]] std::size_t replacedCount() const { return replaced_; }
  /// How many images were migrated with warnings.
  [[nodiscard]] std::size_t warningCount() const;

  /// The exit statuses, in their order.
  [[nodiscard]] Counts<int> exitStatuses() const;
  /// The stages of migrations and the errors, the most frequent first, then by their texts.
  [[nodiscard]] Counts<std::string> steps() const;
  [[nodiscard]] Counts<std::string> errors() const;

  /// The images that were expected and have no result, in the order in which they were named.
  [[nodiscard]] std::vector<std::string> missingRoots() const;

  /// The roots of the images with a remedy, in the order of their first results.
  [[nodiscard]] std::vector<std::string> rootsWith(Remedy remedy) const;
  /// The results of those images, which have roots.
  [[nodiscard]] std::vector<const RunResult*> resultsWith(Remedy remedy) const;

 private:
  std::vector<RunResult> results_;
  /// Where the result of a root stands.
  std::unordered_map<std::string, std::size_t> places_;
  std::map<int, std::size_t> exitStatuses_;
  std::size_t unreadableLines_ = 0;
  /// None: any image may have a result.
  std::optional<std::vector<std::string>> expected_;
  std::unordered_set<std::string> expectedRoots_;
  std::size_t replaced_ = 0;
};

/// One line that tells how far a fleet has come: how many images of how many, if that is known, and
/// with which remedies.
std::string progressText(const FleetSummary& summary, std::optional<std::size_t> expected);

}  // namespace accounts
