#pragma once

#include <chrono>
#include <optional>
#include <string_view>
#include <system_error>

/// Writes all of `bytes` to the open file `file`. Where that does not block (O_NONBLOCK) and has no
/// room, waits for room: `patience` in all, without end when there is none. Gives the error of
/// write(2) when not all could be written, "timed out" when patience ran out.
[[nodiscard]] std::error_code writeWhole(int file, std::string_view bytes,
                                         std::optional<std::chrono::seconds> patience = {});
