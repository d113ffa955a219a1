#include "tests/campaign/KilledDisks.h"

namespace accounts {

std::vector<SimulatedDisk> disksOf(const SimulatedDisk& before, const Run& run) {
  std::vector<SimulatedDisk> disks;
  SimulatedDisk disk = before;
  std::size_t applied = 0;
  const auto applyUpTo = [&](std::size_t count) {
    for (; applied < count; ++applied) {
      disk.apply(run.changes[applied]);
    }
    disks.push_back(disk);
  };
  for (const SimulatedKernel::Call& call : run.calls) {
    applyUpTo(call.changesBefore);
  }
  applyUpTo(run.changes.size());
  return disks;
}

}  // namespace accounts
