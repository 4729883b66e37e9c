// Whatever may come from the bus in place of a message dictionary; what it reads as, and a
// dictionary of any text, to the bus and back. An input is the body of a message that is said to
// hold a variant.

#include "platform/bus/bus_dictionary.h"
#include "platform/bus/bus_handles.h"
#include "platform/unicode/utf8.h"
#include "tests/fuzz/fuzz_target.h"

#include <sys/socket.h>
#include <unistd.h>

namespace {

BusPtr openEnd(int file, bool server) {
  sd_bus* bus = nullptr;
  require(sd_bus_new(&bus) >= 0 && sd_bus_set_fd(bus, file, file) >= 0 &&
              sd_bus_set_server(bus, server ? 1 : 0, {}) >= 0 && sd_bus_start(bus) >= 0,
          "no bus");
  return BusPtr(bus);
}

/// Two ends of a connection that have greeted each other. What `peer` sends comes in at `bus`.
struct Connection {
  int ends[2] = {-1, -1};
  int made = socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0, ends);
  BusPtr bus = openEnd(ends[0], false);
  BusPtr peer = openEnd(ends[1], true);

  Connection() {
    while (sd_bus_is_ready(bus.get()) <= 0 || sd_bus_is_ready(peer.get()) <= 0) {
      sd_bus_process(bus.get(), nullptr);
      sd_bus_process(peer.get(), nullptr);
    }
  }

  /// Gives the signal that has `body`, of any bytes, as it came in.
  [[nodiscard]] BusMessagePtr send(const std::string& body) const {
    using namespace std::string_literals;
    const auto length = static_cast<std::uint32_t>(body.size());
    const auto bytes = "l\4\1\1"s + std::string(reinterpret_cast<const char*>(&length), 4) +
                       "\1\0\0\0\x37\0\0\0"
                       "\1\1o\0\2\0\0\0/a\0\0\0\0\0\0"
                       "\2\1s\0\3\0\0\0a.b\0\0\0\0\0"
                       "\3\1s\0\1\0\0\0m\0\0\0\0\0\0\0"
                       "\x8\1g\0\1v\0\0"s +
                       body;
    require(write(ends[1], bytes.data(), bytes.size()) == std::ssize(bytes), "not written");
    sd_bus_message* message = nullptr;
    while (message == nullptr) {
      require(sd_bus_process(bus.get(), &message) > 0, "nothing came in");
    }
    return BusMessagePtr(message);
  }
};

MessageDict throughTheBus(const Connection& connection, const MessageDict& dict) {
  sd_bus_message* made = nullptr;
  sd_bus_message_new_signal(connection.bus.get(), &made, "/a", "a.b", "m");
  const BusMessagePtr message(made);
  MessageDict back;
  require(appendPayload(made, dict) && sd_bus_message_seal(made, 1, 0) >= 0, "not appended");
  require(readPayload(made, back) && sd_bus_message_at_end(made, 1) > 0, "not read");
  return back;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const Connection connection;
  const std::string input(data, data + size);
  MessageDict dict;
  if (readPayload(connection.send(input + "?").get(), dict)) {
    require(throughTheBus(connection, dict) == dict, "not what was read");
  }
  const auto taken = interchangeText(input);
  const auto texts = MessageDict::fromEntries({{input, input}});
  require(throughTheBus(connection, texts) == MessageDict::fromEntries({{taken, taken}}),
          "not what was sent");
  return 0;
}
