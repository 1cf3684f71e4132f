#pragma once

#include <optional>
#include <string>

namespace bustest {

// A loopback port that was free a moment ago; throws when the system gives none.
int freePort();

// The body of GET `path` on the loopback port, or empty when no whole answer came within 5 s.
std::optional<std::string> get(int port, const std::string& path);

}  // namespace bustest
