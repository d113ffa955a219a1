// A framework of another version of the interface, in which it registers nothing that anybody
// knows.
extern "C" [[gnu::visibility("default")]] unsigned AccountsInterfaceVersion() {
  return 999;
}

extern "C" [[gnu::visibility("default")]] void RegisterClasses(void*) {}
