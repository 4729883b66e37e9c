#pragma once

/// The name under which the program was started: the last component of the first word of its
/// command line, "velltool" when that is missing or empty. The text lives as long as the process;
/// from any thread.
const char* getprogname();

/// Keeps the calling thread, which is the main thread, in service of the platform for the rest of
/// the process's life. Does not return.
void runMainEventLoop();
