// A plug-in of another version of what it shares with the host, which must not call it.
extern "C" unsigned AccountsInterfaceVersion() {
  return 999;
}

extern "C" void* CreateMigrationPlugin(void*) {
  __builtin_trap();
}
