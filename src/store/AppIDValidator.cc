#include "store/AppIDValidator.h"

namespace store {

bool AppIDValidator::isAppIDValid(const platform::Dictionary& record) {
  const platform::Value* value = record.find(appIDKey);
  setAppID(value != nullptr ? value->asInteger() : std::nullopt);
  return appID() == myAppID;
}

}  // namespace store
