#pragma once

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

/// The message dictionary that the tool exchanges with the manager and its helper: string keys, in
/// the order in which they were set, on the wire a D-Bus `a{sv}`.
///
/// A value type: copies are independent, and one object is used by one thread at a time. A reply or
/// an event payload may be something else than a dictionary; `notADictionary` stands for that, and
/// reads like an empty one.
class MessageDict {
 public:
  /// A value whose type the tool does not know: it keeps its place and its key, not its content.
  struct OtherType {
    friend bool operator==(const OtherType&, const OtherType&) = default;
  };

  /// On the wire `s`, `x`, `b`, or any other type.
  using Value = std::variant<std::string, std::int64_t, bool, OtherType>;

  struct Entry {
    std::string key;
    Value value;

    friend bool operator==(const Entry&, const Entry&) = default;
  };

  /// An empty dictionary.
  MessageDict() = default;

  /// Stands for a payload that is no dictionary.
  static MessageDict notADictionary();

  /// The dictionary that setting `entries` one by one gives, in time proportional to their number.
  static MessageDict fromEntries(std::vector<Entry> entries);

  [[nodiscard]] bool isDictionary() const { return dictionary; }

  /// Appends an entry, or replaces the value of the entry that has the key. Takes time proportional
  /// to the number of entries.
  void set(std::string key, Value value);

  /// The string under `key`; `fallback` when there is no such key or it holds another type.
  [[nodiscard]] std::string getString(const std::string& key, std::string fallback = "") const;

  /// All entries, in the order in which their keys were first set.
  [[nodiscard]] const std::vector<Entry>& entries() const { return items; }

  friend bool operator==(const MessageDict&, const MessageDict&) = default;

 private:
  bool dictionary = true;
  std::vector<Entry> items;
};
