// The interactive shell on a terminal, as it looks to a person.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <csignal>
#include <list>

namespace {

const auto kSearchPath = "PATH=" + std::filesystem::path(VELLTOOL_PATH).parent_path().string() +
                         ":" + std::getenv("PATH");

// For a shell that leaves the terminal to its commands.
const std::string kToolAndStatus = "tool=trap : INT; velltool; echo $? $(stty -g | cmp - stty)";

/// The processes that a process has started.
std::string childrenOf(const std::string& process) {
  return std::to_string(
      std::stoi(contentOf("/proc/" + process + "/task/" + process + "/children")));
}

/// A terminal that tmux makes, and bash in the root of a device on it.
class Screen {
 public:
  explicit Screen(const SimulatedDevice& device)
      : tmux(device.start({kSearchPath, kToolAndStatus, "tmux", "-S", device.root() / "tmux", "-f",
                           "/dev/null", "-C", "new-session", "-x80", "-y50",
                           "cd $VELL_SYSROOT; stty -g >stty; PS1='$ ' exec bash --norc"})) {
    tmux.readUntil("%end ");
    command("set-option destroy-unattached on");
    expect("$ ");
  }

  /// Strikes keys: tmux's names of them, and words in quotes.
  void type(const std::string& keys) { command("send-keys " + keys); }

  void startTool(const std::string& command = "velltool") {
    type("'clear; " + command + "' Enter");
    expect(kPrompt);
  }

  /// Returns when the tool can see it.
  void resize(const std::string& columns) {
    command("clear-history");
    command("resize-window -y50 -x" + columns);
    waitUntil("stty -F #{pane_tty} size | grep -q \" " + columns + "$\"");
  }

  /// Waits until the shell's words `condition` succeed, for some ten thousand looks at most;
  /// "#{pane_tty}" is the terminal.
  void waitUntil(const std::string& condition) {
    command("run-shell 'for look in $(seq 9999); do " + condition + " && break; done'");
  }

  /// Waits until `rows` are on the screen: up to the last that is not blank.
  void expect(const std::string& rows) {
    constexpr int kLooks = 400;
    std::string shown = capture();
    for (int look = 0; look < kLooks && shown != rows; ++look) {
      command("run-shell 'sleep 0.05'");
      shown = capture();
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
    return answer.substr(0, answer.size() - end.size());
  }

 private:
  /// tmux leaves out the blanks at the end of a row; the last one has that of its prompt.
  std::string capture() {
    auto rows = command("capture-pane -p");
    rows.erase(rows.find_last_not_of('\n') + 1);
    return rows.ends_with("$") || rows.ends_with(">>") ? rows + " " : rows;
  }

  TestProcess tmux;
};

}  // namespace

TEST(LineEditing, ShowsWhatIsTyped) {
  const SimulatedDevice device("RADIO_TYPE=1");
  Screen screen(device);
  screen.startTool();
  // clang-format off
  const std::pair<const char*, std::string> cases[] = {
      {"acd Left Left b '|'", "ab|cd"},
      {"xabc Home DC End Left C-d '|'", "ab|"},
      {"-- Enter Enter '-- --' Enter z Up Up Up Down '|'",
       "--\n(/velltool)>>\n" + kPrompt + "-- --\n" + kPrompt + "-- --|"},
      {"hä漢字é Left Left '|'", "hä漢|字é"},
      {"xe\u0301か\u3099\u0301y Home Right Right Right '|'", "xe\u0301か\u3099\u0301|y"},
      {"xe\u0301か\u3099 Left BSpace '|'", "x|か\u3099"},
      {"C-Space \u0301\U00100000ab Home Right '|'", "a|b"},
      {"lo Tab te Tab '|'", "logdump tel |"},
      {"'tel -- cd ' Tab '|'", "tel -- cd logdump/|"},
      {"'logdump  ' Tab '|'", "logdump  |"},
      {"'logdump ' Tab Tab '|'",
       "logdump\nbb  cd  core  help  oslog  tel\n" + kPrompt + "logdump |"},
      {"'logdump tel ' Tab Tab '|'", "logdump tel |"},
  };
  // clang-format on
  for (const auto& [keys, shown] : cases) {
    screen.type(std::string("C-u C-l ") + keys);
    screen.expect(kPrompt + shown);
  }
  // In rows of 17 columns, wide characters leave one free.
  const std::string above = kPrompt + "--\n";
  screen.type("C-u C-l -- Enter -- Enter -- Enter -- Enter");
  screen.type("'漢漢漢字字字字字字字字漢漢漢漢漢漢漢漢字' Left Left");
  screen.expect(above + above + above + above + kPrompt +
                "漢漢漢字字字字字字字字漢漢漢漢漢漢漢漢字");
  screen.resize("17");
  screen.type("'|'");
  screen.expect(above + "(/velltool)>> 漢\n漢漢字字字字字字\n字字漢漢漢漢漢漢\n漢|漢字");
  screen.type("C-u C-l -- Enter 'a quarter of a hundred and eleven, the end'");
  screen.type("Left Left Left Left Left Left '|'");
  screen.expect(above + "(/velltool)>> a q\nuarter of a hundr\ned and eleven, t|\nhe end");
  screen.resize("51");
  screen.type("T");
  screen.expect(above + kPrompt + "a quarter of a hundred and eleven, t|\nThe end");
  screen.resize("30");
  screen.type("C-u C-l '12341234z1234abbc1234 xbacz12341234a xc x xb1234ba x' Home");
  screen.type("Right Right Right Right Right a");
  screen.expect("(/velltool)>> 12341a234z1234ab\nbc1234 xbacz12341234a xc x xb1\n234ba x");
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
    std::string keys;
    std::string shown;
    int signal;
  } cases[] = {{"C-u C-d", "1", 0},
               {"t Enter", "quit\n0", 0},
               {"C-c", "qui130", 0},
               {"", "quiTerminated\n143", SIGTERM},
               {"", "quiHangup\n129", SIGHUP},
               {"", "quiAborted\n134", SIGABRT}};
  for (const auto& [keys, shown, signal] : cases) {
    SCOPED_TRACE(keys + std::to_string(signal));
    screen.startTool("sh -c \"$tool\"");
    screen.type("qui");
    screen.expect(kPrompt + "qui");
    screen.type(keys);
    if (signal != 0) {
      kill(std::stoi(childrenOf(childrenOf(shell))), signal);
    }
    screen.expect(kPrompt + shown + "\n$ ");
  }
  screen.type("'clear; read -p early; velltool; echo $?' Enter");
  screen.expect("early");
  screen.type("Enter C-d");
  screen.expect("early\n" + kPrompt + "1\n$ ");
}

TEST(LineEditing, GoesOnWhereItWasStopped) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nMANAGER=absent\nTIMESTAMP=T\nTRACE_DUMP_STATE=slow:3000");
  auto manager = device.serve("manager");
  Screen screen(device);
  screen.startTool();
  auto shown = kPrompt + "qui";
  const auto stopAndGoOn = [&](const std::string& shownAgain) {
    screen.type("C-z");
    screen.expect(shown += "\n[1]+  Stopped                 velltool\n$ ");
    screen.type("fg Enter");
    screen.expect(shown += "fg\nvelltool" + shownAgain);
  };
  screen.type("qui");
  screen.expect(shown);
  stopAndGoOn("\n" + kPrompt + "qui");
  stopAndGoOn("\n" + kPrompt + "qui");
  screen.type("C-u 'logdump tel' Enter");
  manager.readUntil("TraceDumpState");
  shown.replace(shown.rfind("qui"), 3, "logdump tel\n");
  stopAndGoOn("");
  // What is typed from here on is not shown before the next prompt.
  screen.waitUntil("stty -aF #{pane_tty} | grep -q -e \" -echo \"");
  screen.type("'cd logdump' Enter te Tab '|'");
  screen.expect(shown);
  screen.expect(shown +
                "\nTelephony log collection: Success\nPath = "
                "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-*\n" +
                kPrompt + "cd logdump\n(/velltool/logdump)>> tel |");
}

TEST(LineEditing, GivesWhatLinesFromAPipeGive) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent");
  const std::list<std::string> lines = {"logdump bb", "-- nosuch -- help", "cd logdump",
                                        "tel",        "cd .. -- cd x",     "quit"};
  std::string input;
  std::string keys;
  for (const auto& line : lines) {
    input += line + "\n";
    keys += " '" + line + "' Enter";
  }
  const auto* const piped =
      R"(export "$1"; velltool <<< "$2" 2>&1 | expand | sed $'s/\e[^m]*m//g')";
  auto expected = device.runLine(piped, {kSearchPath, input}).output;
  // A terminal shows each line behind its prompt.
  std::size_t prompt = 0;
  for (const auto& line : lines) {
    prompt = expected.find(">> ", prompt) + 3;
    expected.insert(prompt, line + "\n");
  }
  Screen screen(device);
  screen.startTool();
  screen.type(keys);
  screen.expect(expected + "$ ");
}
