#include "platform/line_reader.h"
#include "platform/terminal/line_characters.h"
#include "platform/terminal/plain_line.h"
#include "platform/terminal/terminal_watch.h"

#include <histedit.h>
#include <sys/ioctl.h>
#include <sys/ttydefaults.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <iostream>
#include <iterator>
#include <string_view>
#include <utility>

namespace {

// What libedit's calls back need, on the thread that reads.
HistoryW* lineHistory = nullptr;
HistEventW historyEvent{};
std::wstring shownPrompt;
const Completer* completer = nullptr;
int columns = 0;                      ///< Of the screen, when it was last looked at.
int typedEarly = 0;                   ///< Bytes to come from before the terminal was set.
std::optional<std::wstring> lastTab;  ///< The line up to the cursor when Tab last added nothing.

/// Takes what libedit writes, see fopencookie(3). A character may come in pieces.
ssize_t writeToScreen(void* /*cookie*/, const char* bytes, std::size_t count) {
  static std::mbstate_t state;
  std::wstring characters(count, L'\0');
  const auto* rest = bytes;
  const auto length = mbsnrtowcs(characters.data(), &rest, count, count, &state);
  if (length == static_cast<std::size_t>(-1)) {
    // A sequence of the terminal may hold bytes that are no UTF-8, see terminfo(5).
    state = {};
    std::cout.write(bytes, static_cast<std::streamsize>(count));
  } else {
    characters.resize(length);
    std::cout << toText(characters);
  }
  return static_cast<ssize_t>(count);
}

/// Looks how wide the screen is; whether that has changed. One of unknown width counts as libedit
/// takes it.
bool hasNewWidth() {
  winsize window{};
  ioctl(STDOUT_FILENO, TIOCGWINSZ, &window);
  return std::exchange(columns, window.ws_col < 2 ? 80 : window.ws_col) != columns;
}

/// Takes the prompt and the line off the screen: a terminal wraps them anew when its width changes.
/// See console_codes(4).
void eraseLine(EditLine* editor) {
  const auto* const line = el_wline(editor);
  int cells = 0;
  for (const auto character : shownPrompt + std::wstring(line->buffer, line->cursor)) {
    const int width = wcwidth(character) < 0 ? 2 : wcwidth(character);
    const int left = columns - cells % columns;
    cells += width > left ? left + width : width;
  }
  for (; cells >= columns; cells -= columns) {
    std::cout << "\x1b[A";
  }
  std::cout << "\r\x1b[J";
}

/// Waits for the next byte that is typed; the result is that of read(2).
ssize_t readByte(EditLine* editor, char& byte) {
  while (true) {
    std::cout.flush();
    bool wasStopped = false;
    const bool isReadable = waitForTerminal(wasStopped);
    if (hasNewWidth() || wasStopped) {
      if (!wasStopped) {
        eraseLine(editor);
      }
      std::cout << '\r';
      el_wset(editor, EL_PREP_TERM, 0);
      el_wset(editor, EL_PREP_TERM, 1);
      el_resize(editor);
      el_wset(editor, EL_REFRESH);
    } else if (isReadable) {
      const auto count = read(STDIN_FILENO, &byte, 1);
      // Ctrl-D that was typed early has become null, which is else what Ctrl-Space types.
      byte = typedEarly > 0 && typedEarly-- > 0 && byte == '\0' ? char{CEOF} : byte;
      return count;
    }
  }
}

/// Gives libedit the next character that is typed: 1, 0 at the end of input, -1 after an error.
int readCharacter(EditLine* editor, wchar_t* character) {
  const auto* const line = el_wline(editor);
  std::mbstate_t state{};
  for (*character = 0; *character == 0;) {
    char byte = 0;
    if (const auto count = readByte(editor, byte); count <= 0) {
      return static_cast<int>(count);
    }
    wchar_t typed = 0;  // Also while a character is not complete.
    if (std::mbrtowc(&typed, &byte, 1, &state) == static_cast<std::size_t>(-1)) {
      // What came before was cut short, or this is nothing.
      state = {};
      std::mbrtowc(&typed, &byte, 1, &state);
    }
    if (typed == CEOF && line->lastchar == line->buffer) {
      return 0;
    }
    *character = joinMark(line->cursor == line->buffer ? L'\0' : line->cursor[-1], typed);
    if (*character != 0 && *character != typed) {
      // libedit shall not find on the screen what it has not drawn.
      eraseLine(editor);
      el_deletestr(editor, 1);
      el_wset(editor, EL_REFRESH);
    }
  }
  return 1;
}

unsigned char completeWord(EditLine* editor, int /*key*/) {
  const auto* const line = el_wline(editor);
  const std::wstring before(line->buffer, line->cursor);
  auto [typed, words] = (*completer)(toText(before));
  std::erase_if(words, [](const auto& word) { return !toCharacters(word); });
  auto common = words.empty() ? "" : words.front();
  const auto& last = words.empty() ? common : words.back();
  common.erase(std::ranges::mismatch(common, last).in1, common.end());
  common.erase(0, typed);
  while (!toCharacters(common)) {
    common.pop_back();
  }
  if (!common.empty()) {
    el_winsertstr(editor, toCharacters(common)->c_str());
    return CC_REFRESH;
  }
  if (words.empty() || std::exchange(lastTab, before) != before) {
    return CC_ERROR;
  }
  std::cout << "\x1b[J\n";
  std::copy(words.begin(), words.end(), std::ostream_iterator<std::string>(std::cout, " "));
  std::cout << '\n';
  el_wset(editor, EL_REFRESH);
  return CC_NORM;
}

/// Makes the editor, which lives as long as the process; null where lines are not to be edited.
EditLine* makeEditor() {
  const char* const terminal = std::getenv("TERM");
  if (terminal == nullptr || *terminal == '\0' || terminal == std::string_view("dumb") ||
      isatty(STDOUT_FILENO) == 0 || !watchTerminal()) {
    return nullptr;
  }
  uselocale(newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr));  // Of this thread alone.
  auto* const screen = fopencookie(nullptr, "w", {nullptr, writeToScreen, nullptr, nullptr});
  auto* const editor = el_init_fd("", stdin, screen, fopencookie(nullptr, "w", {}), STDIN_FILENO,
                                  STDOUT_FILENO, STDERR_FILENO);
  lineHistory = history_winit();
  history_w(lineHistory, &historyEvent, H_SETSIZE, 1000);
  el_wset(editor, EL_HIST, history_w, lineHistory);
  el_wset(
      editor, EL_PROMPT, +[](EditLine*) { return shownPrompt.data(); });
  el_wset(editor, EL_GETCFN, readCharacter);
  // libedit loses what a terminal that inserts and deletes characters moves across a row's end.
  for (const auto* capability : {"ic", "IC", "im", "dc", "DC", "dm"}) {
    el_set(editor, EL_SETTC, capability, "", nullptr);
  }
  el_set(editor, EL_EDITOR, "emacs");
  el_set(editor, EL_ADDFN, "complete", "", completeWord);
  el_set(editor, EL_BIND, "^I", "complete", nullptr);
  // Between lines, what is typed is not shown and waits for the editor as it is.
  el_set(editor, EL_SETTY, "-x", "-icanon", "-echo", nullptr);
  ioctl(STDIN_FILENO, FIONREAD, &typedEarly);
  return editor;
}

}  // namespace

std::optional<std::string> readLine(const std::string& promptText, const Completer& complete) {
  static auto* const editor = makeEditor();
  const auto characters = toCharacters(promptText);
  if (editor == nullptr || !characters) {
    restoreTerminal();
    return readPlainLine(promptText);
  }
  shownPrompt = *characters;
  completer = &complete;
  lastTab.reset();
  const bool ended = el_wgets(editor, nullptr) == nullptr;
  const auto* const edited = el_wline(editor);
  std::wstring line(edited->buffer, edited->lastchar);
  // The end of input may break off a line. One that is whole is an earlier one.
  if (!std::cout.flush() || (ended && (line.empty() || line.back() == L'\n'))) {
    return std::nullopt;
  }
  line.erase(line.find_last_not_of(L'\n') + 1);
  if (!line.empty()) {
    history_w(lineHistory, &historyEvent, H_ENTER, line.c_str());
  }
  return toText(line);
}
