#include "accountsettings/Log.h"

#include <algorithm>
#include <cstdlib>

#include "accountsettings/Process.h"
#include "propertylist/value/Description.h"
#include "propertylist/value/HiddenSecrets.h"

namespace {

constexpr std::string_view kChannelSubsystem = "com.quarx.accountsettings";
constexpr std::string_view kChannelCategory = "log";

}  // namespace

accounts::LogChannel* _ASLogSystem() {
  accounts::Process& process = accounts::Process::current();
  return process.logChannel.get(
      [&] { return &process.platform.logSystem.makeChannel(kChannelSubsystem, kChannelCategory); });
}

namespace accounts {

namespace {

constexpr std::string_view kAbsentObject = "(null)";

/// The placeholders of a format. All are filled by whatever argument stands in their place.
constexpr std::array<std::string_view, 4> kPlaceholders = {"%@", "%s", "%d", "%ld"};

/// The length of the placeholder that a text begins with, 0 when it begins with none.
std::size_t placeholderLength(std::string_view text) {
  const auto* placeholder =
      std::find_if(kPlaceholders.begin(), kPlaceholders.end(),
                   [&](std::string_view candidate) { return text.starts_with(candidate); });
  return placeholder != kPlaceholders.end() ? placeholder->size() : 0;
}

}  // namespace

LogArgument::LogArgument(const std::optional<Text>& text) {
  if (text) {
    content_ = text->string();
  }
}

LogArgument::LogArgument(const std::optional<PropertyDictionary>& dictionary) {
  if (dictionary) {
    content_ = PropertyValue(*dictionary);
  }
}

LogArgument::LogArgument(const std::optional<PropertyArray>& array) {
  if (array) {
    content_ = PropertyValue(*array);
  }
}

void LogArgument::appendTo(std::string& line) const {
  if (const auto* text = std::get_if<std::string>(&content_)) {
    appendEscapedText(line, textWithSecretsHidden(*text));
  } else if (const auto* number = std::get_if<std::int64_t>(&content_)) {
    line += std::to_string(*number);
  } else if (const auto* value = std::get_if<PropertyValue>(&content_)) {
    appendDescription(line, withSecretsHidden(*value));
  } else {
    line += kAbsentObject;
  }
}

void appendFormatted(std::string& line, std::string_view format,
                     std::span<const LogArgument> arguments) {
  while (!format.empty()) {
    const std::size_t length = placeholderLength(format);
    if (length == 0) {
      const std::size_t nextPlaceholder = std::min(format.find('%', 1), format.size());
      line += format.substr(0, nextPlaceholder);
      format.remove_prefix(nextPlaceholder);
      continue;
    }
    format.remove_prefix(length);
    if (arguments.empty()) {
      line += kAbsentObject;
    } else {
      arguments.front().appendTo(line);
      arguments = arguments.subspan(1);
    }
  }
}

void writeChannelLine(LogChannel& channel, std::string_view operation, std::uint32_t sourceLine,
                      std::string_view format, std::span<const LogArgument> arguments) {
  std::string line;
  appendFormatted(line, "%s (%d) ", logArguments(operation, std::int64_t{sourceLine}));
  line += '"';
  appendFormatted(line, format, arguments);
  line += '"';
  channel.write({.text = line, .operation = operation, .sourceLine = sourceLine});
}

void logToChannel(std::string_view operation, std::string_view message,
                  std::source_location place) {
  logToChannel(
      operation, message, [] { return logArguments(); }, place);
}

void logToConsole(std::string_view format, std::initializer_list<LogArgument> arguments) {
  std::string line;
  appendFormatted(line, format, {arguments.begin(), arguments.size()});
  Process::current().platform.consoleLog.writeLine(line);
}

void failAssertion(std::string_view operation, std::string_view sourceFile, std::string_view format,
                   std::initializer_list<LogArgument> arguments) {
  std::string message;
  appendFormatted(message, format, {arguments.begin(), arguments.size()});
  std::string line;
  appendFormatted(line, "*** Assertion failure in %s, %s: ", logArguments(operation, sourceFile));
  // The message's own texts are escaped already.
  Process::current().platform.consoleLog.writeLine(line + message);
  std::abort();
}

}  // namespace accounts
