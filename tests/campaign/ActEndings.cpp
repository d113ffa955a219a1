#include "tests/campaign/ActEndings.h"

#include "tests/campaign/LegacyStores.h"
#include "tests/campaign/Run.h"

namespace accounts {

const std::vector<Ending>& ActEndings::beforeOrAfter(const NamedAct& act, std::size_t times) {
  std::vector<Ending>& endings = known_[{std::string(act.name), times}];
  if (!endings.empty()) {
    return endings;
  }
  for (std::size_t first = 0; first == 0 || first < times; ++first) {
    for (std::size_t before = first; before <= times; ++before) {
      endings.push_back(endingAfter(act, act.act, first, before, times));
      if (act.act == Act::Replaces || act.act == Act::Writes) {
        endings.push_back(endingAfter(act, Act::ReplacesBlindly, first, before, times));
      }
    }
  }
  return endings;
}

Ending ActEndings::before(const NamedAct& act, std::size_t times, SimulatedDisk disk) {
  Intruder intruder(act, scenario_.disk, writings_);
  OtherProgram program(disk);
  while (intruder.times() < times) {
    intruder(program);
  }
  return invariants_.endingAfterRun(disk);
}

Ending ActEndings::withoutGoneStores(const NamedAct& act, std::size_t times,
                                     const SimulatedDisk& other) {
  return before(act, times, withoutStoresGoneFrom(other, scenario_.disk));
}

/// Up to a number of times the program acts before an undisturbed run and then, when it may have
/// read the file before, after it. What it did the `first` times it has undone itself.
Ending ActEndings::endingAfter(NamedAct act, Act later, std::size_t first, std::size_t before,
                               std::size_t times) {
  Intruder intruder(act, scenario_.disk, writings_);
  SimulatedDisk disk = scenario_.disk;
  const auto actUpTo = [&](std::size_t count) {
    SimulatedDisk undone = disk;
    while (intruder.times() < count) {
      const bool counts = intruder.times() >= first;
      OtherProgram program(counts ? disk : undone);
      intruder(program);
    }
  };
  actUpTo(before);
  disk = runOn(disk, scenario_, {}).disk;
  act.act = later;
  actUpTo(times);
  return invariants_.endingAfterRun(disk);
}

}  // namespace accounts
