#include <sys/mount.h>
#include <sys/stat.h>

#include <fstream>

#include "tests/program/AccountsctlFixture.h"

namespace accounts {
namespace {

class AccountsctlConvert : public AccountsctlFixture {
 protected:
  static PropertyValue content() {
    return PropertyDictionary{{"Password", "swordfish"}, {"Version", 12}};
  }
  [[nodiscard]] mode_t permissions(std::string_view name) const {
    struct stat status = {};
    EXPECT_EQ(stat(path(name).c_str(), &status), 0);
    return status.st_mode & 07777;
  }
};

TEST_F(AccountsctlConvert, XMLAndBackGivesTheSameBytes) {
  const std::string binary = write("in", content());

  EXPECT_EQ(run({"convert", binary, path("xml"), "--to", "xml"}).exitStatus, 0);
  EXPECT_EQ(run({"convert", path("xml"), path("out"), "--to", "binary"}).exitStatus, 0);

  EXPECT_TRUE(readText("xml").starts_with("<?xml "));
  EXPECT_EQ(readText("out"), readText("in"));
}

TEST_F(AccountsctlConvert, NothingIsHidden) {
  run({"convert", write("in", content()), path("out"), "--to", "xml"});

  EXPECT_EQ(readValue("out"), content());
}

TEST_F(AccountsctlConvert, StandardStreamsAreInputAndOutput) {
  const std::string binary = write("in", content());

  const ProgramResult result =
      runRedirected({"convert", "-", "-", "--to", "xml"}, "< '" + binary + "'");

  EXPECT_EQ(result.exitStatus, 0);
  writeText("out", result.output);
  EXPECT_EQ(readValue("out"), content());
}

TEST_F(AccountsctlConvert, ANewFileCanBeReadByItsOwnerAlone) {
  run({"convert", write("in", content()), path("out"), "--to", "xml"});

  EXPECT_EQ(permissions("out"), 0600U);
  EXPECT_EQ(files(), (std::vector<std::string>{"in", "out"}));
}

TEST_F(AccountsctlConvert, AReplacedFileKeepsItsPermissions) {
  writeText("out", "old");
  ASSERT_EQ(chmod(path("out").c_str(), 0640), 0);

  run({"convert", write("in", content()), path("out"), "--to", "xml"});

  EXPECT_EQ(permissions("out"), 0640U);
  EXPECT_EQ(readValue("out"), content());
}

TEST_F(AccountsctlConvert, AFileCanBeConvertedInPlace) {
  const std::string file = write("file", content());

  EXPECT_EQ(run({"convert", file, file, "--to", "xml"}).exitStatus, 0);

  EXPECT_TRUE(readText("file").starts_with("<?xml "));
}

TEST_F(AccountsctlConvert, ALinkToAFileLeadsToIt) {
  writeText("target", "old");
  std::filesystem::create_symlink("target", path("link"));

  EXPECT_EQ(run({"convert", write("in", content()), path("link"), "--to", "xml"}).exitStatus, 0);

  EXPECT_TRUE(std::filesystem::is_symlink(path("link")));
  EXPECT_EQ(readValue("target"), content());
}

TEST_F(AccountsctlConvert, ALinkToNothingIsRefused) {
  std::filesystem::create_symlink("nowhere", path("link"));

  expectRefused(run({"convert", write("in", content()), path("link"), "--to", "xml"}),
                kCannotCreate, "link");
  EXPECT_EQ(files(), (std::vector<std::string>{"in", "link"}));
}

TEST_F(AccountsctlConvert, OnlyARegularFileIsReplaced) {
  const std::string file = write("in", content());
  std::filesystem::create_directory(path("directory"));

  for (const std::string& output : {path("directory"), std::string("/dev/null")}) {
    expectRefused(run({"convert", file, output, "--to", "xml"}), kCannotCreate, output);
  }
}

TEST_F(AccountsctlConvert, AMissingDirectoryIsAnError) {
  expectRefused(run({"convert", write("in", content()), path("none/out"), "--to", "xml"}),
                kCannotCreate, "No such file or directory");
}

TEST_F(AccountsctlConvert, AMalformedFileIsRefusedAndTheOutputStays) {
  writeText("out", "old");

  expectRefused(run({"convert", writeText("in", "bplist00"), path("out"), "--to", "xml"}),
                kMalformedInput, "binary property list");
  EXPECT_EQ(readText("out"), "old");
}

TEST_F(AccountsctlConvert, WhatXMLCannotHoldIsRefusedAndTheOutputStays) {
  writeText("out", "old");
  const std::string file = write("in", PropertyDictionary{{"date", PropertyDate{0.5}}});

  expectRefused(run({"convert", file, path("out"), "--to", "xml"}), kMalformedInput,
                "a date that is not a whole second of the years 0 to 9999 at /date");
  EXPECT_EQ(readText("out"), "old");
  EXPECT_EQ(run({"convert", file, path("out"), "--to", "binary"}).exitStatus, 0);
}

TEST_F(AccountsctlConvert, WithJSONTheReportIsOneObject) {
  const nlohmann::json object =
      onlyObject(run({"convert", write("in", content()), path("out"), "--to", "xml", "--json"}));

  EXPECT_EQ(object["command"], "convert");
  EXPECT_EQ(object["output"], path("out"));
  EXPECT_EQ(object["exitStatus"], 0);
}

TEST_F(AccountsctlConvert, AJSONReportAndTheFileCannotShareStandardOutput) {
  const ProgramResult result =
      run({"convert", write("in", content()), "-", "--to", "xml", "--json"});

  EXPECT_EQ(result.exitStatus, kUnusableArguments);
  EXPECT_NE(onlyObject(result)["error"].get<std::string>().find("standard output"),
            std::string::npos);
}

TEST_F(AccountsctlConvert, AFullDiskLeavesTheOutputAsItWas) {
  std::filesystem::create_directory(path("disk"));
  if (mount("none", path("disk").c_str(), "tmpfs", 0, "size=64k") != 0) {
    GTEST_SKIP() << "This system lets the test mount no file system.";
  }
  writeText("disk/out", "old");
  const std::string file = write("in", PropertyDictionary{{"text", std::string(100'000, 'x')}});

  expectRefused(run({"convert", file, path("disk/out"), "--to", "xml"}), kMayPass,
                "No space left on device");

  EXPECT_EQ(readText("disk/out"), "old");
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(path("disk")), {}), 1);
  umount2(path("disk").c_str(), MNT_DETACH);
}

}  // namespace
}  // namespace accounts
