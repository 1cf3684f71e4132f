#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tarn/mm/Value.h"

namespace tarn::mm {

// Why values were dropped, one line each, such as
// "Signal.Lte \"rsrp\": wanted d, got s; dropped".
using Problems = std::vector<std::string>;

// Reads the entries of one dictionary defensively: a key that is missing answers empty, and a
// value of another type than asked, a NaN or infinity, a number out of its range, an empty text or
// malformed hexadecimal answers empty too, with a line in `problems`. `where` names the dictionary
// in those lines ("Signal.Lte", "cell 2"). Pure: reads nothing but its arguments.
class Reader {
 public:
  Reader(const Dict& dict, std::string where, Problems& problems)
      : dict_(dict), where_(std::move(where)), problems_(problems) {}

  // "d" within [low, high].
  std::optional<double> real(std::string_view key, double low, double high) const;
  // "u" within [0, high].
  std::optional<std::uint32_t> unsignedInt(std::string_view key, std::uint32_t high) const;
  // "i".
  std::optional<std::int32_t> signedInt(std::string_view key) const;
  // "b".
  std::optional<bool> boolean(std::string_view key) const;
  // "s", not empty.
  std::optional<std::string> text(std::string_view key) const;
  // "s" holding hexadecimal digits without a prefix ("1A0"), within [0, high].
  std::optional<std::uint32_t> hex(std::string_view key, std::uint32_t high) const;
  // "o".
  std::optional<std::string> path(std::string_view key) const;
  // "ao".
  std::optional<std::vector<std::string>> paths(std::string_view key) const;
  // "a{sv}".
  const Dict* dictionary(std::string_view key) const;

  const std::string& where() const { return where_; }
  Problems& problems() const { return problems_; }

 private:
  // The value under `key` when it has `signature`; empty, with a problem, when it has another.
  const Value* typed(std::string_view key, std::string_view signature) const;
  void drop(std::string_view key, std::string_view why) const;

  const Dict& dict_;
  const std::string where_;
  Problems& problems_;
};

}  // namespace tarn::mm
