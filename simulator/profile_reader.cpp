#include "simulator/profile_reader.h"

#include <algorithm>
#include <charconv>
#include <iterator>
#include <string_view>
#include <system_error>

namespace simulator {

namespace {

struct TypeName {
  std::string_view name;
  ValueType type;
};

constexpr TypeName kTypeNames[] = {
    {"string", ValueType::String},   {"integer", ValueType::Integer},
    {"boolean", ValueType::Boolean}, {"other", ValueType::Other},
    {"missing", ValueType::Missing}, {"no-dictionary", ValueType::NoDictionary},
};

}  // namespace

void TypedSetting::putInto(MessageDict& dict, const std::string& key,
                           const std::string& fallback) const {
  switch (type) {
    case ValueType::String:
      return dict.set(key, text.value_or(fallback));
    case ValueType::Integer:
      return dict.set(key, std::int64_t{1});
    case ValueType::Boolean:
      return dict.set(key, true);
    case ValueType::Other:
      return dict.set(key, MessageDict::OtherType{});
    case ValueType::Missing:
      return;
    case ValueType::NoDictionary:
      dict = MessageDict::notADictionary();
  }
}

std::optional<std::int64_t> parseInteger(const std::string& text) {
  const bool negative = text.starts_with('-');
  const auto digits = std::string_view(text).substr(negative ? 1 : 0);
  const bool hexadecimal = digits.starts_with("0x") || digits.starts_with("0X");
  const auto number = digits.substr(hexadecimal ? 2 : 0);
  std::uint32_t magnitude = 0;
  const auto* const end = number.data() + number.size();
  const auto [stop, error] = std::from_chars(number.data(), end, magnitude, hexadecimal ? 16 : 10);
  if (error != std::errc() || stop != end) {
    return std::nullopt;
  }
  return negative ? -std::int64_t{magnitude} : std::int64_t{magnitude};
}

std::optional<std::string> ProfileReader::text(const std::string& key) const {
  const auto found = profile.settings.find(key);
  return found == profile.settings.end() ? std::nullopt : std::optional(found->second.value);
}

bool ProfileReader::either(const std::string& key, const std::string& yes, const std::string& no,
                           bool fallback) {
  const auto value = text(key);
  if (!value || value == yes || value == no) {
    return value ? value == yes : fallback;
  }
  reject(key, yes + " or " + no);
  return fallback;
}

TypedSetting ProfileReader::typed(const std::string& key) {
  TypedSetting setting{text(key)};
  const auto typeKey = key + "_TYPE";
  const auto name = text(typeKey);
  if (!name) {
    return setting;
  }
  const auto* const found =
      std::find_if(std::begin(kTypeNames), std::end(kTypeNames),
                   [&](const TypeName& entry) { return entry.name == *name; });
  if (found == std::end(kTypeNames)) {
    reject(typeKey, "string, integer, boolean, other, missing or no-dictionary");
    return setting;
  }
  setting.type = found->type;
  return setting;
}

void ProfileReader::reject(const std::string& key, const std::string& expected) {
  const auto& setting = profile.settings.at(key);
  faults.push_back({setting.line, key + ": \"" + setting.value + "\" is not " + expected});
}

}  // namespace simulator
