#pragma once

/// Lets this thread survive that somebody cuts a file short that it has mapped. A page that is gone
/// reads as zeros from its first touch on; without this, the kernel ends the process with SIGBUS,
/// see mmap(2). The first call takes SIGBUS over for the whole process. Other threads, and other
/// causes of the signal, get what they would have got without it.
void surviveLostPages();

/// Whether this thread has lost a page since it asked last. What was read meanwhile is not to be
/// relied on.
bool hasLostPage();
