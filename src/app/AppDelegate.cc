#include "app/AppDelegate.h"

bool AppDelegate::didFinishLaunchingWithOptions(const std::optional<platform::Dictionary>&) {
  return true;
}
