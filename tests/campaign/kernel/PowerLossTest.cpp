#include "tests/campaign/PowerLoss.h"

#include <fcntl.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <set>
#include <string>
#include <utility>

#include "tests/campaign/SimulatedKernel.h"

namespace accounts {
namespace {

/// What the names "old" and "new" of a directory hold, with "-" for nothing.
using Pair = std::pair<std::string, std::string>;

class PowerLossTest : public testing::Test {
 protected:
  PowerLossTest() : kernel(disk(), 1) {
    kernel.start({}, SimulatedKernel::Recording::On);
    home = kernel.openBeneath("/home", O_RDONLY | O_DIRECTORY);
  }

  static SimulatedDisk disk() {
    SimulatedDisk disk;
    disk.addFile("/home/old", "old");
    return disk;
  }
  void makeNew(bool isFlushed) {
    const int file = kernel.openAt(home, "new", O_RDWR | O_CREAT | O_EXCL, 0600);
    ASSERT_EQ(kernel.write(file, "new!"), 4);
    if (isFlushed) {
      ASSERT_EQ(kernel.synchronize("fsync", file), 0);
      ASSERT_EQ(kernel.synchronize("fsync", home), 0);
    }
  }
  void exchange() { ASSERT_EQ(kernel.rename(home, "new", home, "old", RENAME_EXCHANGE), 0); }

  /// Everything that a loss of power now may leave.
  std::set<Pair> left() {
    const SimulatedDisk before = disk();
    PowerLoss loss(before, kernel.changes());
    std::set<Pair> pairs;
    loss.forEachDiskAfter(kernel.changes().size(), [&](const SimulatedDisk& disk) {
      pairs.emplace(disk.contentsOf("/home/old").value_or("-"),
                    disk.contentsOf("/home/new").value_or("-"));
    });
    return pairs;
  }

  SimulatedKernel kernel;
  int home = 0;
};

TEST_F(PowerLossTest, AnExchangeHasHappenedOrNotButNeverByHalf) {
  makeNew(true);
  exchange();

  EXPECT_EQ(left(), (std::set<Pair>{{"old", "new!"}, {"new!", "old"}}));
}

TEST_F(PowerLossTest, AnExchangeHasHappenedOnceItsDirectoryIsFlushed) {
  makeNew(true);
  exchange();
  ASSERT_EQ(kernel.synchronize("fsync", home), 0);

  EXPECT_EQ(left(), (std::set<Pair>{{"new!", "old"}}));
}

TEST_F(PowerLossTest, AnExchangeBetweenDirectoriesIsThereWithEitherOfThem) {
  makeNew(true);
  ASSERT_EQ(kernel.makeDirectory(home, "away", 0700), 0);
  ASSERT_EQ(kernel.synchronize("fsync", home), 0);
  const int away = kernel.openAt(home, "away", O_RDONLY | O_DIRECTORY, 0);
  ASSERT_EQ(kernel.link(home, "old", away, "older", 0), 0);
  ASSERT_EQ(kernel.synchronize("fsync", away), 0);
  ASSERT_EQ(kernel.rename(home, "new", away, "older", RENAME_EXCHANGE), 0);
  ASSERT_EQ(kernel.synchronize("fsync", away), 0);

  EXPECT_EQ(left(), (std::set<Pair>{{"old", "old"}}));
}

TEST_F(PowerLossTest, AnExchangeOfWhatIsNotFlushedMayLeaveAnEmptyFile) {
  makeNew(false);
  exchange();

  EXPECT_TRUE(left().contains(Pair("", "old")));
}

TEST_F(PowerLossTest, NoTwoFilesHaveOneNumber) {
  ASSERT_EQ(kernel.unlink(home, "old", 0), 0);
  makeNew(false);

  EXPECT_TRUE(left().contains(Pair("-", "new!")));
  EXPECT_FALSE(left().contains(Pair("old", "new!")));
}

TEST_F(PowerLossTest, ContentsThatAreNotThereDoNotModifyAFile) {
  const std::uint64_t before = disk().inode(*disk().find("/home/old")).modified;
  const int file = kernel.openAt(home, "old", O_RDWR, 0);
  ASSERT_EQ(kernel.write(file, "OLD"), 3);
  const SimulatedDisk medium = disk();
  PowerLoss loss(medium, kernel.changes());

  loss.forEachDiskAfter(kernel.changes().size(), [&](const SimulatedDisk& disk) {
    EXPECT_EQ(disk.inode(*disk.find("/home/old")).modified == before,
              disk.contentsOf("/home/old") == "old");
  });
}

}  // namespace
}  // namespace accounts
