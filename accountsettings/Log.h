#pragma once

#include <array>
#include <cstdint>
#include <initializer_list>
#include <optional>
#include <source_location>
#include <span>
#include <string>
#include <string_view>
#include <variant>

#include "platform/LogSystem.h"
#include "propertylist/value/PropertyValue.h"

extern "C" {
/// The process-wide log channel of the account settings (subsystem "com.quarx.accountsettings",
/// category "log"). Made on the first call, from any thread; every call gives the same channel.
accounts::LogChannel* _ASLogSystem();
}

namespace accounts {

/// One argument of a log line: a text, a number, a value of the property-list model, or nothing
/// ("(null)").
class LogArgument {
 public:
  LogArgument(std::string_view text) : content_(std::string(text)) {}
  LogArgument(const char* text) : content_(std::string(text)) {}
  LogArgument(std::string text) : content_(std::move(text)) {}
  LogArgument(const Text& text) : content_(text.string()) {}
  LogArgument(const std::optional<Text>& text);
  LogArgument(PropertyValue value) : content_(std::move(value)) {}
  LogArgument(PropertyDictionary dictionary) : content_(PropertyValue(std::move(dictionary))) {}
  LogArgument(const std::optional<PropertyDictionary>& dictionary);
  LogArgument(const std::optional<PropertyArray>& array);
  LogArgument(bool flag) : content_(std::int64_t{flag}) {}
  LogArgument(std::int64_t number) : content_(number) {}
  LogArgument(std::uint64_t number) : content_(static_cast<std::int64_t>(number)) {}

  /// Appends the argument as it stands in a line. Texts are escaped, so that a line stays one line;
  /// of a value, secrets are hidden.
  void appendTo(std::string& line) const;

 private:
  std::variant<std::monostate, std::string, std::int64_t, PropertyValue> content_;
};

/// Puts arguments into a format, in order, in the places of %@, %s, %d and %ld, and appends the
/// result to a line.
void appendFormatted(std::string& line, std::string_view format,
                     std::span<const LogArgument> arguments);

/// Makes the arguments of a channel line. For use in the callable that logToChannel() takes.
template <class... Arguments>
std::array<LogArgument, sizeof...(Arguments)> logArguments(Arguments&&... arguments) {
  return {LogArgument(std::forward<Arguments>(arguments))...};
}

/// Writes the channel line `OPERATION (LINE) "MESSAGE"` without asking whether the channel is
/// enabled.
void writeChannelLine(LogChannel& channel, std::string_view operation, std::uint32_t sourceLine,
                      std::string_view format, std::span<const LogArgument> arguments);

/// Writes a line to the log channel if it is enabled; only then is `makeArguments` called, so that
/// a disabled channel costs nothing. `operation` is the full name of the operation that logs,
/// `format` the message without its quotation marks.
template <class MakeArguments>
void logToChannel(std::string_view operation, std::string_view format,
                  MakeArguments&& makeArguments,
                  std::source_location place = std::source_location::current()) {
  LogChannel* channel = _ASLogSystem();
  if (channel->isEnabled()) {
    writeChannelLine(*channel, operation, place.line(), format, makeArguments());
  }
}

/// Writes a line without arguments to the log channel if it is enabled.
void logToChannel(std::string_view operation, std::string_view message,
                  std::source_location place = std::source_location::current());

/// Writes one formatted line to the console log.
void logToConsole(std::string_view format, std::initializer_list<LogArgument> arguments = {});

/// The source files that assertions name.
inline constexpr std::string_view kManagerSourceFile = "AccountsManager";
inline constexpr std::string_view kAccountSourceFile = "BasicAccount";
inline constexpr std::string_view kMailServicesSourceFile = "MailServices";

/// Ends the process because of a programming error: writes the message, with the operation and the
/// source file (the class's name), to the console log and aborts.
[[noreturn]] void failAssertion(std::string_view operation, std::string_view sourceFile,
                                std::string_view format,
                                std::initializer_list<LogArgument> arguments = {});

}  // namespace accounts
