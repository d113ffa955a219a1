#include <expat.h>

#include <memory>
#include <new>
#include <string>

#include "propertylist/xml/XMLPropertyList.h"
#include "propertylist/xml/XMLPropertyListBuilder.h"

namespace accounts {

namespace xmlplist {
namespace {

/// Reads one file: expat's events go to a builder, and what the builder or expat refuses becomes
/// the error.
class Reader {
 public:
  explicit Reader(std::string_view bytes) : bytes_(bytes), parser_(XML_ParserCreate(nullptr)) {}

  OrPropertyListError<PropertyValue> read() {
    if (!parser_) {
      throw std::bad_alloc();
    }
    XML_SetUserData(parser_.get(), this);
    XML_SetElementHandler(parser_.get(), onStart, onEnd);
    XML_SetCharacterDataHandler(parser_.get(), onCharacters);
    XML_SetEntityDeclHandler(parser_.get(), onEntityDeclaration);
    XML_SetSkippedEntityHandler(parser_.get(), onSkippedEntity);
    if (!parse()) {
      return std::move(error_);
    }
    return builder_.take();
  }

 private:
  struct ParserDeleter {
    void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
  };

  bool parse() {
    // As a rule the whole file at once: after a piece that is not the last one, expat goes over it
    // again to count lines, which takes a quarter longer. Expat takes the size as an int.
    constexpr std::size_t kChunkSize = std::size_t{1} << 30;
    std::string_view rest = bytes_;
    bool isLast = false;
    while (!isLast && !hasFailed_) {
      const std::string_view chunk = rest.substr(0, kChunkSize);
      rest.remove_prefix(chunk.size());
      isLast = rest.empty();
      const XML_Status status =
          XML_Parse(parser_.get(), chunk.data(), static_cast<int>(chunk.size()), isLast ? 1 : 0);
      if (status != XML_STATUS_OK) {
        // The file is not to blame.
        if (isOutOfMemory_ ||
            (!hasFailed_ && XML_GetErrorCode(parser_.get()) == XML_ERROR_NO_MEMORY)) {
          throw std::bad_alloc();
        }
        fail(XML_ErrorString(XML_GetErrorCode(parser_.get())));
      }
    }
    return !hasFailed_;
  }

  void fail(std::string_view what) {
    // Stopping ends in an error of expat's own, and expat may still deliver an event that it had
    // begun: the first error is the one to report.
    if (hasFailed_) {
      return;
    }
    hasFailed_ = true;
    error_.text = "XML property list: ";
    error_.text.append(what).append(" in line ");
    error_.text.append(std::to_string(XML_GetCurrentLineNumber(parser_.get())));
    XML_StopParser(parser_.get(), XML_FALSE);
  }

  /// Runs what handles an event. Expat is written in C: an exception that went through it would
  /// leave its memory in disorder.
  template <class Handler>
  static void handle(void* userData, Handler handler) {
    auto& reader = *static_cast<Reader*>(userData);
    try {
      handler(reader);
    } catch (const std::bad_alloc&) {
      reader.isOutOfMemory_ = true;
      reader.hasFailed_ = true;
      XML_StopParser(reader.parser_.get(), XML_FALSE);
    }
  }

  static void onStart(void* userData, const char* name, const char** attributes) {
    handle(userData, [&](Reader& reader) {
      if (*attributes != nullptr && reader.currentEventHasReference()) {
        reader.fail("a reference to an entity within a tag");
      } else {
        reader.pass(reader.hasFailed_ || reader.builder_.start(name));
      }
    });
  }

  static void onEnd(void* userData, const char*) {
    handle(userData,
           [](Reader& reader) { reader.pass(reader.hasFailed_ || reader.builder_.end()); });
  }

  static void onCharacters(void* userData, const char* characters, int count) {
    const std::string_view text(characters, static_cast<std::size_t>(count));
    handle(userData, [text](Reader& reader) {
      reader.pass(reader.hasFailed_ || reader.builder_.addCharacters(text));
    });
  }

  // Refusing the declaration keeps entities from ever being expanded or fetched.
  static void onEntityDeclaration(void* userData, const char*, int, const char*, int, const char*,
                                  const char*, const char*, const char*) {
    handle(userData, [](Reader& reader) { reader.fail("a declaration of an entity"); });
  }

  // With a document type that lies outside the file, expat takes unknown entities for declared
  // there.
  static void onSkippedEntity(void* userData, const char*, int) {
    handle(userData, [](Reader& reader) {
      reader.fail("a reference to an entity that is not one of XML's own five");
    });
  }

  void pass(bool isGood) {
    if (!isGood) {
      fail(builder_.problem());
    }
  }

  /// Attributes mean nothing here, but expat is silent about unknown entities in them.
  [[nodiscard]] bool currentEventHasReference() const {
    const auto begin = static_cast<std::size_t>(XML_GetCurrentByteIndex(parser_.get()));
    const auto count = static_cast<std::size_t>(XML_GetCurrentByteCount(parser_.get()));
    return bytes_.substr(begin, count).find('&') != std::string_view::npos;
  }

  std::string_view bytes_;
  PropertyListError error_;
  std::unique_ptr<XML_ParserStruct, ParserDeleter> parser_;
  ValueBuilder builder_;
  bool hasFailed_ = false;
  bool isOutOfMemory_ = false;
};

}  // namespace
}  // namespace xmlplist

OrPropertyListError<PropertyValue> readXMLPropertyList(std::string_view bytes) {
  return xmlplist::Reader(bytes).read();
}

}  // namespace accounts
