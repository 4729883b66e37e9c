// Part of builds with ThreadSanitizer only.

/// What the sanitizer passes over: what libsystemd itself does to memory, but not what is called
/// from it. The library is not built for the sanitizer, and renews the key of its hash tables in
/// one place without a lock (a table copies it once, and any bytes will do); its journals and
/// connections may each be used on a thread of their own, see sd-journal(3) and sd-bus(3).
extern "C" const char* __tsan_default_suppressions() {
  return "called_from_lib:libsystemd.so\n";
}

/// Has it neither wait a second for other threads at the end of a process nor take those that are
/// left for lost: the tool ends while they are there.
extern "C" const char* __tsan_default_options() {
  return "atexit_sleep_ms=0 report_thread_leaks=0";
}
