#include "tests/platform/DevicePlacesFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

class InformationFileTest : public DevicePlacesTest {
 protected:
  std::string write(const std::string& text, const std::string& name = "name.txt") {
    return textOf(places.writeInformationFile(name, FakeBytes(text)));
  }

  const std::string directory = path(DevicePlace::InformationDirectory);
};

TEST_F(InformationFileTest, TheDirectoryIsEverybodysWhateverTheMask) {
  const WithMask mask(077);
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(permissionsOf(directory), 0777u);
  EXPECT_EQ(contentsOf(directory + "/name.txt"), "information");
}

TEST_F(InformationFileTest, TheDirectoryIsMadeAloneToo) {
  const WithMask mask(077);
  EXPECT_EQ(textOf(places.makeInformationDirectory()), "(none)");
  EXPECT_EQ(permissionsOf(directory), 0777u);
  EXPECT_TRUE(namesIn(directory).empty());
  EXPECT_EQ(textOf(places.makeInformationDirectory()), "(none)") << "and is there already";
}

TEST_F(InformationFileTest, AFileIsItsOwnersAloneWhateverTheMask) {
  const WithMask mask(0777);
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(permissionsOf(directory + "/name.txt"), 0600u);
}

TEST_F(InformationFileTest, MissingParentsAreMade) {
  fs::remove_all(onHost("/var/mobile/Library/Logs"));
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(contentsOf(directory + "/name.txt"), "information");
}

TEST_F(InformationFileTest, ADirectoryThatIsThereStaysAsItIs) {
  makeDirectory(directory);
  fs::permissions(onHost(directory), fs::perms(0750));
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(permissionsOf(directory), 0750u);
}

TEST_F(InformationFileTest, AFileOfTheSameNameIsReplaced) {
  makeFile(directory + "/name.txt", "older");
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(contentsOf(directory + "/name.txt"), "information");
  EXPECT_EQ(namesIn(directory).size(), 1u);
}

TEST_F(InformationFileTest, ALinkOfTheSameNameIsReplacedAndNotFollowed) {
  makeFile("/var/elsewhere", "elsewhere");
  makeLink(directory + "/name.txt", "/var/elsewhere");
  EXPECT_EQ(write("information"), "(none)");
  EXPECT_EQ(contentsOf("/var/elsewhere"), "elsewhere");
}

TEST_F(InformationFileTest, AFailureLeavesNothing) {
  makeDirectory(directory + "/name.txt");
  EXPECT_EQ(write("information"), "Cannot write " + directory + "/name.txt: Is a directory");
  EXPECT_EQ(textOf(places.writeInformationFile(
                "other.txt", FakeBytes("half of it", Failure{EIO, "Cannot read it"}))),
            "Cannot read it");
  EXPECT_EQ(namesIn(directory), std::vector<std::string>{"name.txt"});
}

TEST_F(InformationFileTest, AFileInTheDirectorysPlaceIsAFailure) {
  makeFile(directory, "a file");
  EXPECT_EQ(write("information"), "Cannot create the directory " + directory + ": File exists");
}

}  // namespace
}  // namespace accounts
