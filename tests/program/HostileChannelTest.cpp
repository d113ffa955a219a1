#include <filesystem>

#include "tests/program/HostileRootFixture.h"

// The log channel is a file of the machine that whoever starts the host chooses, links included. It
// must neither keep a migration waiting nor stop it halfway.

namespace accounts {
namespace {

class HostileChannel : public DeviceRootFixture {
 protected:
  HostileChannel() { write(kSettingsPath, accountSettings(11)); }

  [[nodiscard]] std::string channel() const { return onThisMachine("/channel").string(); }

  /// The run is refused before anything is migrated.
  void expectRefused(std::string_view kind) const {
    ASSERT_EQ(hostileFileKind(kind).put(channel(), {}), std::nullopt);

    const ProgramResult result = migrate({"--channel", channel(), "--json"});

    EXPECT_EQ(result.exitStatus, kCannotCreate);
    EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
    EXPECT_TRUE(result.errors.starts_with("migration-host: Cannot open the log channel "))
        << result.errors;
    EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(11));
  }
};

TEST_F(HostileChannel, ThatIsANamedPipeWithoutAReaderIsRefusedAtOnce) {
  expectRefused("ANamedPipe");
}

TEST_F(HostileChannel, ThatIsADirectoryIsRefused) {
  expectRefused("ADirectory");
}

TEST_F(HostileChannel, ThatIsASocketIsRefused) {
  expectRefused("ASocket");
}

TEST_F(HostileChannel, ThatIsALinkToItselfIsRefused) {
  expectRefused("ALinkToItself");
}

TEST_F(HostileChannel, ThatIsFullDoesNotStopTheMigration) {
  EXPECT_EQ(migrate({"--channel", "/dev/full"}).exitStatus, 0);

  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(HostileChannel, ThatIsALinkIsWrittenWhereItLeads) {
  std::filesystem::create_symlink("elsewhere", channel());

  EXPECT_EQ(migrate({"--channel", channel()}).exitStatus, 0);

  EXPECT_NE(readText("/elsewhere"), "");
}

}  // namespace
}  // namespace accounts
