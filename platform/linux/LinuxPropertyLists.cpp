#include "platform/linux/LinuxPropertyLists.h"

#include <utility>

#include "platform/linux/DictionaryFile.h"
#include "platform/linux/FileContents.h"

namespace accounts {

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path) {
  PathError error;
  return readDictionary(path, error);
}

std::optional<PropertyDictionary> LinuxPropertyLists::readDictionary(std::string_view path,
                                                                     PathError& error) {
  const std::optional<FileDescriptor> file = root_.openRegularFile(path, error);
  const auto status = file ? fileStatus(*file, path, error) : std::nullopt;
  if (!status) {
    return std::nullopt;
  }
  if (!remembered_ || static_cast<std::size_t>(status->st_size) != remembered_->size) {
    return decode(readContents(*file, path, error), path, error);
  }
  BytesDigest digest(*secret_);
  const bool isRead = readInPieces(*file, path, error, [&digest](std::string_view piece) {
    digest.add(piece);
    return true;
  });
  if (!isRead) {
    return std::nullopt;
  }
  if (digest.value() == remembered_->digest) {
    return remembered_->value;
  }
  // From its beginning again: what was read was not kept.
  return decode(root_.readFile(path, error), path, error);
}

std::optional<PropertyDictionary> LinuxPropertyLists::decode(
    const std::optional<std::string>& bytes, std::string_view path, PathError& error) {
  std::optional<PropertyDictionary> dictionary =
      bytes ? dictionaryFromBytes(*bytes, path, error) : std::nullopt;
  // A smaller file is not worth forgetting a larger one for.
  if (dictionary && secret_ && (!remembered_ || bytes->size() >= remembered_->size)) {
    BytesDigest digest(*secret_);
    digest.add(*bytes);
    remembered_ = {.value = *dictionary, .size = bytes->size(), .digest = digest.value()};
  }
  return dictionary;
}

Result LinuxPropertyLists::serializeBinary(const PropertyValue& value, BytesInPieces& bytes) {
  bytes = BytesInPieces();
  PropertyListError error;
  std::optional<BytesInPieces> written = writer_.write(value, error);
  if (!written) {
    return Result::failure(std::move(error.text));
  }
  const PropertyDictionary* dictionary = value.asDictionary();
  bytes = dictionary != nullptr && secret_ ? remembering(*dictionary, *written) : *written;
  return Result::success();
}

BytesInPieces LinuxPropertyLists::remembering(const PropertyDictionary& value,
                                              const BytesInPieces& bytes) {
  return {bytes.size(), [this, value, bytes](const BytesInPieces::Taker& take) {
            BytesDigest digest(*secret_);
            const bool isTaken = bytes.giveTo([&](std::string_view piece) {
              digest.add(piece);
              return take(piece);
            });
            if (isTaken) {
              remembered_ = {.value = value, .size = bytes.size(), .digest = digest.value()};
            }
            return isTaken;
          }};
}

}  // namespace accounts
