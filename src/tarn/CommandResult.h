#pragma once

#include <cstdint>
#include <string>

namespace tarn {

// What a command answers: status 0 for success, otherwise one of the codes below and a message
// that says what was wrong.
struct CommandResult {
  std::int32_t status = 0;
  std::string message;

  bool operator==(const CommandResult&) const = default;
};

namespace status {
inline constexpr std::int32_t kSuccess = 0;
inline constexpr std::int32_t kUnknownCommand = 1;
inline constexpr std::int32_t kMissingArgument = 2;
inline constexpr std::int32_t kInvalidArgument = 3;
inline constexpr std::int32_t kUnknownAppId = 4;
inline constexpr std::int32_t kMalformedConfiguration = 5;
inline constexpr std::int32_t kNoSuchMetric = 6;
// Raised by the client library itself: no session to send the command on.
inline constexpr std::int32_t kNoSession = 7;
inline constexpr std::int32_t kServiceUnavailable = 8;
}  // namespace status

}  // namespace tarn
