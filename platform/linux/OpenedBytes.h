#pragma once

#include <string>
#include <utility>

#include "platform/DeviceSnapshot.h"
#include "platform/linux/FileDescriptor.h"

namespace accounts {

/// The contents of an open regular file. They are read at their own positions, so that several
/// processes may share the descriptor.
class OpenedBytes final : public ReadableBytes {
 public:
  /// `path` is for errors.
  OpenedBytes(FileDescriptor file, std::string path)
      : file_(std::move(file)), path_(std::move(path)) {}

  [[nodiscard]] const FileDescriptor& file() const { return file_; }
  Result giveTo(const Taker& take) const override;

 private:
  FileDescriptor file_;
  std::string path_;
};

/// A part of an open file, such as one file's new contents among those of several.
class PartOfOpenedBytes final : public ReadableBytes {
 public:
  /// `file` must outlive this. `path` is for errors.
  PartOfOpenedBytes(const FileDescriptor& file, std::uint64_t offset, std::uint64_t length,
                    std::string path)
      : file_(file), offset_(offset), length_(length), path_(std::move(path)) {}

  Result giveTo(const Taker& take) const override;

 private:
  const FileDescriptor& file_;
  std::uint64_t offset_;
  std::uint64_t length_;
  std::string path_;
};

}  // namespace accounts
