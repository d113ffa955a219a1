// A shared object that is no plug-in: it has no entry point.
extern "C" int thisIsNoEntryPoint() {
  return 0;
}
