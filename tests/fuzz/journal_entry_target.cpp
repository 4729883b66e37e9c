// The texts of a journal entry, of any bytes, to its line in an export.
//
// An input is the values of the fields below, each but the first behind a record separator.

#include "logdump/os_log_line.h"
#include "platform/journal/entry_decoder.h"
#include "platform/unicode/utf8.h"
#include "tests/fuzz/fuzz_target.h"

#include <algorithm>
#include <regex>

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using Field = JournalField;
  constexpr Field kFields[] = {Field::Message,   Field::SenderImagePath, Field::CommandName,
                               Field::Subsystem, Field::Category,        Field::SourceTime,
                               Field::ThreadId,  Field::ProcessId,       Field::ActivityId};
  static EntryDecoder decoder;
  auto texts = split({reinterpret_cast<const char*>(data), size}, "\x1e");
  JournalValues values;
  for (std::size_t at = 0; at < std::min(texts.size(), std::size(kFields)); ++at) {
    values[indexOf(kFields[at])] = texts[at];
  }
  const auto line = formatOsLogLine(decoder.decode(values, 0));

  texts.resize(std::max<std::size_t>(texts.size(), 5), "(null)");
  texts[1] = split(texts[1], "/").back();
  std::transform(texts.begin(), texts.end(), texts.begin(), validUtf8);
  static const std::regex start(
      "^\\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d:\\d\\d \\+0000 0x[0-9a-f]{5,} 0x[0-9a-f]+ -?\\d+ ");
  requireEqual(
      std::regex_replace(line, start, "", std::regex_constants::format_first_only),
      texts[2] + "(" + texts[1] + "):" + texts[3] + " [" + texts[4] + "] " + texts[0] + "\n");
  return 0;
}
