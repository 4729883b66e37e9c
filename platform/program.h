#pragma once

/// The name under which the program was started: the last component of the first word of its
/// command line, "velltool" when that is missing or empty. The text lives as long as the process;
/// from any thread.
const char* getprogname();

/// Opens the null device in place of each standard stream that the process was started without, so
/// that nothing else comes to stand there; see null(4). Called first of all, on the main thread.
void openMissingStandardStreams();

/// Keeps the calling thread, which is the main thread, in service of the platform for the rest of
/// the process's life. Does not return.
void runMainEventLoop();
