#include "platform/message_dict.h"

#include <algorithm>
#include <utility>

MessageDict MessageDict::notADictionary() {
  MessageDict other;
  other.dictionary = false;
  return other;
}

void MessageDict::set(std::string key, Value value) {
  const auto found = std::find_if(items.begin(), items.end(),
                                  [&](const Entry& entry) { return entry.key == key; });
  if (found != items.end()) {
    found->value = std::move(value);
  } else {
    items.push_back({std::move(key), std::move(value)});
  }
}

std::string MessageDict::getString(const std::string& key, std::string fallback) const {
  const auto found = std::find_if(items.begin(), items.end(),
                                  [&](const Entry& entry) { return entry.key == key; });
  if (found == items.end()) {
    return fallback;
  }
  const auto* text = std::get_if<std::string>(&found->value);
  return text != nullptr ? *text : fallback;
}
