#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/campaign/Invariants.h"

namespace accounts {

/// Which cases a campaign tries.
struct Selection {
  Scenario::Host host = Scenario::Host::Transaction;
  /// Empty for all.
  std::string scenario = {};
  /// None for all.
  std::optional<std::size_t> operation = {};
  /// Empty for all; else a fault's name, such as "EIO-once".
  std::string fault = {};
  /// Every n-th case only.
  std::size_t every = 1;
};

/// Counts the cases of a campaign and keeps the complaints.
class Report {
 public:
  explicit Report(Selection selection) : selection_(std::move(selection)) {}

  /// Whether a case is selected: the n-th operation of a scenario with a fault. Counts.
  bool takes(std::string_view scenario, std::size_t operation, std::string_view fault);
  [[nodiscard]] bool takes(std::string_view scenario) const {
    return selection_.scenario.empty() || selection_.scenario == scenario;
  }

  /// Whether any case with a fault is selected. Does not count.
  [[nodiscard]] bool mayTake(std::string_view scenario, std::string_view fault) const {
    return takes(scenario) && (selection_.fault.empty() || selection_.fault == fault);
  }

  /// Whether the operation with a number is selected. Does not count.
  [[nodiscard]] bool mayTake(std::size_t operation) const {
    return !selection_.operation || selection_.operation == operation;
  }

  /// Keeps a complaint about the case that was taken last. `call` says what the operation is.
  void judge(const Complaint& complaint, std::string_view call);

  /// Adds to a number that is printed at the end under a name.
  void add(std::string_view name, std::size_t number);

  /// Prints all, and tells how to repeat the first cases with complaints. False when there are
  /// complaints, or when all cases were to be tried and were fewer than `floor`.
  [[nodiscard]] bool finish(std::string_view campaign, std::size_t floor) const;

 private:
  Selection selection_;
  std::size_t offered_ = 0;
  std::size_t taken_ = 0;
  std::string scenario_;
  std::size_t operation_ = 0;
  std::string fault_;
  std::vector<std::string> complaints_;
  std::vector<std::pair<std::string, std::size_t>> numbers_;
};

}  // namespace accounts
