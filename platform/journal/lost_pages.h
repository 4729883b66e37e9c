#pragma once

/// Lets this thread survive that somebody cuts a file short that it has mapped. A page that is gone
/// reads as zeros from its first touch on; without this, the kernel ends the process with SIGBUS,
/// see mmap(2). The first call takes SIGBUS over for the whole process. Other threads, and other
/// causes of the signal, get what they would have got without it.
void surviveLostPages();

/// How many pages this thread has lost so far. What was read while one was lost is not to be relied
/// on.
unsigned long lostPages();
