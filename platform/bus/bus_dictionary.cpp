#include "platform/bus/bus_dictionary.h"

#include "platform/process_end.h"
#include "platform/unicode/utf8.h"

#include <algorithm>
#include <cstring>
#include <string_view>
#include <utility>
#include <vector>

namespace {

bool openVariant(sd_bus_message* message, const char* contents) {
  return checked(sd_bus_message_open_container(message, SD_BUS_TYPE_VARIANT, contents)) >= 0;
}

bool closeContainer(sd_bus_message* message) {
  return sd_bus_message_close_container(message) >= 0;
}

/// Appends a value as a variant, by its type.
struct ValueAppender {
  sd_bus_message* message;

  bool operator()(const std::string& text) const {
    return openVariant(message, "s") && appendText(message, text) && closeContainer(message);
  }
  bool operator()(std::int64_t number) const {
    return checked(sd_bus_message_append(message, "v", "x", number)) >= 0;
  }
  bool operator()(bool flag) const {
    return checked(sd_bus_message_append(message, "v", "b", static_cast<int>(flag))) >= 0;
  }
  bool operator()(MessageDict::OtherType /*other*/) const {
    return checked(sd_bus_message_append(message, "v", "d", 0.0)) >= 0;
  }
};

bool appendEntry(sd_bus_message* message, const MessageDict::Entry& entry) {
  return checked(sd_bus_message_open_container(message, SD_BUS_TYPE_DICT_ENTRY, "sv")) >= 0 &&
         appendText(message, entry.key) && std::visit(ValueAppender{message}, entry.value) &&
         closeContainer(message);
}

/// The contents of the variant that comes next; empty when it is none.
std::string_view variantContents(sd_bus_message* message) {
  char type = 0;
  const char* contents = nullptr;
  if (checked(sd_bus_message_peek_type(message, &type, &contents)) <= 0 ||
      type != SD_BUS_TYPE_VARIANT) {
    return {};
  }
  return contents;
}

/// Reads one entry. `end`: there was none left.
bool readEntry(sd_bus_message* message, std::vector<MessageDict::Entry>& entries, bool& end) {
  const int entered =
      checked(sd_bus_message_enter_container(message, SD_BUS_TYPE_DICT_ENTRY, "sv"));
  end = entered == 0;
  if (entered <= 0) {
    return entered == 0;
  }
  const char* key = nullptr;
  MessageDict::Value value;
  if (checked(sd_bus_message_read(message, "s", &key)) <= 0 || !readValue(message, value)) {
    return false;
  }
  entries.push_back({key, std::move(value)});
  return sd_bus_message_exit_container(message) >= 0;
}

}  // namespace

bool appendText(sd_bus_message* message, const std::string& text) {
  // The library takes no noncharacters either, although the bus itself would.
  const auto taken = interchangeText(text);
  return checked(sd_bus_message_append_basic(message, SD_BUS_TYPE_STRING, taken.c_str())) >= 0;
}

bool appendDictionary(sd_bus_message* message, const MessageDict& dict) {
  return checked(sd_bus_message_open_container(message, SD_BUS_TYPE_ARRAY, "{sv}")) >= 0 &&
         std::all_of(dict.entries().begin(), dict.entries().end(),
                     [&](const auto& entry) { return appendEntry(message, entry); }) &&
         closeContainer(message);
}

bool appendPayload(sd_bus_message* message, const MessageDict& dict) {
  if (!dict.isDictionary()) {
    return checked(sd_bus_message_append(message, "v", "s", "no dictionary")) >= 0;
  }
  return openVariant(message, "a{sv}") && appendDictionary(message, dict) &&
         closeContainer(message);
}

bool readValue(sd_bus_message* message, MessageDict::Value& value) {
  const auto contents = variantContents(message);
  if (contents == "s") {
    const char* text = nullptr;
    const bool read = checked(sd_bus_message_read(message, "v", "s", &text)) > 0;
    value = std::string(read ? text : "");
    return read;
  }
  if (contents == "x") {
    std::int64_t number = 0;
    const bool read = checked(sd_bus_message_read(message, "v", "x", &number)) > 0;
    value = number;
    return read;
  }
  if (contents == "b") {
    int flag = 0;
    const bool read = checked(sd_bus_message_read(message, "v", "b", &flag)) > 0;
    value = flag != 0;
    return read;
  }
  value = MessageDict::OtherType{};
  return checked(sd_bus_message_skip(message, "v")) > 0;
}

bool readDictionary(sd_bus_message* message, MessageDict& dict) {
  dict = MessageDict();
  if (checked(sd_bus_message_enter_container(message, SD_BUS_TYPE_ARRAY, "{sv}")) <= 0) {
    return false;
  }
  std::vector<MessageDict::Entry> entries;
  for (bool end = false; !end;) {
    if (!readEntry(message, entries, end)) {
      return false;
    }
  }
  dict = MessageDict::fromEntries(std::move(entries));
  return sd_bus_message_exit_container(message) >= 0;
}

bool readPayload(sd_bus_message* message, MessageDict& dict) {
  dict = MessageDict::notADictionary();
  if (variantContents(message) != "a{sv}") {
    return checked(sd_bus_message_skip(message, "v")) > 0;
  }
  return checked(sd_bus_message_enter_container(message, SD_BUS_TYPE_VARIANT, "a{sv}")) > 0 &&
         readDictionary(message, dict) && sd_bus_message_exit_container(message) >= 0;
}
