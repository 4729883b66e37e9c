#pragma once

/// Lets this thread survive that somebody cuts a file short that it has mapped. A page that is gone
/// reads as zeros from its first touch on; without this, the kernel ends the process with SIGBUS,
/// see mmap(2). The first call takes SIGBUS over for the whole process. Other threads, and other
/// causes of the signal, get what they would have got without it.
void surviveLostPages();

/// How many pages this thread has lost so far.
unsigned long lostPages();

/// Tells whether this thread has lost a page since the object was made. What was read meanwhile
/// is then not to be relied on.
class LostPageWatch {
 public:
  [[nodiscard]] bool sawLoss() const { return lostPages() != before; }

 private:
  unsigned long before = lostPages();
};
