#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

namespace simulator {

/// What the asked side does in the end with one request.
enum class Conduct {
  Reply,           ///< Sends the answer.
  WrongSignature,  ///< Replies, but with other arguments than the interface has.
  Silent,          ///< Never replies, and goes on.
  Die,             ///< Its process ends before the reply, for good.
  Restart,         ///< Its process ends before the reply, and a new one takes its place.
};

/// How a request is to go wrong. A default-made plan is that nothing does.
struct FaultPlan {
  Conduct conduct = Conduct::Reply;
  bool noDictionary = false;           ///< The reply is something else than a dictionary.
  std::int32_t status = 0;             ///< Put in place of success; the reply stays.
  std::chrono::milliseconds delay{0};  ///< How long the request is held before all of the above.
};

/// Reads a plan from words between blanks, the last of each line counting:
///   answer, wrong-signature, silent, die, restart
///   no-dictionary
///   status:NUMBER   decimal or 0x..., -2147483648 to 4294967295, as 32 bits
///   slow:NUMBER     milliseconds, up to a day
/// Empty when `text` is anything else. From any thread.
std::optional<FaultPlan> parseFaultPlan(const std::string& text);

}  // namespace simulator
