#!/usr/bin/python3
"""How a test mocks the manager. Run it on a device without one."""

import os
import subprocess
import unittest

import dbus
import dbusmock

TEMPLATE = os.path.join(os.path.dirname(os.path.abspath(__file__)), "vell_manager.py")
NOTHING = dbus.Dictionary(signature="sv")


def velltool(*words):
    return subprocess.run(["velltool", "logdump", *words], stdout=subprocess.PIPE,
                          stderr=subprocess.STDOUT, text=True).stdout


class VelltoolTest(dbusmock.DBusTestCase):
    def setUp(self):
        process, self.manager = self.spawn_server_template(TEMPLATE, {}, subprocess.DEVNULL)
        self.addCleanup(process.wait)
        self.addCleanup(process.terminate)
        self.mock = dbus.Interface(self.manager, dbusmock.MOCK_IFACE)

    def test_sends_the_reason(self):
        self.assertIn("/log-bb-T.tar\n", velltool("core", "tar", "why"))
        _, (command, request) = self.mock.GetMethodCalls("PerformCommand")[-1]
        self.assertEqual((command, request["BasebandResetReason"]),
                         ("TraceDumpState", "[velltool] why"))

    def test_says_that_a_collection_has_failed(self):
        self.mock.Answer("CollectTelephonyLogs", 5, NOTHING)
        self.assertEqual(velltool("tel"), "Telephony log collection: Failed\n")
        self.mock.Fail("CollectTelephonyLogsWithCoredump", "org.example.NoModem")
        self.assertEqual(velltool("core"), "Telephony log collection with Coredump: Failed\n")

    def test_waits_and_is_content_without_a_trace_mode(self):
        self.mock.Answer("SystemLogs.TraceMode", 5, NOTHING)
        self.mock.Delay("CollectBasebandLogs", 200)
        self.assertIn("/log-bb-T.tar\n", velltool("bb", "tar"))

    def test_is_refused_by_a_manager_that_stops(self):
        self.mock.ChangeServerState("Stopping")
        self.assertIn("Server is not running", velltool("tel"))


if __name__ == "__main__":
    unittest.main()
