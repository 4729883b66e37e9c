#pragma once

#include "platform/message_dict.h"

#include <systemd/sd-bus.h>

/// The message dictionary on the bus. All of these run on the thread that owns the message; they
/// return false when the message does not take or hold what is asked for, and leave it unusable.

/// Appends `dict` as an `a{sv}`, texts as `interchangeText` makes them.
bool appendDictionary(sd_bus_message* message, const MessageDict& dict);

/// Appends `dict` as a variant that holds an `a{sv}`, or, when it is no dictionary, a string.
bool appendPayload(sd_bus_message* message, const MessageDict& dict);

/// Reads an `a{sv}`. Values of types that a MessageDict does not hold become `OtherType`.
bool readDictionary(sd_bus_message* message, MessageDict& dict);

/// Reads a variant: its dictionary when it holds an `a{sv}`, else `notADictionary`.
bool readPayload(sd_bus_message* message, MessageDict& dict);

/// Reads a variant as one value of a dictionary.
bool readValue(sd_bus_message* message, MessageDict::Value& value);

/// Appends one text as an `s`, made valid as in `appendDictionary`.
bool appendText(sd_bus_message* message, const std::string& text);
