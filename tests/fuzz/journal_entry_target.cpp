// The texts of a journal entry, of any bytes, to its line in an export.
//
// An input is the values of the fields below, each but the first behind a record separator.

#include "logdump/os_log_line.h"
#include "platform/journal/entry_decoder.h"
#include "tests/fuzz/fuzz_target.h"

#include <algorithm>
#include <clocale>
#include <cwchar>
#include <regex>

namespace {

/// The well-formed UTF-8 of `bytes`, by the C library, without U+FFFD; `broken` counts the rest.
std::string wellFormed(std::string_view bytes, std::size_t& broken) {
  std::string text;
  while (!bytes.empty()) {
    wchar_t code = 0;
    std::mbstate_t state{};
    auto length = std::mbrtowc(&code, bytes.data(), bytes.size(), &state);
    const bool good = length <= 4 && code <= 0x10FFFF;
    length = good ? std::max<std::size_t>(length, 1) : 1;  // NUL has none.
    text += good && code != 0xFFFD ? bytes.substr(0, length) : "";
    broken += good ? 0 : 1;
    bytes.remove_prefix(length);
  }
  return text;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using Field = JournalField;
  constexpr Field kFields[] = {Field::Message,   Field::SenderImagePath, Field::CommandName,
                               Field::Subsystem, Field::Category,        Field::SourceTime,
                               Field::ThreadId,  Field::ProcessId,       Field::ActivityId};
  static EntryDecoder decoder;
  std::setlocale(LC_CTYPE, "C.UTF-8");
  auto texts = split({reinterpret_cast<const char*>(data), size}, "\x1e");
  JournalValues values;
  for (std::size_t at = 0; at < std::min(texts.size(), std::size(kFields)); ++at) {
    values[indexOf(kFields[at])] = texts[at];
  }
  const auto line = formatOsLogLine(decoder.decode(values, 0));

  texts.resize(std::max<std::size_t>(texts.size(), 5), "(null)");
  const auto expected = texts[2] + "(" + split(texts[1], "/").back() + "):" + texts[3] + " [" +
                        texts[4] + "] " + texts[0] + "\n";
  static const std::regex start(
      "\\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d:\\d\\d \\+0000 0x[0-9a-f]{5,} 0x[0-9a-f]+ -?\\d+ ");
  std::smatch match;
  require(std::regex_search(line, match, start, std::regex_constants::match_continuous),
          "not the numbers of a line");
  std::size_t broken = 0;
  const auto shown = wellFormed(match.suffix().str(), broken);
  require(broken == 0, "not valid UTF-8");
  requireEqual(shown, wellFormed(expected, broken));
  require(broken > 0 || match.suffix() == expected, "valid text changed");
  return 0;
}
