#include "platform/linux/OpenedBytes.h"

#include <fcntl.h>
#include <unistd.h>

#include "tests/platform/DeviceFixture.h"

namespace accounts {
namespace {

class OpenedBytesTest : public DeviceFixture {
 protected:
  [[nodiscard]] FileDescriptor opened(const std::string& contents, int flags = O_RDONLY) const {
    makeFile("/file", contents);
    return FileDescriptor(::open(onHost("/file").c_str(), flags | O_CLOEXEC));
  }
  static std::string all(const ReadableBytes& bytes) {
    std::string text;
    EXPECT_TRUE(bytes.giveTo([&](std::string_view piece) {
      text.append(piece);
      return true;
    }));
    return text;
  }
};

TEST_F(OpenedBytesTest, AFileIsReadFromItsBeginningAsOftenAsIsAskedFor) {
  const OpenedBytes bytes(opened("contents"), "/file");
  EXPECT_EQ(all(bytes), "contents");
  EXPECT_EQ(all(bytes), "contents");
}

TEST_F(OpenedBytesTest, ReadingMovesNoPositionThatAnotherProcessShares) {
  const OpenedBytes bytes(opened("contents"), "/file");
  static_cast<void>(all(bytes));
  EXPECT_EQ(::lseek(bytes.file().number(), 0, SEEK_CUR), 0);
}

TEST_F(OpenedBytesTest, AFileOfManyPiecesIsReadWhole) {
  std::string contents;
  for (int number = 0; contents.size() < 500'000; ++number) {
    contents += std::to_string(number);
  }
  const OpenedBytes bytes(opened(contents), "/file");
  EXPECT_EQ(all(bytes), contents);
}

TEST_F(OpenedBytesTest, WhoWantsNoMoreGetsNoMore) {
  const OpenedBytes bytes(opened(std::string(500'000, 'x')), "/file");
  int pieces = 0;
  EXPECT_TRUE(bytes.giveTo([&](std::string_view) { return ++pieces < 2; }));
  EXPECT_EQ(pieces, 2);
}

TEST_F(OpenedBytesTest, WhatCannotBeReadSaysWhy) {
  const OpenedBytes bytes(opened("contents", O_WRONLY), "/file");
  const Failure failure = failureOf(bytes.giveTo([](std::string_view) { return true; }));
  EXPECT_EQ(failure.number, EBADF);
  EXPECT_EQ(failure.text, "Cannot read /file: Bad file descriptor");
}

TEST_F(OpenedBytesTest, APartIsWhatItSays) {
  const FileDescriptor file = opened("contents");
  EXPECT_EQ(all(PartOfOpenedBytes(file, 3, 4, "/file")), "tent");
  EXPECT_EQ(all(PartOfOpenedBytes(file, 3, 0, "/file")), "");
  EXPECT_EQ(all(PartOfOpenedBytes(file, 6, 100, "/file")), "ts") << "where the file ends";
}

}  // namespace
}  // namespace accounts
