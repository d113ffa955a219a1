#include "platform/linux/FileContents.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>

#include "tests/platform/DeviceFixture.h"
#include "tests/platform/WaitingThread.h"

namespace accounts {
namespace {

struct Pipe {
  Pipe() : Pipe(made()) {}
  FileDescriptor readingEnd;
  FileDescriptor writingEnd;

 private:
  struct Numbers {
    int ends[2] = {-1, -1};
  };
  static Numbers made() {
    Numbers numbers;
    EXPECT_EQ(::pipe2(numbers.ends, O_CLOEXEC), 0);
    return numbers;
  }
  explicit Pipe(Numbers numbers) : readingEnd(numbers.ends[0]), writingEnd(numbers.ends[1]) {}
};

class FileContentsTest : public DeviceFixture {};

TEST_F(FileContentsTest, AFileOfTheLargestSizeIsRead) {
  makeFile("/large", "");
  std::filesystem::resize_file(onHost("/large"), kLargestFileSize);
  const FileDescriptor file(::open(onHost("/large").c_str(), O_RDONLY | O_CLOEXEC));

  const auto contents = readContents(file, "/large");

  ASSERT_TRUE(contents);
  EXPECT_EQ(contents->size(), kLargestFileSize);
}

TEST_F(FileContentsTest, AFileThatHoldsMoreThanItsSizeSaysIsReadUpToTheLargestSizeOnly) {
  const FileDescriptor endless(::open("/dev/zero", O_RDONLY | O_CLOEXEC));

  EXPECT_EQ(failureOf(readContents(endless, "/file")).text, "Cannot read /file: File too large");
}

TEST_F(FileContentsTest, ASignalDoesNotEndAReading) {
  Pipe pipe;
  OrFailure<std::string> contents;
  WaitingThread reader([&] { contents = readContents(pipe.readingEnd, "/pipe"); });

  reader.interrupt();
  EXPECT_FALSE(reader.hasEnded());
  EXPECT_EQ(::write(pipe.writingEnd.number(), "contents", 8), 8);
  ::close(pipe.writingEnd.release());
  reader.join();

  EXPECT_EQ(contents, "contents") << failureOf(contents).text;
}

TEST_F(FileContentsTest, WhatCannotBeFlushedIsAnErrorOfAFileAndNoneOfADirectory) {
  // As a directory of some file systems does, a pipe answers that it is never flushed.
  const Pipe pipe;
  EXPECT_EQ(flush(pipe.readingEnd), EINVAL);
  EXPECT_EQ(flushDirectory(pipe.readingEnd), 0);
}

TEST_F(FileContentsTest, AnyOtherFailureToFlushADirectoryIsAnError) {
  const FileDescriptor forItsPathAlone(::open("/", O_PATH | O_CLOEXEC));
  EXPECT_EQ(flushDirectory(forItsPathAlone), EBADF);
}

}  // namespace
}  // namespace accounts
