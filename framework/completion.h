#pragma once

#include "framework/command_base.h"
#include "platform/line_reader.h"

#include <memory>
#include <string>

/// What the last word of `text`, the beginning of a line at the prompt of `promptNode`, can become
/// so that CommandShell knows it. Each group of words is taken to start at that node, and no node
/// is asked whether a word is allowed.
Completions completeLine(const std::shared_ptr<CommandBase>& promptNode, const std::string& text);
