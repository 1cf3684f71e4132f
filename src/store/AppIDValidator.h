#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "platform/Value.h"

namespace store {

// Checks that a record carries this app's numeric ID. Metrics are not filtered by app ID; this
// is offered to callers that want to.
class AppIDValidator {
 public:
  static constexpr std::int64_t myAppID = 2;
  static constexpr std::string_view appIDKey = "kKeyAppID";

  virtual ~AppIDValidator() = default;

  // The app ID of the latest record checked; empty when it had no integer one.
  virtual std::optional<std::int64_t> appID() const { return appID_; }
  virtual void setAppID(std::optional<std::int64_t> appID) { appID_ = appID; }

  // Takes the record's "kKeyAppID" (through the accessors) and answers whether it is 2.
  virtual bool isAppIDValid(const platform::Dictionary& record);

 private:
  std::optional<std::int64_t> appID_;
};

}  // namespace store
