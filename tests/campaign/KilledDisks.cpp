#include "tests/campaign/KilledDisks.h"

namespace accounts {

std::vector<SimulatedDisk> disksOf(const SimulatedDisk& before, const Run& run, std::size_t first,
                                   std::size_t most) {
  std::vector<SimulatedDisk> disks;
  SimulatedDisk disk = before;
  std::size_t applied = 0;
  for (std::size_t call = first; call <= run.calls.size() && disks.size() < most; ++call) {
    const std::size_t count =
        call < run.calls.size() ? run.calls[call].changesBefore : run.changes.size();
    for (; applied < count; ++applied) {
      disk.apply(run.changes[applied]);
    }
    disks.push_back(disk);
  }
  return disks;
}

}  // namespace accounts
