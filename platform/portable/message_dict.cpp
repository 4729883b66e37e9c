#include "platform/message_dict.h"

#include <algorithm>
#include <string_view>
#include <unordered_map>
#include <utility>

MessageDict MessageDict::notADictionary() {
  MessageDict other;
  other.dictionary = false;
  return other;
}

MessageDict MessageDict::fromEntries(std::vector<Entry> entries) {
  std::unordered_map<std::string_view, Entry*> known;
  known.reserve(entries.size());
  auto end = entries.begin();  // what lies before it is kept, and not moved any more
  for (auto& entry : entries) {
    if (const auto earlier = known.find(entry.key); earlier != known.end()) {
      earlier->second->value = std::move(entry.value);
      continue;
    }
    if (&entry != &*end) {
      *end = std::move(entry);
    }
    known.emplace(end->key, &*end);
    ++end;
  }
  entries.erase(end, entries.end());
  MessageDict dict;
  dict.items = std::move(entries);
  return dict;
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
