#include "tests/campaign/Report.h"

#include <algorithm>
#include <iostream>

namespace accounts {

namespace {

constexpr std::size_t kMostComplaintsShown = 10;

}  // namespace

bool Report::takes(std::string_view scenario, std::size_t operation, std::string_view fault) {
  const bool isAsked =
      mayTake(scenario, fault) && (!selection_.operation || selection_.operation == operation);
  if (!isAsked || offered_++ % selection_.every != 0) {
    return false;
  }
  ++taken_;
  scenario_ = scenario;
  operation_ = operation;
  fault_ = fault;
  return true;
}

void Report::judge(const Complaint& complaint, std::string_view call) {
  if (complaint) {
    complaints_.push_back(*complaint + "\n    at \"" + std::string(call) + "\"\n    repeat with: " +
                          (selection_.host == Scenario::Host::Bare ? "--bare " : "") +
                          "--scenario " + scenario_ + " --operation " + std::to_string(operation_) +
                          " --fault " + fault_);
  }
}

void Report::add(std::string_view name, std::size_t number) {
  const auto known = std::ranges::find(numbers_, name, [](const auto& each) { return each.first; });
  if (known != numbers_.end()) {
    known->second += number;
  } else {
    numbers_.emplace_back(name, number);
  }
}

bool Report::finish(std::string_view campaign, std::size_t floor) const {
  for (std::size_t index = 0; index < std::min(complaints_.size(), kMostComplaintsShown); ++index) {
    std::cout << campaign << ": " << complaints_[index] << '\n';
  }
  std::cout << campaign << ": cases " << taken_;
  for (const auto& [name, number] : numbers_) {
    std::cout << ", " << name << ' ' << number;
  }
  std::cout << ", complaints " << complaints_.size() << '\n';
  const bool isWhole =
      selection_.scenario.empty() && !selection_.operation && selection_.fault.empty();
  const bool isEnough = !isWhole || taken_ >= floor / selection_.every;
  if (!isEnough) {
    std::cout << campaign << ": fewer cases than " << floor / selection_.every << '\n';
  }
  return complaints_.empty() && isEnough && taken_ != 0;
}

}  // namespace accounts
