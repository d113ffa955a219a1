#pragma once

#include <string>
#include <string_view>

#include "commandline/ExitStatus.h"

namespace accounts {

/// Prepares the process's standard streams, first of all: opens those of the three that are closed
/// (to nothing), so that no other file can take the number of one, and lets a reader that goes away
/// be an error of writing rather than the end of the process.
void prepareStandardStreams();

/// Writes the line "PROGRAM: MESSAGE" to standard error, the message escaped to stay one line.
void printError(std::string_view program, std::string_view message);

/// The same for something that a person should know: "PROGRAM: warning: MESSAGE".
void printWarning(std::string_view program, std::string_view message);

/// Whether the result has arrived where the reader of a pipe went away before its end.
enum class ReaderThatLeft { HasSeenEnough, LacksTheResult };

/// Writes the program's whole result to standard output, and tells on standard error when it does
/// not arrive. Returns how the program ends: with `exitStatus`, or with an input/output error.
ExitStatus printResult(std::string_view program, const std::string& text, ExitStatus exitStatus,
                       ReaderThatLeft reader = ReaderThatLeft::LacksTheResult);

}  // namespace accounts
