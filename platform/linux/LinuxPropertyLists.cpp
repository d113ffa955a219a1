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
  if (!file) {
    return std::nullopt;
  }
  const std::string_view known = rememberedValue_ ? rememberedBytes_ : std::string_view();
  std::optional<ComparedContents> contents = readAndCompare(*file, known, path, error);
  if (!contents) {
    return std::nullopt;
  }
  if (contents->areKnown && rememberedValue_) {
    return rememberedValue_;
  }
  std::optional<PropertyDictionary> dictionary = dictionaryFromBytes(contents->bytes, path, error);
  // A smaller file is not worth forgetting a larger one for.
  if (dictionary && contents->bytes.size() >= known.size()) {
    rememberedBytes_ = std::move(contents->bytes);
    rememberedValue_ = dictionary;
    areBytesOurs_ = false;
  }
  return dictionary;
}

Result LinuxPropertyLists::serializeBinary(const PropertyValue& value, std::string_view& bytes) {
  const PropertyDictionary* dictionary = value.asDictionary();
  if (areBytesOurs_ && rememberedValue_ && dictionary != nullptr &&
      *dictionary == *rememberedValue_) {
    bytes = rememberedBytes_;
    return Result::success();
  }
  PropertyListError error;
  std::optional<std::string> written = writer_.write(value, error, std::move(rememberedBytes_));
  rememberedBytes_ = std::move(written).value_or(std::string());
  rememberedValue_ = std::nullopt;
  bytes = rememberedBytes_;
  if (!written) {
    return Result::failure(std::move(error.text));
  }
  if (dictionary != nullptr) {
    rememberedValue_ = *dictionary;
    areBytesOurs_ = true;
  }
  return Result::success();
}

}  // namespace accounts
