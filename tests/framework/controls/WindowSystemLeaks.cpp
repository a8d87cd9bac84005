// Leak checking for the windowed tests. The font configuration that text
// layout loads, and the message bus the window layer opens on X, keep
// allocations of their own start-up for the life of the process.
extern "C" const char* __lsan_default_suppressions() {
  return "leak:libfontconfig.so\nleak:libdbus-1.so\n";
}
