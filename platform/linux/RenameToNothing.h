#pragma once

namespace accounts {

/// Gives what has a name in a directory another name there that nothing has. Returns 0 or the error
/// number, EEXIST when something has it. Where the file system cannot do it in one step, what is
/// moved has both names for a moment.
int renameToNothing(int directory, const char* from, const char* to);

/// Whether an error number of renameat2 says that the file system does not know its flags.
bool cannotExchange(int number);

}  // namespace accounts
