#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace tarn::service {

// An app that the service serves. Its metrics go to the sessions opened under its client name.
struct App {
  std::int64_t id;
  std::string clientName;
};

// The apps this service build knows.
inline std::vector<App> registeredApps() {
  return {{2, "vexmora"}};
}

}  // namespace tarn::service
