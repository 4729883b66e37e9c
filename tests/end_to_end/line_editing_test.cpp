// The interactive shell on a terminal, as it looks to a person.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <csignal>
#include <fstream>

namespace {

const auto kSearchPath = "PATH=" + std::filesystem::path(VELLTOOL_PATH).parent_path().string() +
                         ":" + std::getenv("PATH");

// For a shell that leaves the terminal to its commands.
const std::string kToolAndStatus = "tool=trap : INT; velltool; echo $? $(stty -g | cmp - stty)";

constexpr std::chrono::seconds kStart(60);  ///< For a process to begin.

const std::string kProfile = "RADIO_TYPE=1\nMANAGER=absent\nTIMESTAMP=T\n";

/// The processes that a process has started.
std::string childrenOf(const std::string& process) {
  return std::to_string(
      std::stoi(contentOf("/proc/" + process + "/task/" + process + "/children")));
}

/// The reason of the next collection that the manager is asked for.
std::string reasonAskedOf(TestProcess& manager) {
  manager.readUntil("[velltool] ");
  auto reason = manager.readUntil("\"");
  reason.pop_back();
  return reason;
}

/// A terminal that tmux makes, and bash in the root of a device on it.
class Screen {
 public:
  explicit Screen(const SimulatedDevice& device)
      : tmux(device.start({kSearchPath, kToolAndStatus, "LANG=C", "INPUTRC=inputrc", "tmux", "-u",
                           "-S", device.root() / "tmux", "-f", "/dev/null", "-C", "new-session",
                           "-x80", "-y50",
                           "cd $VELL_SYSROOT; stty -g >stty; PS1='$ ' exec bash --norc"})) {
    std::ofstream(device.root() / "inputrc")
        << "$include /etc/inputrc\n$if velltool\n\"\\C-o\": \"own\"\n$endif\n";
    tmux.readUntil("%end ");
    command("set-option destroy-unattached on");
    expect("$ ", kStart);
  }

  /// Strikes keys: tmux's names of them, and words in quotes.
  void type(const std::string& keys) { command("send-keys " + keys); }

  /// Pastes a text of tmux's configuration file, as the terminal does with that option.
  void paste(const std::string& text, const std::string& option) {
    command("set-buffer \"" + text + "\"");
    command("paste-buffer " + option);
  }

  void startTool(const std::string& command = "velltool") {
    type("'clear; " + command + "' Enter");
    expect(kPrompt, kStart);
  }

  void resize(const std::string& columns) {
    command("clear-history");
    command("resize-window -y50 -x" + columns);
  }

  /// Expects `rows` on the screen, up to the last that is not blank, before nothing has been
  /// written for that long.
  void expect(const std::string& rows, std::chrono::seconds patience = std::chrono::seconds(2)) {
    auto shown = capture();
    while (shown != rows && tmux.hasMore(patience)) {
      shown = capture();  // Reads what else has come, too.
    }
    EXPECT_EQ(shown, rows);
  }

  /// What tmux answers in its control mode.
  std::string command(const std::string& words) {
    const std::string end = "%end ";
    tmux.write(words + "\n");
    tmux.readUntil("%begin");
    tmux.readLine();
    const auto answer = tmux.readUntil(end);
    tmux.readLine();
    return answer.substr(0, answer.size() - end.size());
  }

 private:
  /// tmux leaves out the blanks at the end of a row; the last one gets that of its prompt.
  std::string capture() {
    auto rows = command("capture-pane -p");
    rows.erase(rows.find_last_not_of('\n') + 1);
    return rows.ends_with("$") || rows.ends_with(">>") ? rows + " " : rows;
  }

  TestProcess tmux;
};

}  // namespace

TEST(LineEditing, TakesKeysAsBashDoes) {
  const SimulatedDevice device(kProfile);
  auto manager = device.serve("manager");
  Screen screen(device);
  // clang-format off
  const std::pair<const char*, const char*> cases[] = {
      {"acd Left Left b", "abcd"},
      {R"(n "\e[5~" "\e[15~" "\e[[E" "\e[1;5P" "\e[9;9z" "\eOx" o)", "no"},
      {R"(xa Left Left "\e[3~" Home "\e[C" End b)", "ab"},
      {R"('one two' "\e[1;5D" "\e[1;5D" x "\e[1;5C" y)", "xoney"},
      {R"(xéが漢 Left BSpace Left "\e[1~" "\e[4~" BSpace y)", "xe\u0301y"},
      {"-H 61 c3 62 ff e3 81 e3 81 82", "a\uFFFDb\uFFFD\uFFFDあ"},
      {"C-o", "own"},
      {"x BSpace tar C-_ C-_ y C-r nothing C-g z", "xyz"},
  };
  // clang-format on
  for (const auto* terminal : {"xterm-256color", "screen-256color", "linux", "vt220"}) {
    screen.startTool(std::string("TERM=") + terminal + " velltool");
    for (const auto& [keys, reason] : cases) {
      SCOPED_TRACE(std::string(keys) + " on " + terminal);
      screen.type("'logdump tel '");
      screen.type(keys);
      screen.type("Enter");
      EXPECT_EQ(reasonAskedOf(manager), reason);
      screen.type("C-l");
      screen.expect(kPrompt);
    }
    screen.type("C-d");
    screen.expect("(/velltool)>>\n$ ");
  }
}

TEST(LineEditing, AsksForWhatIsPastedAsFromAPipe) {
  const SimulatedDevice device(kProfile);
  auto manager = device.serve("manager");
  Screen screen(device);
  screen.startTool();
  screen.paste("logdump tel\\tone two\\nlogdump tel tw", "-p");
  screen.expect(kPrompt + "logdump tel       one two\nlogdump tel tw");
  screen.type("o Enter");
  EXPECT_EQ(reasonAskedOf(manager), "one");
  EXPECT_EQ(reasonAskedOf(manager), "two");
  screen.paste("logdump tel n\\tx\\n", "-r");  // As if typed during a command.
  EXPECT_EQ(reasonAskedOf(manager), "nox");
  screen.type("C-l");
  screen.expect(kPrompt);
  screen.type("C-d");
  screen.startTool("TERM=vt220 velltool");
  screen.paste("\\tlogdump\\ttel\\ttar\\tthree/\\tx\\n", "-r");
  EXPECT_EQ(reasonAskedOf(manager), "three/");
}

TEST(LineEditing, ShowsWhatIsTyped) {
  const SimulatedDevice device("RADIO_TYPE=1");
  Screen screen(device);
  screen.startTool();
  // clang-format off
  const std::pair<const char*, std::string> cases[] = {
      {"-- Enter Enter -- Enter '-- --' Enter z Up Up Up Down '|'",
       "--\n(/velltool)>>\n" + kPrompt + "--\n" + kPrompt + "-- --\n" + kPrompt + "-- --|"},
      {"xe\u0301か\u3099漢y Home Right Right Right '|'", "xe\u0301か\u3099|漢y"},
      {"lo Tab te Tab 'tar x ' Tab '|'", "logdump tel tar x -- |"},
      {"'lo foo' Left Left Left Left Tab '|'", "logdump| foo"},
      {"'tel -- cd logdump/../lo' Tab '|'", "tel -- cd logdump/../logdump/|"},
      {"'logdump ' Tab Tab '|'",
       "logdump\nbb     cd     core   help   oslog  tel\n" + kPrompt + "logdump |"},
  };
  // clang-format on
  for (const auto& [keys, shown] : cases) {
    screen.type(std::string("C-e C-u C-l ") + keys);
    screen.expect(kPrompt + shown);
  }
  screen.resize("17");
  screen.type("C-e C-u C-l 'goes by the screen'");
  screen.expect("(/velltool)>> goe\ns by the screen");
  screen.resize("40");
  screen.expect(kPrompt + "goes by the screen");
  screen.resize("20");
  screen.expect("(/velltool)>> goes b\ny the screen");
}

TEST(LineEditing, IsLeftOutWhereItCannotBeDone) {
  const SimulatedDevice device("RADIO_TYPE=1");
  Screen screen(device);
  for (const auto* command : {"TERM= velltool", "TERM=dumb velltool", "velltool | cat"}) {
    screen.startTool(command);
    screen.type("' --' Enter");
    screen.expect(kPrompt + " --\n" + kPrompt);
    screen.type("a Left '|'");
    screen.expect(kPrompt + " --\n" + kPrompt + "a^[[D|");
    screen.type("C-c");
    screen.expect(kPrompt + " --\n" + kPrompt + "a^[[D|^C\n$ ");
  }
}

TEST(LineEditing, LeavesTheTerminalAsItWas) {
  const SimulatedDevice device("RADIO_TYPE=1");
  Screen screen(device);
  const auto shell = std::to_string(std::stoi(screen.command("display-message -p '#{pane_pid}'")));
  const struct {
    int signal;
    std::string keys;
    std::string shown;
    std::string command = "sh -c \"$tool\"";
  } cases[] = {{0, "C-u C-d", "(/velltool)>>\n1"},
               {0, "t Enter", kPrompt + "quit\n0"},
               {SIGTERM, "", "Terminated)>> qui\n143"},
               {SIGHUP, "", "Hanguptool)>> qui\n129"},
               {SIGHUP, "C-c t Enter", kPrompt + "quit\n0",
                "(trap \"\" HUP INT; velltool; echo $? $(stty -g | cmp - stty))"}};
  for (const auto& [signal, keys, shown, command] : cases) {
    SCOPED_TRACE(keys + std::to_string(signal));
    screen.startTool(command);
    screen.type("qui");
    screen.expect(kPrompt + "qui");
    if (signal != 0) {
      kill(std::stoi(childrenOf(childrenOf(shell))), signal);
    }
    screen.type(keys);
    screen.expect(shown + "\n$ ");
  }
}

TEST(LineEditing, GoesOnWhereItWasStopped) {
  const SimulatedDevice device(kProfile + "TRACE_DUMP_STATE=slow:3000");
  auto manager = device.serve("manager");
  Screen screen(device);
  screen.startTool();
  auto shown = kPrompt + "qui";
  const auto stopAndGoOn = [&](const std::string& shownAgain) {
    screen.type("C-z");
    screen.expect(shown += "^Z\n[1]+  Stopped                 velltool\n$ ");
    screen.type("fg Enter");
    screen.expect(shown += "fg\nvelltool" + shownAgain);
  };
  screen.type("qui");
  screen.expect(shown);
  stopAndGoOn("\n" + kPrompt + "qui");
  screen.type("C-c");
  screen.expect(shown += "^C\n" + kPrompt);
  screen.type("'logdump tel' Enter");
  reasonAskedOf(manager);
  shown += "logdump tel\n";
  stopAndGoOn("");
  screen.type("'cd logdump' Enter te Tab");
  screen.expect(shown += "\ncd logdump\nte");
  screen.expect(shown +=
                "      Telephony log collection: Success\nPath = "
                "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-*\n" +
                kPrompt + "cd logdump\n(/velltool/logdump)>> tel",
                std::chrono::seconds(5));
  screen.type("Enter");
  reasonAskedOf(manager);
  screen.type("C-c");
  screen.expect(shown += "\n^C\n$ ");
  screen.type("'echo $?' Enter");
  screen.expect(shown + "echo $?\n130\n$ ");
}
