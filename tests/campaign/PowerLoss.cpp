#include "tests/campaign/PowerLoss.h"

#include <algorithm>
#include <map>
#include <set>
#include <string>

namespace accounts {

namespace {

using Kind = DiskChange::Kind;

/// Up to so many pending changes of names, every subset is tried.
constexpr std::size_t kMostNamesForAllSubsets = 6;
/// Up to so many combinations of contents, all are tried.
constexpr std::size_t kMostCombinations = 216;

/// The directory whose order of changes a change of a name belongs to.
std::size_t directoryOf(const DiskChange& change) {
  return change.isOfTwoNames() ? change.newDirectory : change.directory;
}

void addReachable(const SimulatedDisk& disk, std::size_t number, std::set<std::size_t>& reachable) {
  for (const auto& [name, entry] : disk.inode(number).entries) {
    reachable.insert(entry);
    addReachable(disk, entry, reachable);
  }
}

}  // namespace

PowerLoss::PowerLoss(const SimulatedDisk& before, const std::vector<DiskChange>& changes)
    : changes_(changes), medium_(before), newest_(before) {}

void PowerLoss::advance(const DiskChange& change, std::size_t index) {
  isOnMedium_.push_back(false);
  if (change.kind == Kind::Synchronize) {
    for (std::size_t earlier = 0; earlier < index; ++earlier) {
      const DiskChange& each = changes_[earlier];
      if (each.isOfNames() && (each.directory == change.inode ||
                               (each.isOfTwoNames() && each.newDirectory == change.inode))) {
        isOnMedium_[earlier] = true;
      }
    }
    if (std::erase(changedFiles_, change.inode) != 0) {
      setContents(medium_, change.inode, contentsOf(newest_, change.inode));
    }
  } else if (change.isOfContents()) {
    newest_.apply(change);
    if (std::ranges::find(changedFiles_, change.inode) == changedFiles_.end()) {
      changedFiles_.push_back(change.inode);
    }
  } else if (!change.isOfNames()) {
    newest_.apply(change);
    medium_.apply(change);
  }
}

void PowerLoss::forEachDiskAfter(std::size_t count,
                                 const std::function<void(const SimulatedDisk&)>& take) {
  for (; count_ < count; ++count_) {
    advance(changes_[count_], count_);
  }
  std::vector<std::size_t> pending;
  for (std::size_t index = 0; index < count; ++index) {
    if (changes_[index].isOfNames() && !isOnMedium_[index]) {
      pending.push_back(index);
    }
  }
  for (const Selection& selection : nameSelections(pending)) {
    Selection names = isOnMedium_;
    for (std::size_t index = 0; index < pending.size(); ++index) {
      names[pending[index]] = selection[index];
    }
    SimulatedDisk disk = diskWithNames(names);
    // A file does not get another one's number as long as the other one's name is on the medium.
    if (disk.hasDistinctNumbers()) {
      forEachContents(disk, take);
    }
  }
}

std::vector<PowerLoss::Selection> PowerLoss::nameSelections(
    const std::vector<std::size_t>& pending) const {
  const std::size_t size = pending.size();
  std::set<Selection> selections;
  if (size <= kMostNamesForAllSubsets) {
    for (std::size_t bits = 0; bits < std::size_t{1} << size; ++bits) {
      Selection selection(size);
      for (std::size_t index = 0; index < size; ++index) {
        selection[index] = (bits >> index & 1U) != 0;
      }
      selections.insert(selection);
    }
    return {selections.begin(), selections.end()};
  }
  for (const bool others : {false, true}) {
    selections.insert(Selection(size, others));
    for (std::size_t index = 0; index < size; ++index) {
      Selection allButOne(size, others);
      allButOne[index] = !others;
      selections.insert(allButOne);
      // The directory's changes up to this one, none of its later ones.
      Selection beginning(size, others);
      for (std::size_t other = 0; other < size; ++other) {
        if (directoryOf(changes_[pending[other]]) == directoryOf(changes_[pending[index]])) {
          beginning[other] = other <= index;
        }
      }
      selections.insert(beginning);
    }
  }
  return {selections.begin(), selections.end()};
}

SimulatedDisk PowerLoss::diskWithNames(const Selection& isOnMedium) const {
  SimulatedDisk disk = medium_;
  for (std::size_t index = 0; index < isOnMedium.size(); ++index) {
    if (isOnMedium[index]) {
      disk.apply(changes_[index]);
    }
  }
  return disk;
}

PowerLoss::Contents PowerLoss::contentsOf(const SimulatedDisk& disk, std::size_t inode) {
  return {disk.inode(inode).contents, disk.inode(inode).modified};
}

void PowerLoss::setContents(SimulatedDisk& disk, std::size_t inode, const Contents& contents) {
  disk.setContents(inode, contents.bytes, contents.modified);
}

std::vector<PowerLoss::Contents> PowerLoss::contentsVariants(std::size_t inode) const {
  const auto [newest, modified] = contentsOf(newest_, inode);
  const Contents old = contentsOf(medium_, inode);
  const std::string half = newest.substr(0, newest.size() / 2);
  const std::string rest(newest.size() - half.size(), '\0');
  std::vector<Contents> variants = {old};
  for (const std::string& bytes :
       {newest, half, half + rest, std::string(newest.size(), '\0'), std::string()}) {
    if (std::ranges::find(variants, bytes, &Contents::bytes) == variants.end()) {
      variants.push_back({bytes, modified});
    }
  }
  return variants;
}

void PowerLoss::forEachContents(SimulatedDisk& disk,
                                const std::function<void(const SimulatedDisk&)>& take) const {
  std::set<std::size_t> reachable;
  addReachable(disk, SimulatedDisk::kRoot, reachable);
  std::map<std::size_t, std::vector<Contents>> variants;
  std::size_t combinations = 1;
  for (const std::size_t inode : changedFiles_) {
    if (reachable.contains(inode)) {
      combinations *= variants.emplace(inode, contentsVariants(inode)).first->second.size();
    }
  }
  if (combinations <= kMostCombinations) {
    for (std::size_t combination = 0; combination < combinations; ++combination) {
      std::size_t rest = combination;
      for (const auto& [inode, each] : variants) {
        setContents(disk, inode, each[rest % each.size()]);
        rest /= each.size();
      }
      take(disk);
    }
    return;
  }
  for (const bool othersAreNew : {false, true}) {
    const auto reset = [&](std::size_t inode) {
      setContents(disk, inode, contentsOf(othersAreNew ? newest_ : medium_, inode));
    };
    for (const auto& [inode, each] : variants) {
      reset(inode);
    }
    for (const auto& [inode, each] : variants) {
      for (const Contents& contents : each) {
        setContents(disk, inode, contents);
        take(disk);
      }
      reset(inode);
    }
  }
}

}  // namespace accounts
