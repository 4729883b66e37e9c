// Part of builds with AddressSanitizer only.

/// What the leak checker passes over: memory that readline itself has asked for. The library keeps
/// lines and steps to undo until the process ends, and loses some of them to itself.
extern "C" const char* __lsan_default_suppressions() {
  return "leak:libreadline.so\n";
}

/// Has it say nothing of what it passed over: a session ends as in other builds.
extern "C" const char* __lsan_default_options() {
  return "print_suppressions=0";
}

/// Has it look at what a comparison of memory comes to, and not at all that it might: readline
/// compares rows of the screen beyond their ends.
extern "C" const char* __asan_default_options() {
  return "strict_memcmp=0";
}
