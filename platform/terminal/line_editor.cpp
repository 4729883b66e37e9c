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
#include <csignal>
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
std::wstring shownPrompt;
const Completer* completer = nullptr;
std::size_t columns = 0;              ///< Of the screen, when it was last looked at.
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

std::wstring lineToCursor(EditLine* editor) {
  const auto* const line = el_wline(editor);
  return {line->buffer, line->cursor};
}

/// Looks how wide the screen is; whether that has changed.
bool hasNewWidth() {
  winsize window{};
  ioctl(STDOUT_FILENO, TIOCGWINSZ, &window);
  return std::exchange(columns, std::max<std::size_t>(window.ws_col, 1)) != columns;
}

/// Rows of the screen above the one in which the prompt and `line` end.
std::size_t rowsAbove(const std::wstring& line) {
  std::size_t cells = 0;
  for (const auto character : shownPrompt + line) {
    const auto width = static_cast<std::size_t>(wcwidth(character) < 0 ? 2 : wcwidth(character));
    const auto left = columns - cells % columns;
    cells += width > left ? left + width : width;
  }
  return cells / columns;
}

/// Takes the prompt and the line off the screen: a terminal wraps them anew when its width changes.
/// See console_codes(4).
void eraseLine(EditLine* editor) {
  for (auto rows = rowsAbove(lineToCursor(editor)); rows > 0; --rows) {
    std::cout << "\x1b[A";
  }
  std::cout << "\r\x1b[J";
}

/// Waits for the next byte that is typed; the result is that of read(2).
ssize_t readByte(EditLine* editor, char& byte) {
  while (true) {
    std::cout.flush();
    const int signal = waitForTerminal();
    if (hasNewWidth() || signal != 0) {
      // A key may have come before the signal.
      if (signal == 0 || signal == SIGWINCH) {
        eraseLine(editor);
      }
      std::cout << '\r';
      el_wset(editor, EL_PREP_TERM, 0);
      el_wset(editor, EL_PREP_TERM, 1);
      el_resize(editor);
      el_wset(editor, EL_REFRESH);
    } else if (const auto count = read(STDIN_FILENO, &byte, 1); count >= 0 || errno != EAGAIN) {
      return count;
    }
  }
}

/// Gives libedit the next character that is typed: 1, 0 at the end of input, -1 after an error.
int readCharacter(EditLine* editor, wchar_t* character) {
  std::mbstate_t state{};
  while (true) {
    char byte = 0;
    if (const auto count = readByte(editor, byte); count <= 0) {
      return static_cast<int>(count);
    }
    wchar_t typed = 0;
    auto length = std::mbrtowc(&typed, &byte, 1, &state);
    if (length == static_cast<std::size_t>(-1)) {
      // What came before was cut short, or this is nothing.
      state = {};
      length = std::mbrtowc(&typed, &byte, 1, &state);
    }
    if (length <= 1) {
      const auto* const line = el_wline(editor);
      // Null is what Ctrl-D becomes where it is typed before the terminal is set for editing.
      if ((typed == CEOF || typed == 0) && line->lastchar == line->buffer) {
        return 0;
      }
      *character = joinMark(line->cursor == line->buffer ? L'\0' : line->cursor[-1], typed);
      if (*character != 0 && *character != typed) {
        // libedit shall not find on the screen what it has not drawn.
        eraseLine(editor);
        el_deletestr(editor, 1);
        el_wset(editor, EL_REFRESH);
      }
      if (*character != 0) {
        return 1;
      }
    }
  }
}

unsigned char completeWord(EditLine* editor, int /*key*/) {
  const auto before = lineToCursor(editor);
  auto [typed, words] = (*completer)(toText(before));
  std::erase_if(words, [](const auto& word) { return !toCharacters(word); });
  auto common = words.empty() ? "" : words.front();
  for (const auto& word : words) {
    const auto same = std::mismatch(common.begin(), common.end(), word.begin(), word.end());
    common.erase(same.first, common.end());
  }
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
  HistEventW event{};
  history_w(lineHistory, &event, H_SETSIZE, 1000);
  el_wset(editor, EL_HIST, history_w, lineHistory);
  el_wset(
      editor, EL_PROMPT, +[](EditLine*) { return shownPrompt.data(); });
  el_wset(editor, EL_GETCFN, readCharacter);
  el_set(editor, EL_EDITOR, "emacs");
  el_set(editor, EL_ADDFN, "complete", "", completeWord);
  el_set(editor, EL_BIND, "^I", "complete", nullptr);
  // Between lines, what is typed is not shown and waits for the editor as it is.
  el_set(editor, EL_SETTY, "-x", "-icanon", "-echo", nullptr);
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
  hasNewWidth();
  const bool ended = el_wgets(editor, nullptr) == nullptr;
  const auto* const edited = el_wline(editor);
  std::wstring line(edited->buffer, edited->lastchar);
  // The end of input may break off a line. One that is whole is an earlier one.
  if (!std::cout || (ended && (line.empty() || line.back() == L'\n'))) {
    return std::nullopt;
  }
  line.erase(line.find_last_not_of(L'\n') + 1);
  if (!line.empty()) {
    HistEventW event{};
    history_w(lineHistory, &event, H_ENTER, line.c_str());
  }
  return toText(line);
}
