// A framework from before the interface had a version.
extern "C" [[gnu::visibility("default")]] void RegisterClasses(void*) {}
