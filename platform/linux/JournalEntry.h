#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// Appends a field to an entry in the form in which the system's journal takes entries: NAME=VALUE
/// on one line, or for a value of several lines the name, the value's length in eight bytes, the
/// least significant first, and the value. A name has capital letters, digits and underscores.
void appendJournalField(std::string& entry, std::string_view name, std::string_view value);

/// Sends an entry to the journal over a connected datagram socket and returns 0 or the error
/// number. An entry that is too large for a datagram travels in a file in memory. Waits as long as
/// the socket's own time limit allows.
int sendJournalEntry(int socket, const std::string& entry);

}  // namespace accounts
