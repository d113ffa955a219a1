#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/stat.h>

#include <filesystem>
#include <functional>
#include <iostream>

#include "platform/linux/FileDescriptor.h"
#include "tests/fakes/Sanitizers.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"
#include "tests/propertylist/PropertyListTesting.h"

// Small files that stand for much, because their objects share children or long texts: whatever is
// done with one takes little more than with an ordinary file of its size.

namespace accounts {
namespace {

constexpr std::uint64_t kMebibyte = std::uint64_t{1} << 20;
/// What one may take more than an ordinary file of its size.
constexpr std::uint64_t kMostMemoryBeyond = 64 * kMebibyte;
constexpr std::uint64_t kMostBytesBeyond = 64 * kMebibyte;

std::string text(std::string_view content) {
  std::string encoded = {'\x5F', '\x11', static_cast<char>(content.size() >> 8),
                         static_cast<char>(content.size())};
  return encoded.append(content);
}

/// A store that brings an account: the account's dictionary holds what is given, under a key that
/// nobody knows.
std::string store(BinaryFile& file, std::size_t unknown, std::size_t padding) {
  const auto add = [&file](std::string_view content) { return file.add(text(content)); };
  const std::size_t account = [&] {
    const std::size_t type = add("Type");
    const std::size_t identifier = add("Identifier");
    const std::size_t otherIdentifier = add("uniqueId");
    const std::size_t otherType = add("AccountType");
    const std::size_t key = add("Unknown");
    const std::size_t name = add("A");
    return file.addContainer('\xD5', {type, identifier, otherIdentifier, otherType, key,
                                      add("CalDAV"), name, name, add("IMAPAccount"), unknown});
  }();
  const std::size_t accounts = file.addContainer(kArrayOfOne, {account});
  const std::size_t version = file.add("\x10\x03");
  file.addContainer('\xD4', {add("Accounts"), add("MailAccounts"), add("Version"), add("Unknown"),
                             accounts, accounts, version, add(std::string(padding, 'p'))});
  return file.build();
}

/// Each level holds the one below twice.
std::string withDoublingArrays(std::size_t levels, std::size_t padding) {
  BinaryFile file;
  file.setOffsetSize(3);
  std::size_t array = file.add("\x09");
  for (std::size_t level = 0; level < levels; ++level) {
    array = file.addContainer(kArrayOfTwo, {array, array});
  }
  return store(file, array, padding);
}

std::string withDoublingDictionaries(std::size_t levels, std::size_t padding) {
  BinaryFile file;
  file.setOffsetSize(3);
  const std::size_t first = file.add(text("Password"));
  const std::size_t second = file.add(text("Identifier"));
  std::size_t dictionary = file.add("\x09");
  for (std::size_t level = 0; level < levels; ++level) {
    dictionary = file.addContainer('\xD2', {first, second, dictionary, dictionary});
  }
  return store(file, dictionary, padding);
}

/// An array that holds a long text as often as its length is.
std::string withLongText(std::size_t length, std::size_t padding) {
  BinaryFile file;
  file.setOffsetSize(3);
  const std::size_t content = file.add(text(std::string(length, 'T')));
  std::string array = {'\xAF', '\x11', static_cast<char>(length >> 8), static_cast<char>(length)};
  return store(file, file.add(array.append(length, static_cast<char>(content))), padding);
}

/// An account that its store holds many times, with children of the same kind.
std::string withOneAccountOften(std::size_t count, std::size_t padding) {
  BinaryFile file;
  file.setOffsetSize(3);
  const auto add = [&file](std::string_view content) { return file.add(text(content)); };
  const std::size_t type = add("Type");
  const std::size_t calDAV = add("CalDAV");
  const std::size_t children = add("ChildAccounts");
  const std::size_t child = file.addContainer(kDictionaryOfOne, {type, calDAV});
  const std::string often = std::string{'\xAF', '\x10', static_cast<char>(count)};
  const std::size_t list = file.add(often + std::string(count, static_cast<char>(child)));
  const std::size_t account = file.addContainer('\xD2', {type, children, calDAV, list});
  const std::size_t accounts = file.add(often + std::string(count, static_cast<char>(account)));
  const std::size_t version = file.add("\x10\x03");
  file.addContainer('\xD4', {add("Accounts"), add("MailAccounts"), add("Version"), add("Unknown"),
                             accounts, accounts, version, add(std::string(padding, 'p'))});
  return file.build();
}

/// What is no account, again and again.
std::string withNoAccountOften(std::size_t count, std::size_t padding) {
  BinaryFile file;
  file.setOffsetSize(3);
  const auto add = [&file](std::string_view content) { return file.add(text(content)); };
  std::string list = "\xAF\x12";
  BinaryFile::appendNumber(list, count, 4);
  const std::size_t nothing = file.addContainer('\xD0', {});
  const std::size_t accounts = file.add(list.append(count, static_cast<char>(nothing)));
  const std::size_t version = file.add("\x10\x03");
  file.addContainer('\xD4', {add("Accounts"), add("MailAccounts"), add("Version"), add("Unknown"),
                             accounts, accounts, version, add(std::string(padding, 'p'))});
  return file.build();
}

/// As many accounts as a file of a size can have if each has bytes of its own.
std::string ordinaryFile(std::size_t size) {
  BinaryFile file;
  file.setOffsetSize(3);
  file.setReferenceSize(2);
  const auto container = [&file](std::string marker, const std::vector<std::size_t>& references) {
    for (const std::size_t reference : references) {
      BinaryFile::appendNumber(marker, reference, 2);
    }
    return file.add(marker);
  };
  const std::size_t type = file.add(text("Type"));
  const std::size_t calDAV = file.add(text("CalDAV"));
  constexpr std::size_t kSizeOfAnAccount = 10;
  std::vector<std::size_t> accounts;
  for (std::size_t count = 0; count < size / kSizeOfAnAccount; ++count) {
    accounts.push_back(container("\xD1", {type, calDAV}));
  }
  std::string list = "\xAF\x12";
  BinaryFile::appendNumber(list, accounts.size(), 4);
  const std::size_t all = container(list, accounts);
  const std::size_t key = file.add(text("Accounts"));
  const std::size_t version = file.add(text("Version"));
  container("\xD2", {key, version, all, file.add("\x10\x03")});
  return file.build();
}

struct SmallFile {
  std::string name;
  /// One that stands for the more the larger the number is, and that has so many bytes besides.
  std::function<std::string(std::size_t number, std::size_t padding)> make;
  /// The largest number that it can be made for.
  std::size_t most = 0;
};

void PrintTo(const SmallFile& file, std::ostream* stream) {
  *stream << file.name;
}

/// The largest of them that is read.
std::string largestReadable(const SmallFile& kind, std::size_t padding) {
  const auto isRead = [&](std::size_t number) {
    return readBinaryPropertyList(kind.make(number, padding)).has_value();
  };
  std::size_t read = 1;
  std::size_t refused = kind.most + 1;
  while (refused - read > 1) {
    const std::size_t between = read + (refused - read) / 2;
    (isRead(between) ? read : refused) = between;
  }
  return kind.make(read, padding);
}

class SmallFiles : public DeviceRootFixture,
                   public testing::WithParamInterface<std::tuple<SmallFile, std::size_t>> {
 protected:
  SmallFiles() : DeviceRootFixture(Medium::Memory) {}

  struct Cost {
    std::uint64_t memory = 0;
    std::uint64_t bytes = 0;
  };

  void put(const std::string& contents) const {
    for (const char* const path : {kSettingsPath, kLegacyMailPath}) {
      writeText(path, contents);
    }
  }

  [[nodiscard]] std::uint64_t bytesOnDevice() const {
    std::uint64_t bytes = 0;
    for (const std::string& file : files()) {
      bytes += std::filesystem::file_size(onThisMachine(file));
    }
    return bytes;
  }

  /// What a command costs on a device with these contents in its stores. The bytes are those that
  /// it wrote and those of the device afterwards.
  [[nodiscard]] Cost costOf(const std::vector<std::string>& words,
                            const std::string& contents) const {
    put(contents);
    ProgramCall call = {.program = words.front() == "run" || words.front() == "plan"
                                       ? migrationHost()
                                       : accountsctl(),
                        .arguments = words};
    for (std::string& word : call.arguments) {
      if (word == "ROOT") {
        word = root();
      } else if (word.starts_with("/")) {
        word = onThisMachine(word).string();
      }
    }
    // Not read here: a process counts what the one that started it had.
    const FileDescriptor output(memfd_create("output", MFD_CLOEXEC));
    Cost cost;
    waitForEnd(startProgram(call, output.number(), output.number()), call.timeLimit, &cost.memory);
    struct stat status = {};
    fstat(output.number(), &status);
    cost.bytes = bytesOnDevice() + static_cast<std::uint64_t>(status.st_size);
    return cost;
  }
};

const std::vector<std::string> kCommands[] = {
    {"run", "--root", "ROOT", "--channel", "-", "--report", "/report", "--html", "/page"},
    {"run", "--root", "ROOT", "--bare", "--channel", "-"},
    {"plan", "--root", "ROOT"},
    {"plan", "--root", "ROOT", "--json"},
    {"status", "--root", "ROOT"},
    {"show", kSettingsPath, "--properties", "--full"},
    {"show", kSettingsPath, "--json"},
    {"show", kSettingsPath, "--xml"},
    {"show", kLegacyMailPath, "--properties"},
    {"diff", kSettingsPath, "/other"},
    {"diff", kSettingsPath, "/other", "--json"},
    {"check", kSettingsPath},
    {"check", kLegacyMailPath, "--json"},
    {"convert", kSettingsPath, "-", "--to", "xml"},
    {"convert", kSettingsPath, "-", "--to", "binary"},
};

TEST_P(SmallFiles, TakeLittleMoreThanOrdinaryOnes) {
  const std::string contents = std::apply(largestReadable, GetParam());
  const std::string ordinary = ordinaryFile(contents.size());
  ASSERT_GT(contents.size(), 0U);
  write("/other", accountSettings(12));
  std::cout << contents.size() << " bytes\n";
  for (const std::vector<std::string>& command : kCommands) {
    std::string words;
    for (const std::string& word : command) {
      words += word + " ";
    }
    SCOPED_TRACE(words);
    const Cost expected = costOf(command, ordinary);

    const Cost cost = costOf(command, contents);

    std::cout << cost.memory / 1024 << " KiB of memory instead of " << expected.memory / 1024
              << ", " << cost.bytes / 1024 << " KiB written instead of " << expected.bytes / 1024
              << ": " << words << '\n';
    // The sanitizers' own memory goes with each allocation.
    if (!kWithSanitizers) {
      EXPECT_LE(cost.memory, expected.memory + kMostMemoryBeyond);
    }
    EXPECT_LE(cost.bytes, expected.bytes + kMostBytesBeyond);
  }
}

class SmallResult : public DeviceRootFixture {};

TEST_F(SmallResult, ThatCouldNotBeReadAgainIsNotWritten) {
  // In XML each text stands where it is; in the binary format all are one.
  const PropertyArray texts(std::vector<PropertyValue>(1000, std::string(1000, 't')));
  const std::string settings =
      writeXMLPropertyList(accountSettings(11, {PropertyDictionary{{"Identifier", "A"},
                                                                   {"Type", "CalDAV"},
                                                                   {"Class", "CalDAVAccount"},
                                                                   {"Texts", texts}}}))
          .value();
  writeText(kSettingsPath, settings);

  const ProgramResult result = migrate();

  EXPECT_EQ(result.exitStatus, kVerificationFailed);
  EXPECT_TRUE(result.hasErrorLine(
      "migration-host: The result stands for more values than a file of its size may"))
      << result.errors;
  EXPECT_EQ(readText(kSettingsPath), settings);
}

std::string nameOf(const testing::TestParamInfo<std::tuple<SmallFile, std::size_t>>& information) {
  const auto& [file, padding] = information.param;
  return file.name + "And" + std::to_string(padding) + "Bytes";
}

const SmallFile kNoAccountOften = {"NoAccountOften", withNoAccountOften, 1'000'000};

// With sanitizers each command takes several times as long.
const std::vector<std::size_t> kPaddings =
    kWithSanitizers ? std::vector<std::size_t>{0} : std::vector<std::size_t>{0, 8'000};

INSTANTIATE_TEST_SUITE_P(
    Kinds, SmallFiles,
    testing::Combine(
        testing::Values(SmallFile{"DoublingArrays", withDoublingArrays, 200},
                        SmallFile{"DoublingDictionaries", withDoublingDictionaries, 200},
                        SmallFile{"LongText", withLongText, 65'535},
                        SmallFile{"OneAccountOften", withOneAccountOften, 255}, kNoAccountOften),
        testing::ValuesIn(kPaddings)),
    nameOf);

// What takes most of a command's work for its size, in a file that is not so small. With sanitizers
// it would show nothing that the smaller ones do not, and take long.
const std::vector<std::size_t> kLargerPaddings =
    kWithSanitizers ? std::vector<std::size_t>{} : std::vector<std::size_t>{50'000};

INSTANTIATE_TEST_SUITE_P(Larger, SmallFiles,
                         testing::Combine(testing::Values(kNoAccountOften),
                                          testing::ValuesIn(kLargerPaddings)),
                         nameOf);

}  // namespace
}  // namespace accounts
