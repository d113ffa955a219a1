#pragma once

#include <cstddef>
#include <functional>
#include <vector>

#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// What a loss of power may leave of a recorded run, by what a Linux file system promises at least:
/// contents are on the medium after the file was synchronised, a name after its directory was. Of
/// what is not, any part may be there:
/// - of the changes of names every subset, so also those that keep the order within each directory,
///   as a journal does. When there are more than a few, the subsets are: for each directory every
///   beginning of its changes, combined with all or none of the others'; each change alone; all but
///   one;
/// - of each changed file the old contents, the new ones, half of them, half of them and then
///   zeroes, zeroes alone, or nothing. With several such files all combinations while they are few,
///   else one file at a time with the others old, and with the others new.
/// A rename or exchange happens or does not, in one step; permissions, owners and times that were
/// set are always there. A file says that it was modified when its contents that are there were
/// written.
class PowerLoss {
 public:
  /// `before` is what was on the medium when the run began, `changes` what the run recorded.
  PowerLoss(const SimulatedDisk& before, const std::vector<DiskChange>& changes);

  /// Calls `take` with every disk that a loss of power after the first `count` changes may leave.
  /// To be called with 0, 1, 2 and so on.
  void forEachDiskAfter(std::size_t count, const std::function<void(const SimulatedDisk&)>& take);

 private:
  using Selection = std::vector<bool>;

  void advance(const DiskChange& change, std::size_t index);
  [[nodiscard]] std::vector<Selection> nameSelections(
      const std::vector<std::size_t>& pending) const;
  [[nodiscard]] SimulatedDisk diskWithNames(const Selection& isOnMedium) const;
  void forEachContents(SimulatedDisk& disk,
                       const std::function<void(const SimulatedDisk&)>& take) const;
  struct Contents {
    std::string bytes;
    std::uint64_t modified = 0;
  };
  [[nodiscard]] static Contents contentsOf(const SimulatedDisk& disk, std::size_t inode);
  [[nodiscard]] std::vector<Contents> contentsVariants(std::size_t inode) const;
  static void setContents(SimulatedDisk& disk, std::size_t inode, const Contents& contents);

  const std::vector<DiskChange>& changes_;
  std::size_t count_ = 0;
  /// All inodes, with the names of the beginning and the contents that are on the medium.
  SimulatedDisk medium_;
  /// All inodes with their newest contents.
  SimulatedDisk newest_;
  /// For each change of a name so far, whether it is on the medium.
  Selection isOnMedium_;
  /// The files whose newest contents are not on the medium.
  std::vector<std::size_t> changedFiles_;
};

}  // namespace accounts
