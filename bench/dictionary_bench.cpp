// Prints what reading a dictionary costs per entry, and how that grows with the number of entries.

#include "platform/bus/bus_dictionary.h"
#include "platform/bus/bus_handles.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <limits>
#include <string>
#include <utility>
#include <vector>

namespace {

constexpr int kFewEntries = 5'000;
constexpr int kManyEntries = 80'000;
constexpr int kRounds = 30;

/// Ends the program when a step of the bus library fails.
void require(bool done, const char* step) {
  if (!done) {
    std::perror(step);
    std::exit(EXIT_FAILURE);
  }
}

/// Processor time of this thread, in nanoseconds.
double processorTime() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

/// A connection that is good enough to make messages, with nobody at its other end.
BusPtr makeBus() {
  int ends[2] = {-1, -1};
  require(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) == 0, "socketpair");
  sd_bus* bus = nullptr;
  require(
      sd_bus_new(&bus) >= 0 && sd_bus_set_fd(bus, ends[0], ends[0]) >= 0 && sd_bus_start(bus) >= 0,
      "sd_bus_start");
  return BusPtr(bus);
}

/// A message, ready to be read, that holds a dictionary of `count` entries.
BusMessagePtr makeMessage(sd_bus* bus, int count) {
  std::vector<MessageDict::Entry> entries;
  entries.reserve(static_cast<std::size_t>(count));
  for (int number = 0; number < count; ++number) {
    entries.push_back({"key number " + std::to_string(number), "some value"});
  }
  sd_bus_message* message = nullptr;
  require(sd_bus_message_new_signal(bus, &message, "/", "org.vell.Bench", "Dictionary") >= 0 &&
              appendDictionary(message, MessageDict::fromEntries(std::move(entries))) &&
              sd_bus_message_seal(message, 1, 0) >= 0,
          "sd_bus_message_seal");
  return BusMessagePtr(message);
}

/// The least processor time per entry that reading `count` entries takes, in nanoseconds.
double costPerEntry(sd_bus* bus, int count) {
  const auto message = makeMessage(bus, count);
  double least = std::numeric_limits<double>::infinity();
  for (int round = 0; round < kRounds; ++round) {
    sd_bus_message_rewind(message.get(), 1);
    const double start = processorTime();
    {
      MessageDict dict;
      require(readDictionary(message.get(), dict), "readDictionary");
    }
    least = std::min(least, processorTime() - start);
  }
  return least / count;
}

}  // namespace

int main() {
  const auto bus = makeBus();
  const double few = costPerEntry(bus.get(), kFewEntries);
  const double many = costPerEntry(bus.get(), kManyEntries);
  std::printf("%d entries: %.0f ns each\n%d entries: %.0f ns each\nratio: %.2f\n", kFewEntries, few,
              kManyEntries, many, many / few);
}
