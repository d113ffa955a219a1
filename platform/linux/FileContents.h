#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PathFailure.h"
#include "propertylist/PropertyListLimits.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// No file larger than this is read or copied.
inline constexpr std::size_t kLargestFileSize = kMaximumFileSize;

/// What stat says of an open file. `path` is for the error's text, here and below.
OrFailure<struct stat> fileStatus(const FileDescriptor& file, std::string_view path);

/// The bytes of an open regular file from its position to its end. A failure when reading fails or
/// there are more than kLargestFileSize.
OrFailure<std::string> readContents(const FileDescriptor& file, std::string_view path);

/// The name that stands for standard input, or output, where a file of the host is named.
inline constexpr const char* kStandardStream = "-";

/// Whether a named pipe is read, which waits for whoever writes it, or is no file to be read.
enum class Pipes : std::uint8_t { Read, Refuse };

/// The bytes of a file of the host, outside any device root: of a regular file, of standard input
/// (kStandardStream) or of a pipe, which is read to its end. A failure when it is missing,
/// unreadable, too large or something else. Only for a pipe opening waits.
OrFailure<std::string> readHostFile(const std::string& path, Pipes pipes = Pipes::Read);

/// How a message names what readHostFile() reads.
std::string nameOfInput(const std::string& path);

/// Writes all bytes to an open file, waiting for it where it must, and returns 0 or the error
/// number. A part may have been written after a failure.
int writeAll(int descriptor, std::string_view bytes);
/// The same for the bytes of a property list, which are made as they are written.
int writeAll(int descriptor, const SerializedPropertyList& contents);

/// Copies the bytes of one open regular file to another; at most kLargestFileSize.
Result copyContents(const FileDescriptor& source, std::string_view sourcePath,
                    const FileDescriptor& destination, std::string_view destinationPath);

/// Waits until the contents of an open file or directory are on the medium, and returns 0 or the
/// error number.
int flush(const FileDescriptor& file);
/// The same for the names in an open directory. Some file systems have nothing to flush for one and
/// say so with EINVAL; that is no error.
int flushDirectory(const FileDescriptor& directory);

}  // namespace accounts
