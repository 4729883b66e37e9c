#pragma once

#include "framework/command_base.h"

#include <list>
#include <memory>
#include <string>

/// The words of `text`, which white space separates.
std::list<std::string> splitAtWhiteSpace(const std::string& text);

/// Moves `node` along `path`, words of children and ".." between slashes; ".." stays at a node
/// without a parent. False, `node` being the last one reached, at a word that leads nowhere.
bool followPath(std::shared_ptr<CommandBase>& node, std::string path);
