// The export alone, without the shell and the manager around it: its words are those of "oslog".

#include "logdump/handlers.h"

int main(int count, char** words) {
  const bool result = makeOsLogHandler()(WorkGroup::create(), {words + 1, words + count});
  return result ? 0 : 1;
}
