#pragma once

/// The name under which the program was started: the last component of the first word of its
/// command line, "velltool" when that is missing or empty. The text lives as long as the process.
const char* getprogname();

/// Opens the null device in place of each standard stream that the process was started without, so
/// that nothing else comes to stand there, see null(4), and ends the process when it cannot. Has
/// std::cin wait for input, and std::cout and std::cerr for room, where they lead to something that
/// does not block, so that they fail only when what is behind them does; each is then for one
/// thread at a time. Called first of all, on the main thread.
void prepareStandardStreams();

/// Keeps the calling thread, which is the main thread, in service of the platform for the rest of
/// the process's life. Does not return.
void runMainEventLoop();
