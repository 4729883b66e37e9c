// The bus policy that is installed, in a bus daemon that allows everything else.

#include "platform/bus/bus_handles.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>
#include <pwd.h>
#include <unistd.h>

#include <cstdlib>

namespace {

/// What $user ("root" or "nobody") may do on the bus: a word for each call that succeeds. Sends the
/// signals to the connection $1.
const char* const kAttempts = R"(
    bus() {
      setpriv --reuid="$user" --clear-groups busctl --address="$DBUS_SYSTEM_BUS_ADDRESS" "$@"
    }
    manager='org.vell.Manager1 /org/vell/Manager1'
    helper='org.vell.Helper1 /org/vell/Helper1'
    {
      bus get-property $manager org.vell.Manager1 ServerState && echo state >&3
      bus call $manager org.freedesktop.DBus.Introspectable Introspect && echo introspect >&3
      bus call $helper org.freedesktop.DBus.Introspectable Introspect && echo introspect >&3
      bus call $manager org.vell.Manager1 OpenClient s x && echo open >&3
      bus call $manager org.vell.Manager1 PerformCommand 'sa{sv}' x 0 && echo command >&3
      bus call $helper org.vell.Helper1 Perform 'usa{sv}' 1 x 0 && echo helper >&3
      for name in org.vell.Manager1 org.vell.Helper1; do
        bus call org.freedesktop.DBus / org.freedesktop.DBus RequestName su $name 0 && echo own >&3
      done
      bus emit --destination="$1" / org.vell.Manager1 Event
      bus emit --destination="$1" / org.freedesktop.DBus NameOwnerChanged
      bus emit --destination="$1" / org.example.Other Last
    } 3>&1 >/dev/null 2>&1 | xargs)";

/// Notes a signal that is not the bus's own.
int noteSignal(sd_bus_message* signal, void* noted, sd_bus_error* /*error*/) {
  if (std::string_view(sd_bus_message_get_sender(signal)).starts_with(':')) {
    *static_cast<std::string*>(noted) += sd_bus_message_get_member(signal) + std::string(" ");
  }
  return 0;
}

}  // namespace

TEST(BusPolicy, LetsOnlyRootServeCommandAndSpeakForTheManager) {
  if (geteuid() != 0 || getpwnam("nobody") == nullptr) {
    GTEST_SKIP() << "Only root can act as the user nobody.";
  }
  const SimulatedDevice device("BUS=no");
  // The socket must be within reach of everybody.
  ASSERT_EQ(device.runLine(R"(chmod 755 "$VELL_SYSROOT"; cd "$VELL_SYSROOT/run"
      sed -i "s|</busconfig>|<include>$1</include>&|" bus.conf)",
                           {VELL_BUS_POLICY}),
            (ProcessResult{0, "", ""}));
  const auto bus = device.serve("bus");
  const auto manager = device.serve("manager");
  const auto helper = device.serve("helper");
  setenv("DBUS_SYSTEM_BUS_ADDRESS", device.busAddress().c_str(), 1);
  sd_bus* opened = nullptr;
  ASSERT_GE(sd_bus_open_system(&opened), 0);
  const BusPtr listener(opened);
  const char* name = nullptr;
  sd_bus_get_unique_name(opened, &name);
  std::string heard;
  sd_bus_add_filter(opened, nullptr, noteSignal, &heard);

  const std::tuple<std::string, std::string, std::string> cases[] = {
      {"nobody", "state introspect introspect\n", "Last "},
      {"root", "state introspect introspect open command helper own own\n", "Event Last "}};
  for (const auto& [user, allowed, signals] : cases) {
    EXPECT_EQ(device.runLine("user=" + user + kAttempts, {name}), (ProcessResult{0, allowed, ""}));
    heard.clear();
    while (heard.find("Last") == std::string::npos) {
      if (sd_bus_process(opened, nullptr) == 0) {
        sd_bus_wait(opened, UINT64_MAX);
      }
    }
    EXPECT_EQ(heard, signals) << user;
  }
}
