// A shared object that is no framework: it exports something else.
extern "C" [[gnu::visibility("default")]] int anotherSymbol() {
  return 1;
}
