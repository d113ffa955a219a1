#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "tests/campaign/Intruder.h"
#include "tests/campaign/TransactionInvariants.h"

namespace accounts {

/// How the device of a scenario may end when another program acts during a run.
class ActEndings {
 public:
  /// All must outlive this. `writings` remembers what programs write.
  ActEndings(const Scenario& scenario, const TransactionInvariants& invariants, Writings& writings)
      : scenario_(scenario), invariants_(invariants), writings_(writings) {}

  /// As if it had acted before an undisturbed run and after it, so many times altogether.
  const std::vector<Ending>& beforeOrAfter(const NamedAct& act, std::size_t times);

  /// As if it had acted so often on a disk before an undisturbed run.
  Ending before(const NamedAct& act, std::size_t times, SimulatedDisk disk);

  /// The same on the scenario's disk without the stores that are gone from another one. Who writes
  /// the settings file without having read what a run has put there takes away what that carried
  /// over.
  Ending withoutGoneStores(const NamedAct& act, std::size_t times, const SimulatedDisk& other);

 private:
  Ending endingAfter(NamedAct act, Act later, std::size_t first, std::size_t before,
                     std::size_t times);

  const Scenario& scenario_;
  const TransactionInvariants& invariants_;
  Writings& writings_;
  std::map<std::pair<std::string, std::size_t>, std::vector<Ending>> known_;
};

}  // namespace accounts
