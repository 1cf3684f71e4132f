#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <variant>
#include <vector>

namespace tarn::mm {

struct Value;
// An a{sv} dictionary as ModemManager sent it.
using Dict = std::map<std::string, Value, std::less<>>;

// One value of a dictionary, as it came off the bus: its D-Bus signature and, for the types the
// source reads, its content (monostate for any other type). Signed integers of every width are
// held as int64, unsigned ones as uint64, "s" and "o" as text, "as" and "ao" as a list of text.
struct Value {
  std::string signature;
  std::variant<std::monostate, bool, std::int64_t, std::uint64_t, double, std::string,
               std::vector<std::string>, std::shared_ptr<const Dict>>
      content;
};

}  // namespace tarn::mm
