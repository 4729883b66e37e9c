#pragma once

#include "simulator/answer.h"

#include <filesystem>
#include <string>

namespace simulator {

/// Makes the collection below the device's root at `root`: its directories with one file in each
/// that holds `contents`, packed with tar(1) when the collection says so. False, after a complaint,
/// when that was not possible. Blocks until all is on disk; for processes with one thread only.
bool writeCollection(const std::filesystem::path& root, const Collection& collection,
                     const std::string& contents);

}  // namespace simulator
