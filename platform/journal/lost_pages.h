#pragma once

/// Lets this thread survive that a file it has mapped is cut short by somebody else: a page that is
/// gone reads as zeros from its first touch on, where the process would be ended with SIGBUS, see
/// mmap(2). Takes SIGBUS over for the whole process when it is first called; other threads, and
/// other reasons for the signal, get what they would have got.
void surviveLostPages();

/// How many pages this thread has lost so. What was read between two calls that differ is not to be
/// relied on.
unsigned long lostPages();
