#include "platform/line_reader.h"
#include "platform/posix/plain_line.h"
#include "platform/process_end.h"
#include "platform/unicode/utf8.h"

#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <clocale>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <iostream>
#include <memory>
#include <sstream>
#include <string_view>
#include <utility>

// These use what <cstdio> declares.
#include <readline/history.h>
#include <readline/readline.h>

// readline asks these two for memory. Its own would end the process in another way.
extern "C" void* xrealloc(void* memory, std::size_t size) {
  auto* const found = std::realloc(memory, size);
  endIfScarce(found == nullptr ? ENOMEM : 0);
  return found;
}

extern "C" void* xmalloc(std::size_t size) {
  return xrealloc(nullptr, size);
}

namespace {

// readline keeps its state in variables, and calls back on the thread that reads.
const Completer* completer = nullptr;
std::atomic<bool> interrupted = false;  ///< By Ctrl-C, since the prompt was written.
std::atomic<bool> resumed = false;      ///< After a stop; the line is not on the screen yet.

/// Takes what readline writes, see fopencookie(3). std::cout waits where a terminal has no room.
ssize_t writeToScreen(void* /*cookie*/, const char* bytes, std::size_t count) {
  std::cout.write(bytes, static_cast<std::streamsize>(count)).flush();
  return static_cast<ssize_t>(count);
}

/// Gives readline the words one by one, looked up when it asks for the first.
char* nextWord(const char* /*typed*/, int isLater) {
  static Completions completions;
  if (isLater == 0) {
    completions = (*completer)({rl_line_buffer, rl_line_buffer + rl_point});
  }
  if (completions.words.empty()) {
    return nullptr;
  }
  const auto word = std::move(completions.words.back());
  completions.words.pop_back();
  rl_completion_append_character = word.ends_with('/') ? 0 : ' ';
  return static_cast<char*>(std::memcpy(xmalloc(word.size() + 1), word.c_str(), word.size() + 1));
}

/// Whether Tab parts words: with more to come, behind a word that it does not complete, or where it
/// would begin one. Terminals that do not mark what is pasted give it so.
bool isPastedTab() {
  const std::string_view terminal = rl_terminal_name;
  int waiting = 0;
  ioctl(STDIN_FILENO, FIONREAD, &waiting);
  const bool begun = rl_point > 0 && static_cast<unsigned char>(rl_line_buffer[rl_point - 1]) > ' ';
  const auto words = (*completer)({rl_line_buffer, rl_line_buffer + rl_point}).words;
  return waiting > 0 && (terminal == "linux" || terminal.starts_with("vt")) &&
         (begun ? words.size() != 1 : !words.empty() && words.front()[0] == words.back()[0]);
}

/// Draws the line. readline 8.2 is told of five columns where there are fewer: on a screen of one
/// row it divides by a third of them, and on one of four columns it breaks a tab of eight only
/// once, behind which a row may end before it begins.
void draw() {
  int columns = 0;
  rl_get_screen_size(nullptr, &columns);
  rl_set_screen_size(0, columns < 5 ? 5 : 0);  // 0 changes nothing.
  rl_redisplay();
}

/// The next byte that is typed. Below 0 after Ctrl-C, and when none will come.
int readByte() {
  pollfd terminal{STDIN_FILENO, POLLIN, 0};
  do {
    if (rl_pending_signal() == SIGWINCH) {
      rl_clear_visible_line();  // readline would do that if it did not call `draw`.
    }
    rl_check_signals();
    if (resumed.exchange(false)) {
      std::fputc('\r', rl_outstream);  // The row may hold the line still.
      rl_forced_update_display();
    }
  } while (!interrupted && poll(&terminal, 1, -1) < 0);
  if (interrupted) {
    return RL_ISSTATE(RL_STATE_READCMD) ? READERR : EOF;
  }
  const int byte = rl_getc(stdin);
  return byte == '\t' && isPastedTab() ? ' ' : byte;
}

/// Gives readline byte by byte what is typed, and U+FFFD for what is no UTF-8: readline loses the
/// byte by which it finds that out.
int readUtf8(FILE* /*stream*/) {
  static std::string typed, text;
  static bool isEnded = false;
  static int place = 0;
  if (RL_ISSTATE(RL_STATE_READCMD) && std::exchange(place, where_history()) != where_history()) {
    // Once a command has gone through the history, readline 8.2 may free the steps of a line, which
    // can be undone, in two places. They are lost: one of the two may own them.
    rl_undo_list = nullptr;
  }
  while (text.empty()) {
    const int byte = readByte();
    if (byte < 0) {
      typed.clear();
      // readline takes a paste that is broken off for a string. This ends it.
      isEnded = !isEnded && RL_ISSTATE(RL_STATE_MOREINPUT);
      return isEnded ? '\0' : byte;
    }
    typed += static_cast<char>(byte);
    text = takeUtf8(typed);
  }
  const auto byte = static_cast<unsigned char>(text.front());
  text.erase(0, 1);
  return byte;
}

/// Sets readline up, once; false where lines are not to be edited.
bool prepareEditing() {
  const char* const terminal = std::getenv("TERM");
  if (terminal == nullptr || *terminal == '\0' || terminal == std::string_view("dumb") ||
      isatty(STDIN_FILENO) == 0 || isatty(STDOUT_FILENO) == 0) {
    return false;
  }
  uselocale(newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr));  // Of this thread alone.
  rl_readline_name = "velltool";
  rl_outstream = fopencookie(nullptr, "w", {nullptr, writeToScreen, nullptr, nullptr});
  rl_getc_function = readUtf8;
  rl_change_environment = 0;
  rl_basic_word_break_characters = "/ \t\n\v\f\r";
  rl_completion_entry_function = nextWord;
  // Sequences of keys that mean nothing. What is bound later goes first.
  for (const auto* begin : {"\\e[", "\\e[[", "\\eO", "\\e\\e[", "\\e\\eO"}) {
    rl_bind_keyseq(begin, rl_skip_csi_sequence);
  }
  // Whatever the environment says of the bytes, or does not. The person's own settings go last.
  rl_variable_bind("input-meta", "on");
  rl_variable_bind("output-meta", "on");
  rl_variable_bind("convert-meta", "off");
  stifle_history(1000);
  rl_unbind_function_in_map(rl_vi_editing_mode, rl_get_keymap_by_name("emacs-meta"));
  rl_initialize();
  rl_redisplay_function = draw;  // Not before: readline would take the terminal for a dumb one.
  std::signal(SIGCONT, [](int) { resumed = true; });
  return std::at_quick_exit(rl_deprep_terminal) == 0;
}

/// Lets readline edit a line; Ctrl-C gives up the line, and begins another.
std::optional<std::string> editLine(const std::string& prompt) {
  std::unique_ptr<char, void (*)(void*)> line(nullptr, std::free);
  const auto drop = [](int) { interrupted = true; };
  auto* const found = std::signal(SIGINT, drop);
  std::signal(SIGINT, found == SIG_IGN ? found : drop);
  do {
    interrupted = false;
    rl_eof_found = 0;
    line.reset(readline(prompt.c_str()));
    if (!line && rl_variable_value("enable-bracketed-paste") != std::string_view("on")) {
      std::cout << std::endl;  // As readline itself does where it has turned that off.
    }
  } while (interrupted);
  std::signal(SIGINT, found);
  return line ? std::optional<std::string>(line.get()) : std::nullopt;
}

}  // namespace

std::optional<std::string> readLine(const std::string& prompt, const Completer& complete) {
  static const bool isEditing = prepareEditing();
  if (!isEditing) {
    return readPlainLine(prompt);
  }
  static std::istringstream pasted;  // Lines that were entered together with an earlier one.
  std::string line;
  if (std::getline(pasted, line)) {
    std::cout << prompt << line << std::endl;
  } else {
    completer = &complete;
    const auto entered = editLine(prompt);
    if (!entered) {
      return std::nullopt;
    }
    if (!entered->empty() &&
        (history_length == 0 || *entered != history_list()[history_length - 1]->line)) {
      add_history(entered->c_str());
    }
    pasted = std::istringstream(*entered);
    std::getline(pasted, line);
  }
  return std::cout ? std::optional(line) : std::nullopt;
}
