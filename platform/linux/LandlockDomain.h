#pragma once

namespace accounts {

/// Puts the process, for good, into a Landlock domain in which no file can be opened, made, changed
/// or removed by its name, no connection made and no process outside signalled. Open files stay
/// open. The process must have given up gaining rights (PR_SET_NO_NEW_PRIVS). Does nothing where
/// the kernel has no Landlock, and as much as it knows where it is older. Returns 0 or the error
/// number.
int enterLandlockDomain();

/// The same for a domain in which files can be opened and read as before, but made, changed and
/// removed by their names beneath one directory alone, which may be open for its path. Who a file
/// belongs to and what is permitted are nothing that Landlock knows of. Does nothing, either, where
/// the kernel is so old that no file could be moved between directories any more.
int enterLandlockDomainOf(int directory);

}  // namespace accounts
